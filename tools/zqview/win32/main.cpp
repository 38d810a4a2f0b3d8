// zqview, the image viewer: a window over the library's drawing calls, inside the reference host.
#include <cstdio>
#include <cstring>

#include "refhost/refhost.h"
#include "viewer.h"

namespace {

constexpr char kUsage[] =
    "Usage: zqview [FILE]\n\n"
    "Wheel, + and -\tzoom; 1 shows one-to-one, F all\n"
    "Drag\t\tscroll\n"
    "Arrows\t\tprevious and next file of the folder; Home and End the first and last\n"
    "Ctrl+O, F5\topen, read again\n"
    "Escape\t\tclose\n";

}  // namespace

int main(int argc, char** argv) {
    if (argc > 2 || (argc == 2 && std::strcmp(argv[1], "--help") == 0)) {
        MessageBoxA(nullptr, kUsage, "zqview", MB_OK);
        return argc > 2 ? 2 : 0;
    }
    int status = 1;
    {
        Viewer viewer;
        if (viewer.is_made()) {
            if (argc == 2) viewer.open(argv[1]);
            status = viewer.run();
        }
    }
    refhost::run_cleanup();
    return status;
}
