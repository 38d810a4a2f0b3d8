// Message boxes where there is no common desktop: a line on standard error.
#include <cstdio>

#include "platform/message_box.h"

namespace zq::platform {

void show_system_message_box(const char* caption, const char* text) {
    std::fprintf(stderr, "%s: %s\n", caption, text);
}

}  // namespace zq::platform
