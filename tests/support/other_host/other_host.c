/* The second host module. */
#include "other_host.h"

#include <stdint.h>

int32_t StrLen(const char* text);

int other_host_answer(void) {
    return 4711;
}

int32_t StrLen(const char* text) {
    (void)text;
    return 4711;
}
