// Fails the Nth allocation, for every N, across a whole sequence of exported calls (init, define,
// value writes and reads, port calls, sizes, information, undefine, terminate). The call that
// meets the failure either succeeds or reports "std::bad_alloc" with code 256; the calls before
// it succeed; later calls succeed or fail with one of the library's own messages. Nothing leaks,
// and afterwards, with failures off, the core left behind still works and the whole sequence
// runs again without a failure.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "FailingAllocator.h"
#include "ZinMOX/ZinMOX.h"
#include "ZinRT/ZinJtag.h"
#include "ZinTestKit/ScriptedTransport.h"

namespace {

struct Message {
  uint32_t code = 0;
  std::string text;
};

// Messages are kept in slots made up front, so that recording one allocates nothing (an
// allocation failing in the test's own handler would otherwise lose the message).
struct Recorder {
  std::vector<Message> slots = std::vector<Message>(16);
  size_t used = 0;
  Recorder() {
    for (Message& slot : slots) slot.text.reserve(512);
  }
  static void onMessage(void* user, uint32_t, uint32_t code, const char* text) {
    auto* self = static_cast<Recorder*>(user);
    if (self->used == self->slots.size()) return;
    Message& slot = self->slots[self->used++];
    slot.code = code;
    slot.text.assign(text, std::min<size_t>(std::strlen(text), slot.text.capacity()));
  }
  std::vector<Message> take() {
    std::vector<Message> taken(slots.begin(), slots.begin() + used);
    used = 0;
    return taken;
  }
};

// A session with one MOX core and the calls of the sequence.
class Scenario {
 public:
  Scenario() : transport_(std::make_shared<ZinTestKit::ScriptedTransport>()) {
    transport_->placeMoxCore(
        ref_,
        {.asyncInputCount = 12, .syncInputCount = 9, .asyncOutputCount = 10, .syncOutputCount = 7});
    transport_->queueReadData(std::vector<unsigned char>(32, 0x5A));
    handle_ = ZinJtag_openSession(transport_);
    ZinJtag_setMessageHandler(handle_, &Recorder::onMessage, &recorder);
  }
  ~Scenario() { ZinJtag_closeSession(handle_); }

  std::vector<std::pair<const char*, std::function<uint32_t()>>> calls() {
    const uint32_t h = handle_;
    ZIN_CORE_REF* r = &ref_;
    return {
        {"initCore", [=] { return ZinMOX_initCore(h, r); }},
        {"defineSignal", [=] { return ZinMOX_defineSignal(h, r, "ctl", ZINMOX_ASYNC_OUTPUT, 3); }},
        {"defineBus(sync out)",
         [=] { return ZinMOX_defineBus(h, r, "steps", ZINMOX_SYNC_OUTPUT, stepBits, 3); }},
        {"defineBus(sync in)",
         [=] {
           return ZinMOX_defineBus(h, r, "status_with_a_long_name", ZINMOX_SYNC_INPUT, inBits, 4);
         }},
        {"writeValues", [=, this] { return ZinMOX_writeValues(h, r, &writeWord_); }},
        {"readValues", [=, this] { return readMap_.clear(), ZinMOX_readValues(h, r, &readWord_); }},
        {"setPortBits",
         [=, this] { return ZinMOX_setPortBits(h, r, in_, in_ + 2, 10, in_ + 4, in_, 7); }},
        {"getPortBits",
         [=, this] {
           return ZinMOX_getPortBits(h, r, out_, out_ + 2, out_ + 4, 12, out_ + 6, out_ + 8,
                                     out_ + 10, out_ + 12, out_ + 14, 9);
         }},
        {"getSignalSizes", [=, this] { return ZinMOX_getSignalSizes(h, r, names_, sizes_, 2, 1); }},
        {"getCoreInfo",
         [=, this] { return readMap_.clear(), ZinMOX_getCoreInfo(h, r, &readWord_); }},
        {"undefineName", [=] { return ZinMOX_undefineName(h, r, "ctl", ZINMOX_ASYNC_OUTPUT); }},
        {"terminateCore", [=] { return ZinMOX_terminateCore(h, r); }},
    };
  }

  // The core left behind, if any, still takes whole-port and named calls.
  void checkUsable() {
    uint32_t isMox = 0;
    ASSERT_EQ(ZinMOX_isMOXCore(handle_, &ref_, &isMox), 0u);
    if (ZinMOX_getPortBits(handle_, &ref_, out_, nullptr, nullptr, 12, nullptr, nullptr, nullptr,
                           nullptr, nullptr, 0) != 0) {
      return;  // no core registered: the sequence's init failed or its terminate ran
    }
    EXPECT_EQ(ZinMOX_setPortBits(handle_, &ref_, in_, in_, 10, in_ + 4, in_, 7), 0u);
    ZinRT::ZinMOX_ValueMap map{{"sync_out_data", "55"}};
    EXPECT_EQ(ZinMOX_writeValues(handle_, &ref_, &(word_ = mapWord(map))), 0u);
    EXPECT_EQ(ZinMOX_readValues(handle_, &ref_, &readWord_), 0u);
  }

  Recorder recorder;

 private:
  static uintptr_t mapWord(ZinRT::ZinMOX_ValueMap& map) {
    return reinterpret_cast<uintptr_t>(&map);
  }
  static constexpr uint32_t stepBits[3] = {6, 0, 2};
  static constexpr uint32_t inBits[4] = {8, 1, 4, 5};

  std::shared_ptr<ZinTestKit::ScriptedTransport> transport_;
  uint32_t handle_ = 0;
  ZIN_CORE_REF ref_{1, 2, 0};
  ZinRT::ZinMOX_ValueMap writeMap_{{"ctl", "2A5"},
                                   {"steps.pulsetrain", "0123456789ABCDEF0123456789ABCDEF"},
                                   {"async_out_data", "3FF"}};
  ZinRT::ZinMOX_ValueMap readMap_;
  uintptr_t word_ = 0, writeWord_ = mapWord(writeMap_), readWord_ = mapWord(readMap_);
  uint32_t sizes_[2] = {};
  const char* names_[2] = {"ctl", "steps"};
  uint8_t in_[20] = {0x5A, 0x03, 0xFF, 0x01, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16};
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

// Runs the sequence with the Nth allocation failing; false once N is past its allocations.
bool runWithFailureAt(uint64_t n) {
  Scenario scenario;
  auto calls = scenario.calls();
  // Made before the sequence runs, so that keeping the results allocates nothing.
  std::vector<std::vector<Message>> messagesOf(calls.size(), std::vector<Message>());
  std::vector<uint32_t> results(calls.size());
  size_t failedAt = calls.size();
  ZinStress::armAllocationFailure(n);
  for (size_t i = 0; i < calls.size(); ++i) {
    results[i] = calls[i].second();
    if (failedAt == calls.size() && ZinStress::failed) failedAt = i;
    messagesOf[i] = scenario.recorder.take();
  }
  ZinStress::armed = false;

  for (size_t i = 0; i < calls.size(); ++i) {
    const std::vector<Message>& messages = messagesOf[i];
    const std::string where = "N=" + std::to_string(n) + " " + calls[i].first + ": " +
                              (messages.empty() ? "" : messages[0].text);
    if (i < failedAt || results[i] == 0) {
      EXPECT_TRUE(results[i] == 0 || i > failedAt) << where;
      EXPECT_TRUE(messages.empty()) << where;
      continue;
    }
    EXPECT_EQ(results[i], 0x80000000u) << where;
    EXPECT_EQ(messages.size(), 1u) << where << " (the failure is reported once)";
    if (messages.empty()) continue;
    EXPECT_EQ(messages[0].code, 256u) << where;
    if (i == failedAt) {
      EXPECT_EQ(messages[0].text, "std::bad_alloc") << where;
    } else {
      EXPECT_TRUE(isLibraryMessage(messages[0].text)) << where;
    }
  }
  scenario.checkUsable();
  scenario.recorder.take();  // the not-initialised failure of checkUsable when no core is left
  for (auto& [name, call] : calls) {
    EXPECT_EQ(call(), 0u) << "rerun " << name;
    EXPECT_TRUE(scenario.recorder.take().empty()) << "rerun " << name;
  }
  return failedAt != calls.size();
}

TEST(AllocationFailure, EveryAllocationOfACallSequenceMayFail) {
  runWithFailureAt(0);  // warm-up: the framework's registries make their one-time allocations
  const int64_t liveBefore = ZinStress::live.load();
  uint64_t n = 1;
  for (; n < 100000 && !::testing::Test::HasFailure() && runWithFailureAt(n); ++n) {
    ASSERT_EQ(ZinStress::live.load(), liveBefore) << "allocations leaked with N=" << n;
  }
  EXPECT_GT(n, 50u) << "the sequence makes allocations to fail";
  RecordProperty("sequence_allocations", static_cast<int>(n - 1));
}

}  // namespace
