// The call frame shared by the exported functions (return codes, message codes and texts, the
// target lock), the life of a core (init, re-init, terminate, lookup), the status calls with the
// decoding of every status word layout, and the status read of the framework.
#include <array>
#include <bit>
#include <chrono>
#include <cstring>
#include <functional>
#include <future>
#include <new>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include "ZinRT/ZinJtag.h"
#include "ZinRT/Zin_CoreComm.h"
#include "ZinRT/Zin_CoreList.h"
#include "ZinRT/Zin_SignalCore.h"
#include "support/SessionFixture.h"

namespace {

using namespace ZinTest;
using ZinRT::Zin_CoreList;
using ZinRT::ZinMOX_ValueMap;
using Failure = ZinTestKit::ScriptedTransport::Failure;
using InfoFields = std::array<uint32_t, 12>;  // the record's fields in their order

static_assert(!std::is_copy_constructible_v<ZinRT::ZinMOX_Core> &&
                  !std::is_copy_assignable_v<ZinRT::ZinMOX_Core>,
              "two cores must never own the same signal groups");

const char* const kNotInitialised =
    "Data structures not initialized for MOX core Device:1, user chain number:2, core index:0.";
const char* const kInfoKeys[12] = {
    "manufacturer_id",   "core_type",        "core_major_version", "core_minor_version",
    "core_revision",     "qx_major_version", "qx_minor_version",   "qx_minor_version_alpha",
    "async_input_count", "sync_input_count", "async_output_count", "sync_output_count"};
const char* const kGetInfoWrongType =
    "ZinMOX_getCoreInfo() for the wrong core type or non-existant core.";

class CallFrame : public SessionFixture {
 protected:
  // Registers a plain framework core (not a MOX core object) of the given type at `ref`.
  void registerForeignCore(uint32_t coreType) {
    Zin_CoreList::addCore(
        handle,
        new ZinRT::Zin_SignalCore(handle, ref, ZIN_CORE_INFO{0x10, coreType, 1, 0, 0}, nullptr, 0));
  }

  // All thirteen calls with valid arguments on `t` (which may be null); terminate comes
  // before init, so that the list leaves a registered core behind. The first eight need one.
  std::vector<std::pair<const char*, std::function<uint32_t()>>> everyCall(ZIN_CORE_REF* t) {
    const uint32_t h = handle;
    return {
        {"defineSignal", [=] { return ZinMOX_defineSignal(h, t, "s", 0, 0); }},
        {"defineBus", [=, this] { return ZinMOX_defineBus(h, t, "b", 0, bits, 1); }},
        {"undefineName", [=] { return ZinMOX_undefineName(h, t, "b", 0); }},
        {"getSignalSizes", [=, this] { return ZinMOX_getSignalSizes(h, t, names, sizes, 1, 1); }},
        {"setPortBits", [=] { return ZinMOX_setPortBits(h, t, 0, 0, 0, 0, 0, 0); }},
        {"getPortBits", [=] { return ZinMOX_getPortBits(h, t, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0); }},
        {"writeValues", [=, this] { return ZinMOX_writeValues(h, t, &word); }},
        {"readValues", [=, this] { return map.clear(), ZinMOX_readValues(h, t, &word); }},
        {"getInfo", [=, this] { return ZinMOX_getInfo(h, t, &info); }},
        {"isMOXCore", [=, this] { return ZinMOX_isMOXCore(h, t, &isMox); }},
        {"getCoreInfo", [=, this] { return infoMap.clear(), ZinMOX_getCoreInfo(h, t, &infoWord); }},
        {"terminateCore", [=] { return ZinMOX_terminateCore(h, t); }},
        {"initCore", [=] { return ZinMOX_initCore(h, t); }},
    };
  }

  ZINMOX_CORE_INFO info{};
  uint32_t isMox = 0;
  ZinMOX_ValueMap map, infoMap;
  uintptr_t word = mapWord(map), infoWord = mapWord(infoMap);
  const uint32_t bits[1] = {1};
  const char* names[1] = {"async_out_data"};
  uint32_t sizes[1] = {0};
};

TEST_F(CallFrame, ReportsEachKindOfFailureWithItsCodeAfterReleasingTheLock) {
  initMoxCore(ref, 0, 0, 4, 0);
  struct Case {
    Failure kind;
    std::string thrown;
    uint32_t code;
    std::string reported;
  };
  // clang-format off
  const std::vector<Case> cases = {
      {Failure::Runtime, "transfer broke", kErrorCode, "transfer broke"},
      // The abort is recognised by its exact text, whatever the exception type.
      {Failure::LogicError, "Zin abort command", kAbortCode, "Zin abort command"},
      {Failure::Runtime, "Zin abort command", kAbortCode, "Zin abort command"},
      {Failure::LogicError, "Zin abort command.", kErrorCode, "Zin abort command."},
      {Failure::LogicError, "Zin abort", kErrorCode, "Zin abort"},
      {Failure::BadAlloc, "", kErrorCode, std::bad_alloc().what()},
      {Failure::NonStandard, "", kErrorCode, "Zin internal error."},
  };
  // clang-format on
  for (const Case& c : cases) {
    SCOPED_TRACE(c.reported);
    transport->failNextCommand(c.kind, c.thrown);
    EXPECT_EQ(ZinMOX_setPortBits(handle, &ref, nullptr, nullptr, 0, nullptr, nullptr, 0), kFailure);
    EXPECT_EQ(messages(), (std::vector<RecordedMessage>{{c.code, c.reported, false}}));
    clearMessages();
    EXPECT_FALSE(ZinJtag_session_isLocked(handle));
  }
  EXPECT_EQ(ZinMOX_setPortBits(handle, &ref, nullptr, nullptr, 0, nullptr, nullptr, 0), 0u)
      << "the core still works";
  expectNoMessages();
}

TEST_F(CallFrame, EveryCallTakesTheLockAndRefusesANullReference) {
  initMoxCore(ref, 2, 2, 2, 2);
  for (const auto& [name, call] : everyCall(&ref)) {
    SCOPED_TRACE(name);
    const uint64_t before = ZinJtag_session_lockCount(handle);
    EXPECT_EQ(call(), 0u);
    EXPECT_GT(ZinJtag_session_lockCount(handle), before);
    EXPECT_FALSE(ZinJtag_session_isLocked(handle));
  }
  expectNoMessages();
  transport->clearLog();
  for (const auto& [name, call] : everyCall(nullptr)) {
    SCOPED_TRACE(name);
    EXPECT_NE(errorOf(call()).find("coreRef"), std::string::npos);
  }
  EXPECT_TRUE(map.empty() && infoMap.empty());
  EXPECT_TRUE(transport->transfers().empty());
  EXPECT_NE(registeredCore(ref), nullptr);
}

TEST_F(CallFrame, StatusCallsCheckTheirArgumentsAroundTheLockAndReportFailedReads) {
  transport->placeMoxCore(ref, ZinTestKit::MoxStatus{});
  const uint64_t before = ZinJtag_session_lockCount(handle);
  uintptr_t nullWord = 0;
  const std::string argFailed = "Arg. to function ZinMOX_getCoreInfo() failed:";
  EXPECT_EQ(errorOf(ZinMOX_getInfo(handle, &ref, nullptr)), argFailed + "coreInfo!=0");
  EXPECT_EQ(errorOf(ZinMOX_getCoreInfo(handle, &ref, nullptr)), argFailed + "coreInfo!=0");
  EXPECT_EQ(errorOf(ZinMOX_getCoreInfo(handle, &ref, &nullWord)), argFailed + "*coreInfo!=0");
  EXPECT_EQ(ZinJtag_session_lockCount(handle), before) << "checked before taking the lock";
  EXPECT_EQ(transport->statusReadCount(), 0u);
  // isMOXCore takes the lock before checking its result pointer.
  EXPECT_EQ(errorOf(ZinMOX_isMOXCore(handle, &ref, nullptr)),
            "ZinMOX_isMOXCore() arg. failed:result!=0");
  EXPECT_GT(ZinJtag_session_lockCount(handle), before);

  // A failing status read is reported with its own text (each kind of failure meets the same
  // frame as a failing command); isMOXCore passes it on with a result of 0.
  transport->failNextStatusRead(Failure::Runtime, "status read broke");
  EXPECT_EQ(errorOf(ZinMOX_getInfo(handle, &ref, &info)), "status read broke");
  transport->failNextStatusRead(Failure::BadAlloc);
  EXPECT_EQ(errorOf(ZinMOX_initCore(handle, &ref)), std::bad_alloc().what());
  EXPECT_EQ(Zin_CoreList::getCore(handle, ref), nullptr) << "a failed init registers nothing";
  uint32_t result = 77;
  transport->failNextStatusRead(Failure::Runtime);
  EXPECT_EQ(ZinMOX_isMOXCore(handle, &ref, &result), kFailure);
  EXPECT_EQ(result, 0u);
  EXPECT_FALSE(ZinJtag_session_isLocked(handle));
}

TEST_F(CallFrame, WrongCoreTypeIsReportedUnderTheLockThenAborted) {
  // Nothing answers at `ref` (type 0); a core of type 3 answers at `other`.
  ZIN_CORE_REF other{3, 1, 2};
  transport->placeCore(other, ZIN_CORE_INFO{0x10, 3, 10, 0, 1},
                       std::vector<unsigned char>(16, 0xFF));
  for (ZIN_CORE_REF* coreRef : {&ref, &other}) {
    std::memset(&info, 0xA5, sizeof info);
    EXPECT_EQ(ZinMOX_getInfo(handle, coreRef, &info), kFailure);
    EXPECT_EQ(std::bit_cast<InfoFields>(info), InfoFields{}) << "the record stays all zero";
    expectWrongCoreType(kGetInfoWrongType);
    infoMap = {{"other", "x"}};
    EXPECT_EQ(ZinMOX_getCoreInfo(handle, coreRef, &infoWord), kFailure);
    expectWrongCoreType(kGetInfoWrongType);
    EXPECT_EQ(infoMap, (ZinMOX_ValueMap{{"other", "x"}}));
    uint32_t result = 77;
    EXPECT_EQ(ZinMOX_isMOXCore(handle, coreRef, &result), 0u) << "not a MOX core is no failure";
    EXPECT_EQ(result, 0u);
  }
  uint32_t result = 77;
  transport->placeMoxCore(ref, ZinTestKit::MoxStatus{});
  EXPECT_EQ(ZinMOX_isMOXCore(handle, &ref, &result), 0u);
  EXPECT_EQ(result, 1u);
  expectNoMessages();
}

TEST_F(CallFrame, GetInfoDecodesEachLayoutFromTheVersionKey) {
  struct Case {
    uint32_t major, minor, countOffset, countLength;
    std::array<uint32_t, 4> counts;  // A_in, S_in, A_out, S_out, one after another
    std::array<uint32_t, 3> qx;      // expected qx major, minor, alpha
  };
  // Every word carries qx fields 0xA, 0x5C, 0xE1 at bits 40, 44 and 52 under its counts, and
  // all other bits set.
  // clang-format off
  const std::vector<Case> cases = {
      {6, 1, 40, 8, {0xAB, 1, 0x80, 0xFF}, {0, 0, 0}},      // key 0x61: eight-bit counts
      {5, 18, 40, 8, {3, 4, 5, 6}, {0, 0, 0}},              // (5 << 4) | 18 = 0x52, not 0x62
      {6, 2, 40, 16, {0x1234, 0xFFFF, 0, 0x8001}, {0, 0, 0}},  // from 0x62: sixteen bits
      {9, 15, 40, 16, {0x0102, 0x0304, 0x0506, 0x0708}, {0, 0, 0}},
      {9, 16, 40, 16, {11, 22, 33, 44}, {0, 0, 0}},         // (9 << 4) | 16 = 0x90, not 0xA0
      {10, 0, 60, 16, {0xBEEF, 1, 0x7FFF, 0x1000}, {0xA, 0x5C, 0xE1}},  // from 0xA0: qx too
      {15, 15, 60, 16, {65535, 0, 17, 300}, {0xA, 0x5C, 0xE1}},
  };
  // clang-format on
  uint32_t coreIndex = 0;
  for (const Case& c : cases) {
    SCOPED_TRACE(testing::Message() << c.major << "." << c.minor);
    std::vector<unsigned char> statusWord(16, 0xFF);
    setStatusBits(statusWord, 40, 4, 0xA);
    setStatusBits(statusWord, 44, 8, 0x5C);
    setStatusBits(statusWord, 52, 8, 0xE1);
    for (uint32_t k = 0; k < 4; ++k) {
      setStatusBits(statusWord, c.countOffset + k * c.countLength, c.countLength, c.counts[k]);
    }
    ZIN_CORE_REF at{4, 1, coreIndex++};
    transport->placeCore(at, ZIN_CORE_INFO{0x4321, 9, c.major, c.minor, 7}, statusWord);
    std::memset(&info, 0xA5, sizeof info);
    ASSERT_EQ(ZinMOX_getInfo(handle, &at, &info), 0u);
    const auto got = std::bit_cast<InfoFields>(info);
    EXPECT_EQ(got, (InfoFields{0x4321, 9, c.major, c.minor, 7, c.qx[0], c.qx[1], c.qx[2],
                               c.counts[0], c.counts[1], c.counts[2], c.counts[3]}));
    // The same fields as decimal texts, other keys kept; the core need not be registered.
    infoMap = {{"other", "x"}, {"core_type", "old"}};
    ASSERT_EQ(ZinMOX_getCoreInfo(handle, &at, &infoWord), 0u);
    ZinMOX_ValueMap expected{{"other", "x"}};
    for (std::size_t k = 0; k < got.size(); ++k) expected[kInfoKeys[k]] = std::to_string(got[k]);
    EXPECT_EQ(infoMap, expected);
  }
  EXPECT_EQ(Zin_CoreList::coreCount(handle), 0u);
  expectNoMessages();
}

TEST_F(CallFrame, InitRegistersADecodedCoreAndReinitDiscardsItsNames) {
  ZinRT::ZinMOX_Core* core = initMoxCore(ref, 3, 4, 5, 6);
  ASSERT_NE(core, nullptr);
  EXPECT_EQ(core->getCoreType(), 9u);
  ASSERT_EQ(ZinMOX_defineSignal(handle, &ref, "foo", ZINMOX_ASYNC_OUTPUT, 4), 0u);
  ASSERT_EQ(ZinMOX_initCore(handle, &ref), 0u);
  EXPECT_EQ(Zin_CoreList::coreCount(handle), 1u);
  const char* foo[] = {"foo"};
  EXPECT_EQ(errorOf(ZinMOX_getSignalSizes(handle, &ref, foo, sizes, 1, 1)),
            "Could not find a signal with the name: foo")
      << "re-initialising discards the names";
  EXPECT_EQ(ZinMOX_getSignalSizes(handle, &ref, names, sizes, 1, 1), 0u);
  EXPECT_EQ(sizes[0], 5u);
}

TEST_F(CallFrame, TerminateRemovesOnlyAMoxCoreAndInitReplacesAForeignOne) {
  initMoxCore(ref, 1, 1, 1, 1);
  EXPECT_EQ(ZinMOX_terminateCore(handle, &ref), 0u);
  EXPECT_EQ(Zin_CoreList::getCore(handle, ref), nullptr);
  EXPECT_EQ(ZinMOX_terminateCore(handle, &ref), 0u) << "nothing registered: nothing to do";

  transport->removeCore(ref);
  registerForeignCore(3);
  EXPECT_EQ(ZinMOX_terminateCore(handle, &ref), 0u);
  ASSERT_NE(Zin_CoreList::getCore(handle, ref), nullptr);
  EXPECT_EQ(Zin_CoreList::getCore(handle, ref)->getCoreType(), 3u);
  expectNoMessages();
  // Nothing answers: init removes what was registered and registers nothing.
  EXPECT_EQ(ZinMOX_initCore(handle, &ref), kFailure);
  expectWrongCoreType("ZinMOX_initCore() for the wrong core type or non-existant core.");
  EXPECT_EQ(Zin_CoreList::getCore(handle, ref), nullptr);

  // A MOX core answers: init replaces a foreign core with a MOX core.
  registerForeignCore(3);
  transport->placeMoxCore(ref, ZinTestKit::MoxStatus{});
  EXPECT_EQ(ZinMOX_initCore(handle, &ref), 0u);
  EXPECT_NE(registeredCore(ref), nullptr);
  // The core now reports type 3: re-init removes the MOX core.
  transport->placeCore(ref, ZIN_CORE_INFO{0x10, 3, 10, 0, 0}, std::vector<unsigned char>(16, 0));
  EXPECT_EQ(ZinMOX_initCore(handle, &ref), kFailure);
  expectWrongCoreType("ZinMOX_initCore() for the wrong core type or non-existant core.");
  EXPECT_EQ(Zin_CoreList::getCore(handle, ref), nullptr);
}

TEST_F(CallFrame, CallsOnAnUninitialisedCoreReportThatBeforeCheckingArguments) {
  // No core, then a registered type-9 core that is no MOX core object.
  for (bool foreign : {false, true}) {
    if (foreign) registerForeignCore(9);
    auto calls = everyCall(&ref);
    for (std::size_t i = 0; i < 8; ++i) {
      SCOPED_TRACE(calls[i].first);
      EXPECT_EQ(errorOf(calls[i].second()), kNotInitialised);
    }
    EXPECT_EQ(errorOf(ZinMOX_setPortBits(handle, &ref, nullptr, nullptr, 999, nullptr, nullptr, 9)),
              kNotInitialised);
    EXPECT_EQ(errorOf(ZinMOX_writeValues(handle, &ref, nullptr)), kNotInitialised);
  }
  ref = ZIN_CORE_REF{200, 15, 12};  // the numbers are decimal
  EXPECT_EQ(errorOf(ZinMOX_undefineName(handle, &ref, "x", 0)),
            "Data structures not initialized for MOX core Device:200, user chain number:15, core "
            "index:12.");
}

TEST_F(CallFrame, ACallWaitsForTheLockHeldByACallInsideItsTransfer) {
  using namespace std::chrono_literals;
  initMoxCore(ref, 4, 0, 4, 0);
  const uint8_t data = 0x09, mask = 0x0F;
  // (the call that blocks inside its transfer, the call that must wait for it)
  const std::vector<std::pair<std::function<uint32_t()>, std::function<uint32_t()>>> cases = {
      {[&] { return ZinMOX_readValues(handle, &ref, &word); },
       [&] { return ZinMOX_defineSignal(handle, &ref, "late", ZINMOX_ASYNC_INPUT, 3); }},
      {[&] { return ZinMOX_setPortBits(handle, &ref, &data, &mask, 4, nullptr, nullptr, 0); },
       [&] { return ZinMOX_terminateCore(handle, &ref); }},
  };
  for (const auto& [running, waiting] : cases) {
    transport->blockNextCommand();
    std::future<uint32_t> first = std::async(std::launch::async, running);
    ASSERT_TRUE(transport->waitUntilBlocked(10000));
    std::future<uint32_t> second = std::async(std::launch::async, waiting);
    EXPECT_EQ(second.wait_for(300ms), std::future_status::timeout);
    EXPECT_NE(registeredCore(ref), nullptr);
    transport->release();
    EXPECT_EQ(first.get(), 0u);
    EXPECT_EQ(second.get(), 0u);
  }
  EXPECT_EQ(Zin_CoreList::getCore(handle, ref), nullptr);
  EXPECT_EQ(lastWrite(4, 0).asyncValues, "1001") << "the write completed before the terminate";
  expectNoMessages();
}

// A transport that answers every status read with all bits set, far beyond the asked ones.
class FloodingTransport : public ZinTestKit::ScriptedTransport {
 public:
  void readStatus(const ZIN_CORE_REF&, ZIN_CORE_INFO& info, unsigned char* status, uint32_t bytes,
                  uint32_t) override {
    info.coreType = 9;
    std::memset(status, 0xFF, bytes);
  }
};

TEST(StatusRead, KeepsExactlyTheAskedBitsForEveryBitCount) {
  const ZIN_CORE_REF at{1, 0, 2};
  auto flooding = std::make_shared<FloodingTransport>();
  const uint32_t session = ZinJtag_openSession(flooding);
  ZinTestKit::ScriptedTransport scripted;
  scripted.placeCore(at, ZIN_CORE_INFO{7, 9, 10, 0, 3}, std::vector<unsigned char>(4, 0xFF));
  // (bit count, the four bytes that hold exactly that many bits)
  // clang-format off
  const std::vector<std::pair<uint32_t, std::vector<unsigned char>>> cases = {
      {0, {0, 0, 0, 0}}, {1, {0x01, 0, 0, 0}}, {7, {0x7F, 0, 0, 0}}, {8, {0xFF, 0, 0, 0}},
      {13, {0xFF, 0x1F, 0, 0}}, {23, {0xFF, 0xFF, 0x7F, 0}}, {31, {0xFF, 0xFF, 0xFF, 0x7F}},
      {32, {0xFF, 0xFF, 0xFF, 0xFF}}, {40, {0xFF, 0xFF, 0xFF, 0xFF}}};
  // clang-format on
  for (const auto& [count, expected] : cases) {
    SCOPED_TRACE(testing::Message() << count << " bits");
    ZIN_CORE_INFO info{};
    ZinRT::Zin_ByteBuffer status(4, 0, 0);
    std::memset(status.uPtr(), 0xAA, 4);
    ZinRT::Zin_CoreComm::getCoreStatus(session, at, &info, status, count);
    EXPECT_EQ(std::vector<unsigned char>(status.uPtr(), status.uPtr() + 4), expected);
    EXPECT_EQ(info.coreType, 9u);
    // The scripted target gives no more than the asked bits either.
    std::vector<unsigned char> bytes(4, 0);
    scripted.readStatus(at, info, bytes.data(), 4, count);
    EXPECT_EQ(bytes, expected);
    EXPECT_EQ(info.manufacturerId, 7u);
  }
  ZinJtag_closeSession(session);
}

}  // namespace
