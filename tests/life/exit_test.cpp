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
constexpr int kRegularEnd = 7;
constexpr int kCalledAtTheEnd = 8;

std::atomic<bool> g_ending = false;

void lock_for_ever(const zqtest::Calls& calls, std::atomic<int>& waiting) {
    ++waiting;
    ZqImageHandle image = nullptr;
    calls.new_named(ZQ_TYPE_U8, 9, 9, 0, "held", 0, &image);
    calls.lock(&image, 1);
    Sleep(INFINITE);
}

void use_for_ever(const zqtest::Calls& calls, std::atomic<int>& rounds) {
    for (;; ++rounds) {
        ZqImageHandle image = nullptr;
        calls.new_named(ZQ_TYPE_U8, 9, 9, 0, "busy", 0, &image);
        calls.lock(&image, 1);
        calls.unlock(&image, 1);
    }
}

void* take(std::size_t bytes) {
    return std::malloc(bytes);
}

// Once the process ends, the host's routines are no longer to be called.
void give_back(void* block) {
    if (g_ending) TerminateProcess(GetCurrentProcess(), kCalledAtTheEnd);
    std::free(block);
}

// One thread holds an image for ever, two wait for it, and one takes and gives back the library's
// own locks as fast as it can. That one is alone and allocates nothing: a thread that Wine ends
// inside its heap, or while it wakes another, leaves Wine itself waiting, whatever the library
// does.
[[noreturn]] void exit_while_busy() {
    const zqtest::LoadedLibrary library;
    const zqtest::Calls calls(library);
    calls.set_memory_mode(1, take, give_back);
    static std::atomic<int> waiting = 0;
    static std::atomic<int> rounds = 0;
    for (int i = 0; i < 3; ++i) std::thread([calls] { lock_for_ever(calls, waiting); }).detach();
    while (waiting < 3) std::this_thread::yield();
    Sleep(100);
    std::thread([calls] { use_for_ever(calls, rounds); }).detach();
    while (rounds < 100) std::this_thread::yield();
    g_ending = true;
    std::exit(kRegularEnd);
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
    for (int i = 0; i < 10; ++i) EXPECT_EQ(run_again(kExitWhileBusy, 60), kRegularEnd);
}

}  // namespace

int main(int count, char** arguments) {
    if (count == 2 && std::strcmp(arguments[1], kExitWhileBusy) == 0) exit_while_busy();
    testing::InitGoogleTest(&count, arguments);
    return RUN_ALL_TESTS();
}
