// Progress and reports of a batch.
#include "batch.h"

#include <fmt/core.h>
#include <zqvissvc/errors.h>

#include <cstdio>
#include <filesystem>
#include <new>
#include <system_error>

#include "console.h"
#include "failure.h"
#include "interruption.h"

namespace {

class ProgressBar {
  public:
    ProgressBar(size_t total, bool wanted)
        : total_(total), shown_(wanted && total > 1 && is_terminal(stderr)) {}

    void show(size_t done, const std::string& file) const {
        if (!shown_) return;
        constexpr size_t kWidth = 30;
        const size_t filled = done * kWidth / total_;
        const std::string line = fmt::format("[{:#<{}}{:.<{}}] {}/{} {}", "", filled, "",
                                             kWidth - filled, done, total_, file);
        fmt::print(stderr, "\r{:<{}.{}}", line, kColumns, kColumns);
        std::fflush(stderr);
    }

    // Makes the line free for other text.
    void clear() const {
        if (shown_) fmt::print(stderr, "\r{:{}}\r", "", kColumns);
    }

  private:
    static constexpr size_t kColumns = 79;  // one less than the narrowest terminal has

    size_t total_;
    bool shown_;
};

void report(const std::string& file, ZqError code) {
    fmt::print(stderr, "zqvis: {}: {} ({})\n", file, message_of(code), code);
}

}  // namespace

int run_batch(const std::vector<std::string>& files, bool quiet,
              const std::function<std::string(const std::string&)>& work) {
    const ProgressBar bar(files.size(), !quiet);
    int status = kDone;
    const auto fail = [&](const std::string& file, ZqError code) {
        bar.clear();
        report(file, code);
        status = kFailed;
    };
    const Interruption interruption;
    for (size_t i = 0; i < files.size(); ++i) {
        if (Interruption::requested()) {
            bar.clear();
            fmt::print(stderr, "zqvis: stopped after {} of {} files\n", i, files.size());
            std::fflush(stdout);
            Interruption::follow();
        }
        bar.show(i, files[i]);
        try {
            const std::string text = work(files[i]);
            bar.clear();
            fmt::print("{}", text);
        } catch (const Failure& failure) {
            fail(failure.file().empty() ? files[i] : failure.file(), failure.code());
        } catch (const std::filesystem::filesystem_error& error) {  // a name that is no text
            fail(files[i], Failure(error.code()).code());
        } catch (const std::bad_alloc&) {
            fail(files[i], ZQ_ERR_NOT_ENOUGH_MEMORY);
        }
    }
    return status;
}

int with_output_checked(const std::function<int()>& work) {
    ZqError code = ZQ_ERR_NONE;
    try {
        const int status = work();
        if (status != kDone || std::fflush(stdout) == 0) return status;
        code = ZQ_ERR_UNABLE_TO_WRITE_DATA;
    } catch (const std::system_error& error) {  // of a print that could not be written
        code = Failure(error.code()).code();
    }
    report("standard output", code);
    return kFailed;
}
