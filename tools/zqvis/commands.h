// The subcommands. Each declares itself and, when the user names it, works and stores the exit
// status.
#ifndef ZQVIS_COMMANDS_H
#define ZQVIS_COMMANDS_H

#include <CLI/CLI.hpp>

// What all subcommands share; outlives the parsing.
struct Session {
    bool quiet = false;
    int status = 0;
};

void add_info(CLI::App& tool, Session& session);
void add_convert(CLI::App& tool, Session& session);
void add_data(CLI::App& tool, Session& session);
void add_dump(CLI::App& tool, Session& session);
void add_bayer(CLI::App& tool, Session& session);
void add_draw(CLI::App& tool, Session& session);
void add_raw(CLI::App& tool, Session& session);
void add_flatten(CLI::App& tool, Session& session);
void add_unflatten(CLI::App& tool, Session& session);
void add_error(CLI::App& tool, Session& session);

#endif
