// A batch that is told to stop. Only POSIX systems let one process do that to another simply.
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>

#include "tool/tool_run.h"

namespace zqtest {
namespace {

// The tool in a process of its own, working through `count` copies of one picture.
pid_t start_batch(const ToolFolder& folder, const std::string& output, int count) {
    std::vector<std::string> words{ZQVIS_PROGRAM, "convert"};
    for (int i = 0; i < count; ++i) words.push_back(folder.path("in" + std::to_string(i) + ".png"));
    for (const char* word : {"--format", "JPEG2000", "--quiet", "--out-dir"}) words.push_back(word);
    words.push_back(output);
    std::vector<char*> arguments;
    arguments.reserve(words.size() + 1);
    for (std::string& word : words) arguments.push_back(word.data());
    arguments.push_back(nullptr);
    const pid_t child = fork();
    if (child == 0) {
        signal(SIGINT, SIG_DFL);
        execv(arguments[0], arguments.data());
        _exit(127);
    }
    return child;
}

TEST(InterruptionTest, LeavesWholeFilesOnly) {
    constexpr int kFiles = 40;
    const ToolFolder folder;
    const std::vector<std::vector<uint8_t>> rows(300, std::vector<uint8_t>(3 * 400, 77));
    for (int i = 0; i < kFiles; ++i) {
        folder.write_png("in" + std::to_string(i) + ".png", 400, 8, PNG_COLOR_TYPE_RGB, rows);
    }
    const std::string output = folder.path("output");
    std::filesystem::create_directory(output);
    const auto files = [&] {
        std::vector<std::string> names;
        for (const auto& entry : std::filesystem::directory_iterator(output)) {
            names.push_back(entry.path().string());
        }
        return names;
    };
    const pid_t child = start_batch(folder, output, kFiles);
    while (files().empty()) usleep(1000);
    kill(child, SIGINT);
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == SIGINT) << status;
    const auto left = files();
    EXPECT_LT(left.size(), kFiles);
    for (const std::string& name : left) {
        EXPECT_EQ(std::filesystem::path(name).extension(), ".jp2") << name;
        EXPECT_EQ(load_bytes(name).substr(0, 12), std::string("\0\0\0\x0CjP  \r\n\x87\n", 12));
        EXPECT_EQ(load_bytes(name).substr(load_bytes(name).size() - 2), "\xFF\xD9") << name;
    }
}

}  // namespace
}  // namespace zqtest
