// zqvis, the command-line tool: reads the command line and runs one subcommand inside the reference
// host.
#include "batch.h"
#include "commands.h"
#include "refhost/refhost.h"
#include "zqvissvc_version.h"

namespace {

int run(int argc, char** argv) {
    CLI::App tool("Looks at, converts and takes apart image files.", "zqvis");
    Session session;
    tool.set_version_flag("--version", ZQVISSVC_VERSION_STRING);
    tool.add_flag("--quiet", session.quiet, "No progress bar");
    tool.require_subcommand(1);
    tool.fallthrough();
    tool.failure_message([](const CLI::App* /*app*/, const CLI::Error& error) {
        return std::string("zqvis: ") + error.what() + "\nRun with --help for more information.\n";
    });
    add_info(tool, session);
    add_convert(tool, session);
    add_dump(tool, session);
    add_data(tool, session);
    add_bayer(tool, session);
    add_raw(tool, session);
    add_draw(tool, session);
    add_flatten(tool, session);
    add_unflatten(tool, session);
    add_error(tool, session);
    try {
        tool.parse(argc, argv);
    } catch (const CLI::ParseError& error) {
        return tool.exit(error) == 0 ? kDone : kWrongUsage;
    }
    return session.status;
}

}  // namespace

int main(int argc, char** argv) {
    const int status = with_output_checked([&] { return run(argc, argv); });
    refhost::run_cleanup();
    return status;
}
