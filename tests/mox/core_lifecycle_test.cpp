// Initialising, re-initialising and terminating cores, the lookup of registered cores, the
// decimal information map of ZinMOX_getCoreInfo, and which calls take the target lock.
#include <functional>
#include <string>
#include <type_traits>
#include <vector>

#include "ZinRT/ZinJtag.h"
#include "ZinRT/Zin_CoreList.h"
#include "ZinRT/Zin_SignalCore.h"
#include "support/SessionFixture.h"

namespace {

using namespace ZinTest;
using ZinRT::Zin_CoreList;
using ZinRT::ZinMOX_ValueMap;

static_assert(!std::is_copy_constructible_v<ZinRT::ZinMOX_Core>,
              "two cores must never own the same signal groups");
static_assert(!std::is_copy_assignable_v<ZinRT::ZinMOX_Core>,
              "two cores must never own the same signal groups");

const char* const kNotInitialised =
    "Data structures not initialized for MOX core Device:1, user chain number:2, core index:0.";

class CoreLifecycle : public SessionFixture {
 protected:
  // Registers a plain framework core (not a MOX core object) of the given type at `ref`.
  void registerForeignCore(uint32_t coreType) {
    Zin_CoreList::addCore(
        handle,
        new ZinRT::Zin_SignalCore(handle, ref, ZIN_CORE_INFO{0x10, coreType, 1, 0, 0}, nullptr, 0));
  }

  uint32_t sizeOf(const char* name, bool output) {
    uint32_t size = 0xFFFFFFFFu;
    const char* names[] = {name};
    uint32_t result = ZinMOX_getSignalSizes(handle, &ref, names, &size, 1, output ? 1 : 0);
    clearMessages();
    return result == 0 ? size : 0xFFFFFFFFu;
  }

  void expectWrongCoreType(const char* text) {
    std::vector<RecordedMessage> recorded = messages();
    ASSERT_EQ(recorded.size(), 2u);
    EXPECT_EQ(recorded[0].code, kErrorCode);
    EXPECT_EQ(recorded[0].text, text);
    EXPECT_TRUE(recorded[0].lockHeld);
    EXPECT_EQ(recorded[1].code, kAbortCode);
    EXPECT_EQ(recorded[1].text, "Zin abort command");
    EXPECT_FALSE(recorded[1].lockHeld);
    clearMessages();
  }

  // Calls each of the eight calls that need a registered core, with null arguments.
  std::vector<std::function<uint32_t()>> callsNeedingACore() {
    return {
        [&] { return ZinMOX_defineSignal(handle, &ref, nullptr, 0, 0); },
        [&] { return ZinMOX_defineBus(handle, &ref, nullptr, 0, nullptr, 0); },
        [&] { return ZinMOX_undefineName(handle, &ref, nullptr, 0); },
        [&] { return ZinMOX_getSignalSizes(handle, &ref, nullptr, nullptr, 0, 0); },
        [&] {
          return ZinMOX_setPortBits(handle, &ref, nullptr, nullptr, 999, nullptr, nullptr, 999);
        },
        [&] {
          return ZinMOX_getPortBits(handle, &ref, nullptr, nullptr, nullptr, 999, nullptr, nullptr,
                                    nullptr, nullptr, nullptr, 999);
        },
        [&] { return ZinMOX_writeValues(handle, &ref, nullptr); },
        [&] { return ZinMOX_readValues(handle, &ref, nullptr); },
    };
  }

  // All thirteen calls with valid arguments, on the core reference `target` (which may be
  // null); terminate comes before init, so that the list leaves a registered core behind.
  std::vector<std::pair<const char*, std::function<uint32_t()>>> everyCall(ZIN_CORE_REF* target) {
    return {
        {"getInfo", [=, this] { return ZinMOX_getInfo(handle, target, &info); }},
        {"isMOXCore", [=, this] { return ZinMOX_isMOXCore(handle, target, &isMox); }},
        {"getCoreInfo", [=, this] { return ZinMOX_getCoreInfo(handle, target, &word); }},
        {"defineSignal", [=, this] { return ZinMOX_defineSignal(handle, target, "s", 0, 0); }},
        {"defineBus", [=, this] { return ZinMOX_defineBus(handle, target, "b", 0, bits, 1); }},
        {"undefineName", [=, this] { return ZinMOX_undefineName(handle, target, "b", 0); }},
        {"getSignalSizes",
         [=, this] { return ZinMOX_getSignalSizes(handle, target, names, sizes, 1, 1); }},
        {"setPortBits",
         [=, this] {
           return ZinMOX_setPortBits(handle, target, nullptr, nullptr, 0, nullptr, nullptr, 0);
         }},
        {"getPortBits",
         [=, this] {
           return ZinMOX_getPortBits(handle, target, nullptr, nullptr, nullptr, 0, nullptr, nullptr,
                                     nullptr, nullptr, nullptr, 0);
         }},
        {"writeValues",
         [=, this] {
           map.clear();  // getCoreInfo filled it with keys that are no signal names
           return ZinMOX_writeValues(handle, target, &word);
         }},
        {"readValues", [=, this] { return ZinMOX_readValues(handle, target, &word); }},
        {"terminateCore", [=, this] { return ZinMOX_terminateCore(handle, target); }},
        {"initCore", [=, this] { return ZinMOX_initCore(handle, target); }},
    };
  }

  // Arguments of everyCall.
  ZINMOX_CORE_INFO info{};
  uint32_t isMox = 0;
  ZinMOX_ValueMap map;
  uintptr_t word = mapWord(map);
  const uint32_t bits[1] = {1};
  const char* names[1] = {"async_out_data"};
  uint32_t sizes[1] = {0};
};

TEST_F(CoreLifecycle, InitRegistersADecodedCoreAndReinitDiscardsItsNames) {
  ZinRT::ZinMOX_Core* core = initMoxCore(ref, 3, 4, 5, 6);
  ASSERT_NE(core, nullptr);
  EXPECT_EQ(core->getCoreType(), 9u);
  EXPECT_EQ(core->getMoxCoreInfo().async_input_count, 3u);
  EXPECT_EQ(core->getMoxCoreInfo().sync_output_count, 6u);
  using ZinRT::Zin_SignalBase;
  EXPECT_EQ(core->getCorePhysicalSignalCount(Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_INPUT), 3u);
  EXPECT_EQ(core->getCorePhysicalSignalCount(Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_INPUT), 4u);
  EXPECT_EQ(core->getCorePhysicalSignalCount(Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_OUTPUT), 5u);
  EXPECT_EQ(core->getCorePhysicalSignalCount(Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_OUTPUT), 6u);

  ASSERT_EQ(ZinMOX_defineSignal(handle, &ref, "foo", ZINMOX_ASYNC_OUTPUT, 4), 0u);
  EXPECT_EQ(sizeOf("foo", true), 1u);
  ASSERT_EQ(ZinMOX_initCore(handle, &ref), 0u);
  expectNoMessages();
  EXPECT_EQ(Zin_CoreList::coreCount(handle), 1u);
  EXPECT_NE(registeredCore(ref), nullptr);
  EXPECT_EQ(sizeOf("foo", true), 0xFFFFFFFFu) << "re-initialising discards the names";
  EXPECT_EQ(sizeOf("async_out_data", true), 5u);
  EXPECT_EQ(sizeOf("sync_in_data", false), 4u);
}

TEST_F(CoreLifecycle, TerminateRemovesTheCoreAndDoesNothingWhereNoneIsRegistered) {
  initMoxCore(ref, 1, 1, 1, 1);
  EXPECT_EQ(ZinMOX_terminateCore(handle, &ref), 0u);
  EXPECT_EQ(Zin_CoreList::getCore(handle, ref), nullptr);
  EXPECT_EQ(ZinMOX_defineSignal(handle, &ref, "x", 0, 0), kFailure);
  expectOnlyError(kNotInitialised);
  EXPECT_EQ(ZinMOX_terminateCore(handle, &ref), 0u);
  ZIN_CORE_REF never{7, 7, 7};
  EXPECT_EQ(ZinMOX_terminateCore(handle, &never), 0u);
  expectNoMessages();
}

TEST_F(CoreLifecycle, TerminateLeavesACoreOfAnotherTypeAndInitReplacesIt) {
  registerForeignCore(3);
  EXPECT_EQ(ZinMOX_terminateCore(handle, &ref), 0u);
  expectNoMessages();
  ZinRT::Zin_Core* foreign = Zin_CoreList::getCore(handle, ref);
  ASSERT_NE(foreign, nullptr);
  EXPECT_EQ(foreign->getCoreType(), 3u);
  EXPECT_EQ(ZinMOX_defineSignal(handle, &ref, "x", 0, 0), kFailure);
  expectOnlyError(kNotInitialised);

  // A MOX core answers: init removes the other core and registers a MOX core.
  transport->placeMoxCore(ref, ZinTarget::MoxStatus{});
  EXPECT_EQ(ZinMOX_initCore(handle, &ref), 0u);
  expectNoMessages();
  EXPECT_NE(registeredCore(ref), nullptr);
}

TEST_F(CoreLifecycle, InitOfANonMoxCoreRemovesWhatWasRegisteredAndRegistersNothing) {
  // Nothing answers at the reference, a core of another type is registered there.
  registerForeignCore(3);
  EXPECT_EQ(ZinMOX_initCore(handle, &ref), kFailure);
  expectWrongCoreType("ZinMOX_initCore() for the wrong core type or non-existant core.");
  EXPECT_EQ(Zin_CoreList::getCore(handle, ref), nullptr);

  // A MOX core was registered, but the status read now reports a core of type 3.
  initMoxCore(ref, 1, 0, 1, 0);
  transport->placeCore(ref, ZIN_CORE_INFO{0x10, 3, 10, 0, 0}, std::vector<unsigned char>(16, 0));
  EXPECT_EQ(ZinMOX_initCore(handle, &ref), kFailure);
  expectWrongCoreType("ZinMOX_initCore() for the wrong core type or non-existant core.");
  EXPECT_EQ(Zin_CoreList::getCore(handle, ref), nullptr);
  EXPECT_EQ(ZinMOX_defineSignal(handle, &ref, "x", 0, 0), kFailure);
  expectOnlyError(kNotInitialised);
}

TEST_F(CoreLifecycle, InitReportsAFailingStatusReadAndRegistersNothing) {
  transport->placeMoxCore(ref, ZinTarget::MoxStatus{});
  transport->failNextStatusRead(ZinTarget::ScriptedTransport::Failure::Runtime, "no status");
  EXPECT_EQ(ZinMOX_initCore(handle, &ref), kFailure);
  expectOnlyError("no status");
  EXPECT_EQ(Zin_CoreList::getCore(handle, ref), nullptr);
  EXPECT_FALSE(ZinJtag_session_isLocked(handle));
}

TEST_F(CoreLifecycle, EveryCallOnAnUninitialisedCoreReportsThatBeforeCheckingArguments) {
  for (auto& call : callsNeedingACore()) {
    EXPECT_EQ(call(), kFailure);
    expectOnlyError(kNotInitialised);
  }
  // The numbers of the reference are decimal.
  ref = ZIN_CORE_REF{200, 15, 12};
  EXPECT_EQ(ZinMOX_undefineName(handle, &ref, "x", 0), kFailure);
  expectOnlyError(
      "Data structures not initialized for MOX core Device:200, user chain number:15, core "
      "index:12.");
}

TEST_F(CoreLifecycle, ARegisteredType9CoreThatIsNoMoxCoreObjectCountsAsUninitialised) {
  registerForeignCore(9);
  for (auto& call : callsNeedingACore()) {
    EXPECT_EQ(call(), kFailure);
    expectOnlyError(kNotInitialised);
  }
}

TEST_F(CoreLifecycle, GetCoreInfoWritesDecimalTextsAndKeepsOtherKeys) {
  ZinTarget::MoxStatus status;
  status.majorVersion = 10;
  status.minorVersion = 3;
  status.asyncInputCount = 65535;
  status.syncInputCount = 0;
  status.asyncOutputCount = 17;
  status.syncOutputCount = 300;
  status.qxMajorVersion = 1;
  status.qxMinorVersion = 20;
  status.qxMinorVersionAlpha = 255;
  transport->placeMoxCore(ref, status, 0x1234, 5);
  ZinMOX_ValueMap map{{"other", "x"}, {"core_type", "old"}};
  uintptr_t word = mapWord(map);
  ASSERT_EQ(ZinMOX_getCoreInfo(handle, &ref, &word), 0u) << "the core need not be registered";
  expectNoMessages();
  const ZinMOX_ValueMap expected{
      {"other", "x"},
      {"manufacturer_id", "4660"},
      {"core_type", "9"},
      {"core_major_version", "10"},
      {"core_minor_version", "3"},
      {"core_revision", "5"},
      {"qx_major_version", "1"},
      {"qx_minor_version", "20"},
      {"qx_minor_version_alpha", "255"},
      {"async_input_count", "65535"},
      {"sync_input_count", "0"},
      {"async_output_count", "17"},
      {"sync_output_count", "300"},
  };
  EXPECT_EQ(map, expected);
  EXPECT_EQ(Zin_CoreList::getCore(handle, ref), nullptr);
}

TEST_F(CoreLifecycle, GetCoreInfoChecksItsArgumentsBeforeTheLockAndReportsWrongCores) {
  transport->placeMoxCore(ref, ZinTarget::MoxStatus{});
  const uint64_t before = ZinJtag_session_lockCount(handle);
  EXPECT_EQ(ZinMOX_getCoreInfo(handle, &ref, nullptr), kFailure);
  expectOnlyError("Arg. to function ZinMOX_getCoreInfo() failed:coreInfo!=0");
  uintptr_t nullWord = 0;
  EXPECT_EQ(ZinMOX_getCoreInfo(handle, &ref, &nullWord), kFailure);
  expectOnlyError("Arg. to function ZinMOX_getCoreInfo() failed:*coreInfo!=0");
  EXPECT_EQ(ZinJtag_session_lockCount(handle), before);
  EXPECT_EQ(transport->statusReadCount(), 0u);

  ZIN_CORE_REF empty{1, 2, 9};
  ZinMOX_ValueMap map{{"other", "x"}};
  uintptr_t word = mapWord(map);
  EXPECT_EQ(ZinMOX_getCoreInfo(handle, &empty, &word), kFailure);
  expectWrongCoreType("ZinMOX_getCoreInfo() for the wrong core type or non-existant core.");
  EXPECT_EQ(map, (ZinMOX_ValueMap{{"other", "x"}}));
}

TEST_F(CoreLifecycle, EveryCallTakesTheTargetLock) {
  initMoxCore(ref, 2, 2, 2, 2);
  for (const auto& [name, call] : everyCall(&ref)) {
    SCOPED_TRACE(name);
    const uint64_t before = ZinJtag_session_lockCount(handle);
    EXPECT_EQ(call(), 0u);
    EXPECT_GT(ZinJtag_session_lockCount(handle), before);
    EXPECT_FALSE(ZinJtag_session_isLocked(handle));
  }
  expectNoMessages();
}

TEST_F(CoreLifecycle, ANullCoreReferenceIsAFailureNotACrash) {
  initMoxCore(ref, 2, 2, 2, 2);
  for (const auto& [name, call] : everyCall(nullptr)) {
    SCOPED_TRACE(name);
    EXPECT_EQ(call(), kFailure);
    std::vector<RecordedMessage> recorded = messages();
    ASSERT_EQ(recorded.size(), 1u);
    EXPECT_EQ(recorded[0].code, kErrorCode);
    EXPECT_NE(recorded[0].text.find("coreRef"), std::string::npos) << recorded[0].text;
    clearMessages();
  }
  EXPECT_TRUE(map.empty());
  EXPECT_TRUE(transport->transfers().empty());
  EXPECT_NE(registeredCore(ref), nullptr);
}

}  // namespace
