// Takes the library's message boxes for the length of a test.
#pragma once

#include <zqvissvc/errors.h>

#include <string>
#include <utility>
#include <vector>

namespace zqtest {

class MessageBoxes {
  public:
    MessageBoxes() {
        shown().clear();
        before_ = ZqSetMessageBoxProcedure(
            [](const char* caption, const char* text) { shown().emplace_back(caption, text); });
    }
    ~MessageBoxes() { ZqSetMessageBoxProcedure(before_); }
    MessageBoxes(const MessageBoxes&) = delete;
    MessageBoxes& operator=(const MessageBoxes&) = delete;

    // What was shown since the last call: caption and text of each box.
    using Box = std::pair<std::string, std::string>;
    std::vector<Box> take() { return std::exchange(shown(), {}); }

  private:
    static std::vector<Box>& shown() {
        static std::vector<Box> boxes;
        return boxes;
    }

    ZqMessageBoxProc before_;
};

}  // namespace zqtest
