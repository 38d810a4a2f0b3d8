// Works through several inputs: a progress bar for people, one line for each input that fails, the
// others still done.
#ifndef ZQVIS_BATCH_H
#define ZQVIS_BATCH_H

#include <functional>
#include <string>
#include <vector>

// Exit statuses of the program.
constexpr int kDone = 0;
constexpr int kFailed = 1;
constexpr int kWrongUsage = 2;

// Calls `work` with each file and prints the text that it returns. Returns kDone, or kFailed when
// any failed.
int run_batch(const std::vector<std::string>& files, bool quiet,
              const std::function<std::string(const std::string&)>& work);

// Runs `work`, which returns an exit status and prints; prints that cannot be written are a
// failure.
int with_output_checked(const std::function<int()>& work);

#endif
