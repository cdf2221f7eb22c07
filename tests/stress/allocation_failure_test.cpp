// Fails the Nth allocation, for every N, across a whole sequence of exported calls (init, define,
// value writes and reads, port calls, sizes, information, undefine, terminate). The call that
// meets the failure either succeeds or reports "std::bad_alloc" with code 256; the calls before
// it succeed; later calls succeed or fail with one of the library's own messages. Nothing leaks,
// and afterwards, with failures off, the core left behind still works and the whole sequence
// runs again without a failure.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "FailingAllocator.h"
#include "ZinMOX/ZinMOX.h"
#include "ZinRT/ZinJtag.h"
#include "ZinTarget/ScriptedTransport.h"

namespace {

using ZinStress::allocationFailureHappened;
using ZinStress::armAllocationFailure;
using ZinStress::disarmAllocationFailure;

constexpr uint32_t kFailure = 0x80000000u;

struct Message {
  uint32_t code;
  std::string text;
};

// Messages are kept in slots made up front, so that recording one allocates nothing (an
// allocation failing in the test's own handler would otherwise lose the message).
struct Recorder {
  static constexpr size_t kSlots = 16;
  std::vector<Message> slots;
  size_t used = 0;
  Recorder() : slots(kSlots) {
    for (Message& slot : slots) slot.text.reserve(512);
  }
  static void onMessage(void* user, uint32_t, uint32_t code, const char* text) {
    auto* self = static_cast<Recorder*>(user);
    if (self->used == kSlots) return;
    Message& slot = self->slots[self->used++];
    slot.code = code;
    slot.text.assign(text, std::min<size_t>(std::strlen(text), slot.text.capacity()));
  }
};

struct Call {
  const char* name;
  std::function<uint32_t()> run;
};

// A session with one MOX core and the calls of the sequence.
class Scenario {
 public:
  Scenario() : transport_(std::make_shared<ZinTarget::ScriptedTransport>()) {
    ZinTarget::MoxStatus status;
    status.asyncInputCount = 12;
    status.syncInputCount = 9;
    status.asyncOutputCount = 10;
    status.syncOutputCount = 7;
    transport_->placeMoxCore(ref_, status);
    transport_->queueReadData(std::vector<unsigned char>(32, 0x5A));
    handle_ = ZinJtag_openSession(transport_);
    ZinJtag_setMessageHandler(handle_, &Recorder::onMessage, &recorder_);
    writeMap_ = {{"ctl", "2A5"},
                 {"steps.pulsetrain", "0123456789ABCDEF0123456789ABCDEF"},
                 {"async_out_data", "3FF"}};
  }
  ~Scenario() { ZinJtag_closeSession(handle_); }

  std::vector<Call> calls() {
    return {
        {"initCore", [this] { return ZinMOX_initCore(handle_, &ref_); }},
        {"defineSignal",
         [this] { return ZinMOX_defineSignal(handle_, &ref_, "ctl", ZINMOX_ASYNC_OUTPUT, 3); }},
        {"defineBus(sync out)",
         [this] {
           const uint32_t bits[] = {6, 0, 2};
           return ZinMOX_defineBus(handle_, &ref_, "steps", ZINMOX_SYNC_OUTPUT, bits, 3);
         }},
        {"defineBus(sync in)",
         [this] {
           const uint32_t bits[] = {8, 1, 4, 5};
           return ZinMOX_defineBus(handle_, &ref_, "status_with_a_long_name", ZINMOX_SYNC_INPUT,
                                   bits, 4);
         }},
        {"writeValues",
         [this] {
           uintptr_t word = reinterpret_cast<uintptr_t>(&writeMap_);
           return ZinMOX_writeValues(handle_, &ref_, &word);
         }},
        {"readValues",
         [this] {
           readMap_.clear();
           uintptr_t word = reinterpret_cast<uintptr_t>(&readMap_);
           return ZinMOX_readValues(handle_, &ref_, &word);
         }},
        {"setPortBits",
         [this] {
           return ZinMOX_setPortBits(handle_, &ref_, bytes_, bytes_ + 2, 10, bytes_ + 4, bytes_, 7);
         }},
        {"getPortBits",
         [this] {
           return ZinMOX_getPortBits(handle_, &ref_, out_, out_ + 2, out_ + 4, 12, out_ + 6,
                                     out_ + 8, out_ + 10, out_ + 12, out_ + 14, 9);
         }},
        {"getSignalSizes",
         [this] {
           const char* names[] = {"ctl", "steps"};
           uint32_t sizes[2];
           return ZinMOX_getSignalSizes(handle_, &ref_, names, sizes, 2, 1);
         }},
        {"getCoreInfo",
         [this] {
           infoMap_.clear();
           uintptr_t word = reinterpret_cast<uintptr_t>(&infoMap_);
           return ZinMOX_getCoreInfo(handle_, &ref_, &word);
         }},
        {"undefineName",
         [this] { return ZinMOX_undefineName(handle_, &ref_, "ctl", ZINMOX_ASYNC_OUTPUT); }},
        {"terminateCore", [this] { return ZinMOX_terminateCore(handle_, &ref_); }},
    };
  }

  // The core left behind (if any) still takes whole-port and named calls.
  void checkUsable() {
    uint32_t isMox = 0;
    ASSERT_EQ(ZinMOX_isMOXCore(handle_, &ref_, &isMox), 0u);
    if (ZinMOX_getPortBits(handle_, &ref_, out_, nullptr, nullptr, 12, nullptr, nullptr, nullptr,
                           nullptr, nullptr, 0) != 0) {
      return;  // no core registered: the sequence's init failed or its terminate ran
    }
    EXPECT_EQ(ZinMOX_setPortBits(handle_, &ref_, bytes_, bytes_, 10, bytes_ + 4, bytes_, 7), 0u);
    ZinRT::ZinMOX_ValueMap map{{"sync_out_data", "55"}};
    uintptr_t word = reinterpret_cast<uintptr_t>(&map);
    EXPECT_EQ(ZinMOX_writeValues(handle_, &ref_, &word), 0u);
    word = reinterpret_cast<uintptr_t>(&readMap_);
    EXPECT_EQ(ZinMOX_readValues(handle_, &ref_, &word), 0u);
  }

  std::vector<Message> takeMessages() {
    std::vector<Message> taken(recorder_.slots.begin(), recorder_.slots.begin() + recorder_.used);
    recorder_.used = 0;
    return taken;
  }

 private:
  std::shared_ptr<ZinTarget::ScriptedTransport> transport_;
  uint32_t handle_ = 0;
  ZIN_CORE_REF ref_{1, 2, 0};
  Recorder recorder_;
  ZinRT::ZinMOX_ValueMap writeMap_, readMap_, infoMap_;
  uint8_t bytes_[4 + 16 * 1] = {0x5A, 0x03, 0xFF, 0x01, 1,  2,  3,  4,  5,  6,
                                7,    8,    9,    10,   11, 12, 13, 14, 15, 16};
  uint8_t out_[16] = {};
};

// Message beginnings of the library for failures that follow from an earlier failed call.
bool isLibraryMessage(const std::string& text) {
  for (const char* start : {"Could not find a signal with the name: ", "The name, ",
                            "Data structures not initialized for MOX core"}) {
    if (text.rfind(start, 0) == 0) return true;
  }
  return false;
}

// Runs the sequence with the Nth allocation failing; returns false once N is past the number of
// allocations the sequence makes.
bool runWithFailureAt(uint64_t n) {
  Scenario scenario;
  std::vector<Call> calls = scenario.calls();
  bool metFailure = false;
  // Taken out of the message record before the sequence runs, so that it allocates nothing.
  std::vector<std::vector<Message>> messagesOf(calls.size(), std::vector<Message>());
  std::vector<uint32_t> results(calls.size());
  std::vector<int> failedIn(calls.size(), 0);
  armAllocationFailure(n);
  for (size_t i = 0; i < calls.size(); ++i) {
    results[i] = calls[i].run();
    failedIn[i] = !metFailure && allocationFailureHappened();
    metFailure = metFailure || failedIn[i];
    messagesOf[i] = scenario.takeMessages();
  }
  disarmAllocationFailure();

  bool before = true;
  for (size_t i = 0; i < calls.size(); ++i) {
    const std::vector<Message>& messages = messagesOf[i];
    const uint32_t result = results[i];
    const std::string where =
        std::string("N=").append(std::to_string(n)) + " " + calls[i].name + ": ";
    before = before && !failedIn[i];
    if (before) {
      EXPECT_EQ(result, 0u) << where << (messages.empty() ? "" : messages[0].text);
      EXPECT_TRUE(messages.empty()) << where;
    } else if (result != 0) {
      EXPECT_EQ(result, kFailure) << where;
      EXPECT_EQ(messages.size(), 1u) << where << "the failure is reported once";
      if (messages.empty()) continue;
      EXPECT_EQ(messages[0].code, 256u) << where << messages[0].text;
      if (failedIn[i]) {
        EXPECT_EQ(messages[0].text, "std::bad_alloc") << where;
      } else {
        EXPECT_TRUE(isLibraryMessage(messages[0].text)) << where << messages[0].text;
      }
    } else {
      EXPECT_TRUE(messages.empty()) << where << messages[0].text;
    }
  }
  scenario.checkUsable();
  for (Call& call : calls) {
    const uint32_t result = call.run();
    const std::vector<Message> messages = scenario.takeMessages();
    EXPECT_EQ(result, 0u) << "rerun " << call.name << ": "
                          << (messages.empty() ? "" : messages[0].text);
  }
  return metFailure;
}

TEST(AllocationFailure, EveryAllocationOfACallSequenceMayFail) {
  runWithFailureAt(0);  // warm-up: the registries of the framework make their one-time allocations
  const int64_t liveBefore = ZinStress::liveAllocations();
  uint64_t n = 1;
  for (; n < 100000 && !::testing::Test::HasFailure(); ++n) {
    if (!runWithFailureAt(n)) break;
    ASSERT_EQ(ZinStress::liveAllocations(), liveBefore) << "allocations leaked with N=" << n;
  }
  EXPECT_GT(n, 50u) << "the sequence makes allocations to fail";
  RecordProperty("sequence_allocations", static_cast<int>(n - 1));
}

}  // namespace
