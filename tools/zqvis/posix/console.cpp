// Standard streams of a POSIX system.
#include "console.h"

#include <unistd.h>

bool is_terminal(std::FILE* stream) {
    return isatty(fileno(stream)) == 1;
}

void make_binary(std::FILE* /*stream*/) {}
