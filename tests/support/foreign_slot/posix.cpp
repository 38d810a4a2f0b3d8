// Slots of the system, for ForeignSlot.
#include "support/foreign_slot/foreign_slot.h"

#include <pthread.h>

#include <system_error>

namespace zqtest {

ForeignSlot::ForeignSlot() {
    pthread_key_t key = 0;
    if (const int error = pthread_key_create(&key, nullptr); error != 0)
        throw std::system_error(error, std::generic_category());
    index_ = static_cast<std::int32_t>(key);
}

ForeignSlot::~ForeignSlot() {
    pthread_key_delete(static_cast<pthread_key_t>(index_));
}

void ForeignSlot::set(void* value) {
    pthread_setspecific(static_cast<pthread_key_t>(index_), value);
}

}  // namespace zqtest
