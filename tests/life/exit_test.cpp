// The end of a Windows process while its threads are in the library. The system has stopped them by
// the time the library is told, wherever they were: nothing that they held may be waited for.
#include <gtest/gtest.h>
#include <windows.h>

#include <array>
#include <atomic>
#include <cstdlib>
#include <cstring>
#include <stdexcept>
#include <string>
#include <thread>

#include "calls.h"
#include "process.h"

namespace {

constexpr const char* kExitWhileBusy = "--exit-while-busy";

[[noreturn]] void exit_while_busy() {
    const zqtest::LoadedLibrary library;
    const zqtest::Calls calls(library);
    static std::atomic<int> started = 0;
    for (int i = 0; i < 4; ++i) {
        std::thread([calls, i] {
            const std::string name = "busy " + std::to_string(i % 2);
            for (;;) {
                ZqImageHandle image = nullptr;
                calls.new_named(ZQ_TYPE_U8, 9, 9, 0, name.c_str(), 0, &image);
                calls.dispose_image(image);
                ++started;
            }
        }).detach();
    }
    while (started < 100) std::this_thread::yield();
    std::exit(7);
}

// Runs this program with one argument and returns its exit status, or -1 if it has not ended after
// `seconds` (it is killed then).
int run_again(const std::string& argument, int seconds) {
    std::array<char, MAX_PATH> program{};
    GetModuleFileNameA(nullptr, program.data(), program.size());
    std::string line = "\"" + std::string(program.data()) + "\" " + argument;
    STARTUPINFOA start{};
    start.cb = sizeof(start);
    PROCESS_INFORMATION process{};
    if (CreateProcessA(program.data(), line.data(), nullptr, nullptr, FALSE, 0, nullptr, nullptr,
                       &start, &process) == 0) {
        throw std::runtime_error("cannot run this program again");
    }
    DWORD status = 0;
    const auto milliseconds = static_cast<DWORD>(seconds) * 1000;
    const bool ended = WaitForSingleObject(process.hProcess, milliseconds) == WAIT_OBJECT_0;
    if (!ended) TerminateProcess(process.hProcess, 1);
    GetExitCodeProcess(process.hProcess, &status);
    CloseHandle(process.hThread);
    CloseHandle(process.hProcess);
    return ended ? static_cast<int>(status) : -1;
}

TEST(LifeTest, ProcessEndsWhileThreadsAreBusy) {
    for (int i = 0; i < 5; ++i) EXPECT_EQ(run_again(kExitWhileBusy, 60), 7);
}

}  // namespace

int main(int count, char** arguments) {
    if (count == 2 && std::strcmp(arguments[1], kExitWhileBusy) == 0) exit_while_busy();
    testing::InitGoogleTest(&count, arguments);
    return RUN_ALL_TESTS();
}
