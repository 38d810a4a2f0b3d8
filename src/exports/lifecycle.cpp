// Entry points: creation, lending and disposal of images, and the memory pool.
#include <zqvissvc/image.h>

#include <string_view>

#include "host/boundary.h"
#include "host/error_report.h"
#include "host/host_string.h"
#include "host/image_value.h"
#include "host/run_hooks.h"
#include "image/image_lock.h"
#include "image/lifecycle.h"
#include "image/memory_pool.h"

using namespace zq;
using host::FunctionId;

namespace {

// Hands a created image to the host: as a session, as a value, and for disposal at tear-down when
// it has no name to be found by again. A new image that the host does not take is released again.
void publish(const Created& created, ZqStringHandle name, ZqImageValue* value) {
    host::register_session(created.image, name);
    if (host::name_of(name).empty()) {
        host::dispose_at_teardown(created.image);
    }
    host::copy_string(&value->name, name);
    value->image = created.image;
}

template <class Create>
void create_and_publish(ZqStringHandle name, ZqImageValue* value, Create create) {
    if (value == nullptr) {
        throw kNullPointer;
    }
    const Created created = create(host::name_of(name));
    try {
        publish(created, name, value);
    } catch (...) {
        if (created.is_new) {
            dispose_image(created.image);
        }
        throw;
    }
}

void release_pool_at_teardown(void* /*argument*/) {
    MemoryPool::instance().abandon();
}

void size_pool(std::int32_t kilobytes) {
    MemoryPool& pool = MemoryPool::instance();
    if (kilobytes > 0) {
        pool.create(kilobytes);
        host::set_cleanup_procedure(release_pool_at_teardown, nullptr);
    } else if (pool.exists()) {
        pool.destroy();
        host::remove_cleanup_procedure(release_pool_at_teardown, nullptr);
    }
}

}  // namespace

ZqError ZQ_CALL DF_Create(ZqStringHandle name, int32_t type, int32_t border, int32_t width,
                          int32_t height, uint8_t greedy, ZqImageValue* image,
                          ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kCreate, [&] {
        const ImageShape shape = {type, width, height, border, greedy != 0};
        create_and_publish(name, image, [&](std::string_view text) {
            return new_named_image(shape, text, Variant::kRegistered);
        });
    });
}

ZqError ZQ_CALL DF_CreateFromExternalBuffer(ZqStringHandle name, int32_t type, int32_t border,
                                            int32_t width, int32_t height, uint8_t greedy,
                                            void* buffer, int32_t lineWidth, ZqImageValue* image,
                                            ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kCreateFromExternalBuffer, [&] {
        const ImageShape shape = {type, width, height, border, greedy != 0};
        create_and_publish(name, image, [&](std::string_view text) {
            return new_external_image(shape, static_cast<std::uint8_t*>(buffer), lineWidth, text);
        });
    });
}

ZqError ZQ_CALL DF_Dispose(const ZqImageValue* image, uint8_t all, ZqErrorCluster* error) {
    return host::run_entry_always(error, FunctionId::kDispose, [&] {
        if (all != 0) {
            dispose_all_images();
            return kSuccess;
        }
        if (image == nullptr || image->image == nullptr) {
            return kSuccess;
        }
        const host::LookUp found = host::look_up(image);
        dispose_image(found.image);
        return found.code;
    });
}

ZqImageHandle ZQ_CALL kemoCreateImage(int32_t type, int32_t border) {
    ZqImageHandle image = nullptr;
    host::run_entry(nullptr, FunctionId::kKemoCreate, [&] {
        image = new_image({type, 0, 0, border});
    });
    return image;
}

ZqError ZQ_CALL Gen_MarkExternalBuffer(const ZqImageValue* image, uint8_t mark, void** buffer) {
    return host::run_core([&] {
        if (image == nullptr || buffer == nullptr) {
            throw kNullPointer;
        }
        if (mark != 0) {
            *buffer = LockedImage(host::require_image(image))->lend();
        } else if (!take_back_buffer(image->image, static_cast<std::uint8_t*>(*buffer))) {
            throw kNotAnImage;
        }
    });
}

ZqError ZQ_CALL Gen_GetExternalCount(const ZqImageValue* image, int32_t* count) {
    return host::run_core([&] {
        if (image == nullptr || count == nullptr) {
            throw kNullPointer;
        }
        *count = LockedImage(host::require_image(image))->external_count();
    });
}

ZqError ZQ_CALL DF_SetMemoryPoolSize(int32_t sizeKB, ZqErrorCluster* error) {
    const auto size = [&] { size_pool(sizeKB); };
    return sizeKB > 0 ? host::run_entry(error, FunctionId::kPrivate, size)
                      : host::run_entry_always(error, FunctionId::kPrivate, size);
}

ZqError ZQ_CALL DF_EnableMemoryPool(int32_t enable, ZqErrorCluster* error) {
    return host::run_entry(error, FunctionId::kPrivate,
                           [&] { MemoryPool::instance().enable(enable == 1); });
}

ZqError ZQ_CALL DF_ResetMemoryPool(ZqErrorCluster* error) {
    return host::run_entry_always(error, FunctionId::kPrivate,
                                  [] { MemoryPool::instance().reset(); });
}
