// Standard streams of Windows, which change line ends unless they are told not to.
#include "console.h"

#include <fcntl.h>
#include <io.h>

bool is_terminal(std::FILE* stream) {
    return _isatty(_fileno(stream)) != 0;
}

void make_binary(std::FILE* stream) {
    std::fflush(stream);
    _setmode(_fileno(stream), _O_BINARY);
}
