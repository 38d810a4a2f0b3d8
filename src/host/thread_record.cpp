// Per-thread records in a thread-local slot.
#include "host/thread_record.h"

#include <memory>
#include <new>

#include "base/error_codes.h"
#include "platform/thread.h"

namespace zq::host {
namespace {

void release_record(void* record) {
    delete static_cast<ZqThreadRecordData*>(record);
}

// The thread that unloads the library has not ended, and not every system releases its value with
// the slot.
class RecordSlot {
  public:
    RecordSlot() = default;
    ~RecordSlot() {
        release_record(slot_.get());
        slot_.set(nullptr);
    }
    RecordSlot(const RecordSlot&) = delete;
    RecordSlot& operator=(const RecordSlot&) = delete;

    ZqThreadRecordData* get() const { return static_cast<ZqThreadRecordData*>(slot_.get()); }

    ZqThreadRecordData* make() {
        std::unique_ptr<ZqThreadRecordData> record(new (std::nothrow)
                                                       ZqThreadRecordData{.kind = 2,
                                                                          .reserved = 0,
                                                                          .reservedByte = 0,
                                                                          .active = 1,
                                                                          .activeByte = 1,
                                                                          .index = -1});
        return record != nullptr && slot_.set(record.get()) ? record.release() : nullptr;
    }

  private:
    platform::ThreadSlot slot_{release_record};
};

}  // namespace

ZqThreadRecordData& thread_record() {
    static RecordSlot slot;
    ZqThreadRecordData* record = slot.get();
    if (record == nullptr) record = slot.make();
    if (record == nullptr) throw kNotEnoughMemory;
    return *record;
}

bool thread_is_active() {
    return thread_record().active != 0;
}

}  // namespace zq::host
