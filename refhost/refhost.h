// Control of the reference host: a small implementation of the host services that the library binds
// by name from the program it runs in. Programs use these calls to provoke failures, to look at
// what the library registered, and to find out at the end whether anything leaked. Threads: every
// call is safe; one lock guards each table.
#ifndef REFHOST_REFHOST_H
#define REFHOST_REFHOST_H

#include <zqvissvc/host.h>
#include <zqvissvc/types.h>

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace refhost {

// ---- Memory

// Strict mode: every resize moves the block, new bytes are 0xCD, and a block that was left behind
// is filled with 0xDD and kept for a while (poisoned under the address sanitizer), so that a
// pointer held across a host call is found.
void set_strict(bool on);

// Handles of both heaps, and blocks of DSNewPtr, that were made and not yet disposed.
size_t live_handles();
size_t live_blocks();

// Size in bytes; empty for anything but a live handle.
std::optional<size_t> handle_size(const void* handle);

// Paths that the path services made.
std::optional<std::string> path_text(ZqPath path);
bool dispose_path(ZqPath path);  // false for what is no path

// ---- Refusals and counters. `service` is the exported name, "DSNewHandle" for instance; a name
// that is no service throws std::invalid_argument.

// The next `count` calls fail the way that service fails; -1: all calls, 0: none. MoveBlock and
// DrawSBar have no way to fail and then do nothing.
void refuse(std::string_view service, int count = 1);
void refuse_none();

// Number of calls since the program began, refused ones included.
uint64_t calls(std::string_view service);

// ---- Sessions, cleanup procedures, dialogs

struct Session {
    std::string type;
    std::string name;
    void* pointer = nullptr;
    std::string flattened;                 // bytes handed to the flatten variants
    std::optional<uint32_t> version = {};  // record version, of UDRegisterSesnFlatten2 only
};
std::optional<Session> session(uint32_t cookie);
std::vector<uint32_t> cookies();  // in the order of registration

size_t cleanup_procs();

// Tears the caller down: runs each registered procedure once, the newest first, and forgets it.
void run_cleanup();

int open_dialogs();   // WNativeDialogSetup calls without their WNativeDialogRestore
int dialogs_shown();  // WNativeDialogSetup calls since the program began

// ---- Accounts

struct Report {
    size_t leaked_handles = 0;
    size_t leaked_blocks = 0;
    size_t leaked_paths = 0;
    size_t double_frees = 0;  // disposals of what was disposed before
    size_t stale_uses = 0;    // other uses of disposed handles
    size_t stale_writes = 0;  // writes into blocks left behind (strict mode)
    size_t foreign_uses = 0;  // uses of what never was a handle, or disposals in the wrong heap
    std::string details;      // one line each, with the service and the size

    bool clean() const { return details.empty(); }
};

// What went wrong since the last call. What is alive now counts as leaked once and is not mentioned
// again.
Report finish();

// ---- Helpers for clients. What they make lies in the data heap (DS) and is not subject to
// refusals.

ZqStringHandle new_string(std::string_view text);
std::string text(ZqStringHandle string);  // empty for null
ZqArrayU32Handle new_array(std::span<const uint32_t> elements);
std::vector<uint32_t> elements(ZqArrayU32Handle array);  // empty for null
void dispose(void* handle);                              // of either heap; null is accepted

// Owns a host string or array that the library reads, or fills through out().
template <typename Handle>
class Owned {
  public:
    explicit Owned(Handle handle = nullptr) : handle_(handle) {}
    Owned(const Owned&) = delete;
    Owned& operator=(const Owned&) = delete;
    ~Owned() { dispose(handle_); }

    Handle get() const { return handle_; }
    Handle* out() { return &handle_; }

  private:
    Handle handle_;
};

class String : public Owned<ZqStringHandle> {
  public:
    String() = default;
    explicit String(std::string_view text) : Owned(new_string(text)) {}
    std::string text() const { return refhost::text(get()); }
};

class ArrayU32 : public Owned<ZqArrayU32Handle> {
  public:
    ArrayU32() = default;
    explicit ArrayU32(std::span<const uint32_t> elements) : Owned(new_array(elements)) {}
    std::vector<uint32_t> elements() const { return refhost::elements(get()); }
};

}  // namespace refhost

#endif
