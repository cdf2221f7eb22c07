// The call frame shared by the exported functions: return codes, message codes and texts, the
// target lock, and the two status calls ZinMOX_getInfo and ZinMOX_isMOXCore.
#include <array>
#include <cstring>
#include <memory>
#include <new>
#include <string>
#include <utility>
#include <vector>

#include "ZinRT/ZinJtag.h"
#include "support/SessionFixture.h"
#include "support/WireFormat.h"

namespace {

using ZinTarget::ScriptedTransport;
using namespace ZinTest;

class CallFrame : public SessionFixture {};

TEST_F(CallFrame, ReportsEachKindOfFailureWithItsCodeAfterReleasingTheLock) {
  initMoxCore(ref, 0, 0, 4, 0);
  struct Case {
    ScriptedTransport::Failure kind;
    std::string thrown;
    uint32_t code;
    std::string reported;
  };
  const std::vector<Case> cases = {
      {ScriptedTransport::Failure::Runtime, "transfer broke", kErrorCode, "transfer broke"},
      // The abort is recognised by its exact text, whatever the exception type.
      {ScriptedTransport::Failure::LogicError, "Zin abort command", kAbortCode,
       "Zin abort command"},
      {ScriptedTransport::Failure::Runtime, "Zin abort command", kAbortCode, "Zin abort command"},
      {ScriptedTransport::Failure::LogicError, "Zin abort command.", kErrorCode,
       "Zin abort command."},
      {ScriptedTransport::Failure::LogicError, "Zin abort", kErrorCode, "Zin abort"},
      {ScriptedTransport::Failure::BadAlloc, "", kErrorCode, std::bad_alloc().what()},
      {ScriptedTransport::Failure::NonStandard, "", kErrorCode, "Zin internal error."},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.reported);
    transport->failNextCommand(c.kind, c.thrown);
    EXPECT_EQ(ZinMOX_setPortBits(handle, &ref, nullptr, nullptr, 0, nullptr, nullptr, 0), kFailure);
    std::vector<RecordedMessage> recorded = messages();
    ASSERT_EQ(recorded.size(), 1u);
    EXPECT_EQ(recorded[0].code, c.code);
    EXPECT_EQ(recorded[0].text, c.reported);
    EXPECT_FALSE(recorded[0].lockHeld);
    EXPECT_FALSE(ZinJtag_session_isLocked(handle));
    clearMessages();
  }
  // The core still works after all of these.
  EXPECT_EQ(ZinMOX_setPortBits(handle, &ref, nullptr, nullptr, 0, nullptr, nullptr, 0), 0u);
  expectNoMessages();
}

TEST_F(CallFrame, GetInfoChecksItsRecordBeforeTakingTheLock) {
  transport->placeMoxCore(ref, ZinTarget::MoxStatus{});
  const uint64_t before = ZinJtag_session_lockCount(handle);
  EXPECT_EQ(ZinMOX_getInfo(handle, &ref, nullptr), kFailure);
  EXPECT_EQ(ZinJtag_session_lockCount(handle), before);
  EXPECT_EQ(transport->statusReadCount(), 0u);
  expectOnlyError("Arg. to function ZinMOX_getCoreInfo() failed:coreInfo!=0");
}

TEST_F(CallFrame, IsMOXCoreTakesTheLockBeforeCheckingItsResult) {
  transport->placeMoxCore(ref, ZinTarget::MoxStatus{});
  const uint64_t before = ZinJtag_session_lockCount(handle);
  EXPECT_EQ(ZinMOX_isMOXCore(handle, &ref, nullptr), kFailure);
  EXPECT_GT(ZinJtag_session_lockCount(handle), before);
  EXPECT_FALSE(ZinJtag_session_isLocked(handle));
  expectOnlyError("ZinMOX_isMOXCore() arg. failed:result!=0");
}

TEST_F(CallFrame, WrongCoreTypeSendsItsMessageUnderTheLockThenTheAbort) {
  // Nothing answers at `ref` (core type 0); a core of type 3 answers at `other`.
  ZIN_CORE_REF other{3, 1, 2};
  transport->placeCore(other, ZIN_CORE_INFO{0x10, 3, 10, 0, 1},
                       std::vector<unsigned char>(16, 0xFF));
  for (ZIN_CORE_REF* coreRef : {&ref, &other}) {
    ZINMOX_CORE_INFO info;
    std::memset(&info, 0xA5, sizeof info);
    EXPECT_EQ(ZinMOX_getInfo(handle, coreRef, &info), kFailure);
    const ZINMOX_CORE_INFO zero{};
    EXPECT_EQ(std::memcmp(&info, &zero, sizeof info), 0) << "the record stays all zero";
    std::vector<RecordedMessage> recorded = messages();
    ASSERT_EQ(recorded.size(), 2u);
    EXPECT_EQ(recorded[0].code, kErrorCode);
    EXPECT_EQ(recorded[0].text,
              "ZinMOX_getCoreInfo() for the wrong core type or non-existant core.");
    EXPECT_TRUE(recorded[0].lockHeld);
    EXPECT_EQ(recorded[1].code, kAbortCode);
    EXPECT_EQ(recorded[1].text, "Zin abort command");
    EXPECT_FALSE(recorded[1].lockHeld);
    clearMessages();
  }
}

TEST_F(CallFrame, GetInfoReportsAFailingStatusReadWithItsOwnText) {
  transport->placeMoxCore(ref, ZinTarget::MoxStatus{});
  ZINMOX_CORE_INFO info{};
  transport->failNextStatusRead(ScriptedTransport::Failure::Runtime, "status read broke");
  EXPECT_EQ(ZinMOX_getInfo(handle, &ref, &info), kFailure);
  expectOnlyError("status read broke");
  transport->failNextStatusRead(ScriptedTransport::Failure::BadAlloc);
  EXPECT_EQ(ZinMOX_getInfo(handle, &ref, &info), kFailure);
  expectOnlyError(std::bad_alloc().what());
  transport->failNextStatusRead(ScriptedTransport::Failure::NonStandard);
  EXPECT_EQ(ZinMOX_getInfo(handle, &ref, &info), kFailure);
  expectOnlyError("Zin internal error.");
  EXPECT_FALSE(ZinJtag_session_isLocked(handle));
}

TEST_F(CallFrame, IsMOXCoreReturnsTheStatusOfItsStatusRead) {
  ZIN_CORE_REF other{3, 1, 2};
  transport->placeMoxCore(ref, ZinTarget::MoxStatus{});
  transport->placeCore(other, ZIN_CORE_INFO{0x10, 3, 10, 0, 1}, std::vector<unsigned char>(16, 0));

  uint32_t result = 77;
  EXPECT_EQ(ZinMOX_isMOXCore(handle, &ref, &result), 0u);
  EXPECT_EQ(result, 1u);
  result = 77;
  EXPECT_EQ(ZinMOX_isMOXCore(handle, &other, &result), 0u) << "not a MOX core is no failure";
  EXPECT_EQ(result, 0u);
  expectNoMessages();

  // A failing status read: the framework's status comes back as it is, the result word is 0.
  result = 77;
  transport->failNextStatusRead(ScriptedTransport::Failure::Runtime);
  EXPECT_EQ(ZinMOX_isMOXCore(handle, &ref, &result), 0x80000000u);
  EXPECT_EQ(result, 0u);
  EXPECT_FALSE(ZinJtag_session_isLocked(handle));
}

// --- Status word layouts, through ZinMOX_getInfo ---------------------------------------------

struct LayoutCase {
  const char* label;
  uint32_t major, minor;
  // Fields as (offset, length, value) written into a status word whose other bits are all 1.
  std::vector<std::array<uint32_t, 3>> fields;
  uint32_t qxMajor, qxMinor, qxAlpha, asyncIn, syncIn, asyncOut, syncOut;
};

void expectInfo(const ZINMOX_CORE_INFO& info, const LayoutCase& c) {
  EXPECT_EQ(info.manufacturer_id, 0x4321u);
  EXPECT_EQ(info.core_type, 9u);
  EXPECT_EQ(info.core_major_version, c.major);
  EXPECT_EQ(info.core_minor_version, c.minor);
  EXPECT_EQ(info.core_revision, 7u);
  EXPECT_EQ(info.qx_major_version, c.qxMajor);
  EXPECT_EQ(info.qx_minor_version, c.qxMinor);
  EXPECT_EQ(info.qx_minor_version_alpha, c.qxAlpha);
  EXPECT_EQ(info.async_input_count, c.asyncIn);
  EXPECT_EQ(info.sync_input_count, c.syncIn);
  EXPECT_EQ(info.async_output_count, c.asyncOut);
  EXPECT_EQ(info.sync_output_count, c.syncOut);
}

TEST_F(CallFrame, GetInfoDecodesEachLayoutFromTheVersionKey) {
  const std::vector<LayoutCase> cases = {
      // Key 0x61: eight-bit counts from bit 40; the qx fields are not in the word.
      {"6.1",
       6,
       1,
       {{40, 8, 0xAB}, {48, 8, 0x01}, {56, 8, 0x80}, {64, 8, 0xFF}},
       0,
       0,
       0,
       0xAB,
       0x01,
       0x80,
       0xFF},
      // 5.18: the key is (5 << 4) | 18 = 0x52, not the sum 0x62.
      {"5.18", 5, 18, {{40, 8, 3}, {48, 8, 4}, {56, 8, 5}, {64, 8, 6}}, 0, 0, 0, 3, 4, 5, 6},
      // Keys 0x62 and 0x9F: sixteen-bit counts from bit 40; a count of 0 is a count.
      {"6.2",
       6,
       2,
       {{40, 16, 0x1234}, {56, 16, 0xFFFF}, {72, 16, 0}, {88, 16, 0x8001}},
       0,
       0,
       0,
       0x1234,
       0xFFFF,
       0,
       0x8001},
      {"9.15",
       9,
       15,
       {{40, 16, 0x0102}, {56, 16, 0x0304}, {72, 16, 0x0506}, {88, 16, 0x0708}},
       0,
       0,
       0,
       0x0102,
       0x0304,
       0x0506,
       0x0708},
      // 9.16: (9 << 4) | 16 = 0x90 (the sum would be 0xA0).
      {"9.16",
       9,
       16,
       {{40, 16, 11}, {56, 16, 22}, {72, 16, 33}, {88, 16, 44}},
       0,
       0,
       0,
       11,
       22,
       33,
       44},
      // Key 0xA0: the qx version at 40/44/52, counts from bit 60.
      {"10.0",
       10,
       0,
       {{40, 4, 0xA},
        {44, 8, 0x5C},
        {52, 8, 0xE1},
        {60, 16, 0xBEEF},
        {76, 16, 1},
        {92, 16, 0x7FFF},
        {108, 16, 0x1000}},
       0xA,
       0x5C,
       0xE1,
       0xBEEF,
       1,
       0x7FFF,
       0x1000},
  };
  uint32_t coreIndex = 0;
  for (const LayoutCase& c : cases) {
    SCOPED_TRACE(c.label);
    std::vector<unsigned char> word(16, 0xFF);
    for (const auto& field : c.fields) setStatusBits(word, field[0], field[1], field[2]);
    ZIN_CORE_REF at{4, 1, coreIndex++};
    transport->placeCore(at, ZIN_CORE_INFO{0x4321, 9, c.major, c.minor, 7}, word);
    ZINMOX_CORE_INFO info;
    std::memset(&info, 0xA5, sizeof info);
    ASSERT_EQ(ZinMOX_getInfo(handle, &at, &info), 0u);
    expectInfo(info, c);
  }
  expectNoMessages();
  EXPECT_FALSE(ZinJtag_session_isLocked(handle));
}

TEST_F(CallFrame, FailuresAreReportedOnTheCallersSessionInOrder) {
  // A second session on its own target, with its own message record.
  struct Record {
    std::vector<std::pair<uint32_t, std::string>> messages;
  } other;
  auto otherTransport = std::make_shared<ScriptedTransport>();
  const uint32_t otherHandle = ZinJtag_openSession(otherTransport);
  ZinJtag_setMessageHandler(
      otherHandle,
      [](void* user, uint32_t, uint32_t code, const char* text) {
        static_cast<Record*>(user)->messages.emplace_back(code, text);
      },
      &other);
  ZINMOX_CORE_INFO info{};
  EXPECT_EQ(ZinMOX_getInfo(otherHandle, &ref, &info), kFailure);
  EXPECT_EQ(ZinMOX_defineSignal(otherHandle, &ref, "x", 0, 0), kFailure);
  ZinJtag_closeSession(otherHandle);
  expectNoMessages();
  const std::vector<std::pair<uint32_t, std::string>> expected = {
      {kErrorCode, "ZinMOX_getCoreInfo() for the wrong core type or non-existant core."},
      {kAbortCode, "Zin abort command"},
      {kErrorCode,
       "Data structures not initialized for MOX core Device:1, user chain number:2, core index:0."},
  };
  EXPECT_EQ(other.messages, expected);
}

}  // namespace
