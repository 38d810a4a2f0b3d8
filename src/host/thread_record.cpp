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

ZqThreadRecordData* make_record(platform::ThreadSlot& slot) {
    std::unique_ptr<ZqThreadRecordData> record(new (std::nothrow) ZqThreadRecordData{
        .kind = 2, .reserved = 0, .reservedByte = 0, .active = 1, .activeByte = 1, .index = -1});
    return record != nullptr && slot.set(record.get()) ? record.release() : nullptr;
}

}  // namespace

ZqThreadRecordData& thread_record() {
    static platform::ThreadSlot slot(release_record);
    auto* record = static_cast<ZqThreadRecordData*>(slot.get());
    if (record == nullptr) record = make_record(slot);
    if (record == nullptr) throw kNotEnoughMemory;
    return *record;
}

bool thread_is_active() {
    return thread_record().active != 0;
}

}  // namespace zq::host
