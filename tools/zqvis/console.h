// What the tool needs of the system's standard streams.
#ifndef ZQVIS_CONSOLE_H
#define ZQVIS_CONSOLE_H

#include <cstdio>

// Whether a person reads what is written there.
bool is_terminal(std::FILE* stream);

// Bytes pass through unchanged from here on.
void make_binary(std::FILE* stream);

#endif
