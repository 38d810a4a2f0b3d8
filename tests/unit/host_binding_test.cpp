// Which module is the host, and how its services are bound: also from threads with different hosts.
#include <gtest/gtest.h>
#include <zqvissvc/slots.h>

#include <atomic>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include "host/module.h"
#include "host/services.h"
#include "other_host.h"
#include "platform/module.h"
#include "refhost/refhost.h"
#include "support/foreign_slot/foreign_slot.h"
#include "support/message_boxes.h"

namespace zq::host {
namespace {

class HostBindingTest : public testing::Test {
  protected:
    ~HostBindingTest() override {
        SetDFRTTLSIndex(-1);
        SetDFRTModule(nullptr);
    }

    const int answer_ = other_host_answer();
    platform::ModuleHandle program_ = platform::main_module();
    platform::ModuleHandle other_ = platform::loaded_module("other_host.dll");
    zqtest::MessageBoxes boxes_;
};
using HostBindingThreadTest = HostBindingTest;

TEST_F(HostBindingTest, ThreadSlotGoesBeforeModuleAndModuleBeforeProgram) {
    ASSERT_NE(other_, nullptr);
    EXPECT_EQ(host_module(), program_);
    SetZqVisSvcDFRTModule(other_);
    EXPECT_EQ(host_module(), other_);

    zqtest::ForeignSlot slot;
    SetZqVisSvcDFRTTLSIndex(slot.index());
    EXPECT_EQ(host_module(), other_) << "an empty slot does not count";
    slot.set(program_);
    EXPECT_EQ(host_module(), program_);
    std::thread([&] {
        EXPECT_EQ(host_module(), other_) << "the slot is each thread's own";
    }).join();

    SetDFRTTLSIndex(-1);
    EXPECT_EQ(host_module(), other_);
    SetDFRTModule(nullptr);
    EXPECT_EQ(host_module(), program_);
}

TEST_F(HostBindingTest, BindsAgainWhenTheHostIsAnotherOne) {
    for (int round = 0; round < 2; ++round) {
        EXPECT_EQ(str_len("four"), 4);
        SetDFRTModule(other_);
        EXPECT_EQ(str_len("four"), answer_);
        SetDFRTModule(nullptr);
    }
    EXPECT_TRUE(boxes_.take().empty());
}

TEST_F(HostBindingTest, TellsTheUserOfAMissingServiceAndFails) {
    struct Case {
        const char* name;
        std::function<bool()> fails;
    };
    const ZqPoint point{};
    const Case cases[] = {
        {"AZNewHandle", [] { return az_new_handle(1) == nullptr; }},
        {"AZSetHandleSize", [] { return az_set_handle_size(nullptr, 1) == 2; }},
        {"AZGetHandleSize", [] { return az_get_handle_size(nullptr) == 0; }},
        {"AZDisposeHandle", [] { return az_dispose_handle(nullptr) == 2; }},
        {"DSNewHandle", [] { return ds_new_handle(1) == nullptr; }},
        {"DSSetHandleSize", [] { return ds_set_handle_size(nullptr, 1) == 2; }},
        {"DSGetHandleSize", [] { return ds_get_handle_size(nullptr) == 0; }},
        {"DSCheckHandle", [] { return ds_check_handle(nullptr) == 2; }},
        {"DSDisposeHandle", [] { return ds_dispose_handle(nullptr) == 2; }},
        {"DSNewPtr", [] { return ds_new_ptr(1) == nullptr; }},
        {"DSDisposePtr", [] { return ds_dispose_ptr(nullptr) == 2; }},
        {"NumericArrayResize",
         [] { return numeric_array_resize(ElementType::kU8, 1, nullptr, 1) == 2; }},
        {"MoveBlock", [] { return move_block(nullptr, nullptr, 1), true; }},
        {"CToPStr", [] { return c_to_p_str("", nullptr) == 2; }},
        {"FTextToPath", [] { return text_to_path("", 0, nullptr) == 2; }},
        {"FEmptyPath", [] { return empty_path(nullptr) == nullptr; }},
        {"FAddPath", [] { return add_path(nullptr, nullptr, nullptr) == 2; }},
        {"DrawSBar",
         [] {
             Dataflux::DrawSBar_EX(nullptr, 0, 0, 0, 0, nullptr, nullptr, 0, 0);
             return true;
         }},
        {"TrackSBarEvent",
         [&] {
             return Dataflux::TrackSBarEvent_EX(nullptr, point, 0, 0, 0, 0, nullptr, nullptr, 0,
                                                0) == 0;
         }},
    };
    SetDFRTModule(other_);
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        EXPECT_TRUE(c.fails());
        const auto boxes = boxes_.take();
        ASSERT_EQ(boxes.size(), 1U);
        EXPECT_EQ(boxes[0].first, "Fatal Error");
        EXPECT_EQ(boxes[0].second,
                  std::string("DATAFLUX.LIB could not locate \"") + c.name + "\".");
    }
}

TEST_F(HostBindingTest, BracketsTheFatalBoxAsADialog) {
    static int open_inside;
    ZqSetMessageBoxProcedure(
        [](const char*, const char*) { open_inside = refhost::open_dialogs(); });
    Service<ZqStrLenProc> missing{"NoSuchService"};
    EXPECT_EQ(missing.call_or(-5, "x"), -5);
    EXPECT_EQ(open_inside, 1);
    EXPECT_EQ(refhost::open_dialogs(), 0);
}

TEST_F(HostBindingTest, MissingSessionServiceIsAnErrorWithoutABox) {
    void* function = nullptr;
    EXPECT_EQ(DF_GetFunction("TSCookieToSesn", &function), 0);
    EXPECT_EQ(function, reinterpret_cast<void*>(ts_cookie_to_session.require()));
    SetDFRTModule(other_);
    EXPECT_EQ(DF_GetFunction("TSCookieToSesn", &function), ZQ_ERR_NOT_INITIALIZED);
    EXPECT_EQ(function, nullptr);
    EXPECT_EQ(ts_cookie_to_session.find(), nullptr);
    try {
        ud_register_session.require();
        FAIL() << "bound in a host that lacks it";
    } catch (GRLIBError_enum code) {
        EXPECT_EQ(code, kNotInitialized);
    }
    // Hooks do without.
    EXPECT_EQ(SetCleanupProc([](void*) {}, nullptr), 0);
    EXPECT_EQ(EnterModalDialog(), 0);
    EXPECT_EQ(DF_GetFunction(nullptr, &function), ZQ_ERR_NULL_POINTER);
    EXPECT_EQ(DF_GetFunction("StrLen", nullptr), ZQ_ERR_NULL_POINTER);
    EXPECT_TRUE(boxes_.take().empty());
    SetDFRTModule(nullptr);
    EXPECT_EQ(refhost::cleanup_procs(), 0U);
}

// One binding, threads that go from host to host: none may ever get the function of the other one.
TEST_F(HostBindingThreadTest, EachThreadGetsItsOwnHostsFunction) {
    zqtest::ForeignSlot slot;
    SetDFRTTLSIndex(slot.index());
    std::atomic<int> wrong{0};
    std::vector<std::thread> threads;
    threads.reserve(4);
    for (int i = 0; i < 4; ++i) {
        threads.emplace_back([&, i] {
            for (int call = 0; call < 50000; ++call) {
                const bool in_program = (call >> i) % 2 == 0;
                slot.set(in_program ? program_ : other_);
                if (str_len("abc") != (in_program ? 3 : answer_)) ++wrong;
            }
        });
    }
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(wrong, 0);
}

}  // namespace
}  // namespace zq::host
