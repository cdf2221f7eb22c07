// The signal tables of a core: definition and undefinition checks in their order, reserved
// whole-port names, duplicates, case-insensitive names, and the size query.
#include <functional>
#include <stdexcept>
#include <string>
#include <vector>

#include "support/SessionFixture.h"

namespace {

using namespace ZinTest;

const char* const kDuplicateTail =
    ", is already used by another signal and will not be re-defined. Note: Signal names are "
    "case-insensitive";
const char* const kUndefinedTail =
    ", has not been defined. Note: Signal names are case-insensitive";
const char* const kIndexMessage =
    "This signal cannot be defined because an index is greater than the number of this signal "
    "type.";

class SignalTable : public SessionFixture {
 protected:
  void SetUp() override {
    SessionFixture::SetUp();
    // A_in 4, S_in 6, A_out 8, S_out 3.
    core = initMoxCore(ref, 4, 6, 8, 3);
  }

  // The text of the one failure message of a call that returned `result`.
  std::string failureOf(uint32_t result) {
    EXPECT_EQ(result, kFailure);
    std::vector<RecordedMessage> recorded = messages();
    clearMessages();
    if (recorded.size() != 1) {
      ADD_FAILURE() << "expected one message, got " << recorded.size();
      return recorded.empty() ? "" : recorded[0].text;
    }
    EXPECT_EQ(recorded[0].code, kErrorCode);
    EXPECT_FALSE(recorded[0].lockHeld);
    return recorded[0].text;
  }

  uint32_t define(const char* name, uint32_t type, uint32_t bit) {
    return ZinMOX_defineSignal(handle, &ref, name, type, bit);
  }
  uint32_t defineBus(const char* name, uint32_t type, std::vector<uint32_t> bits) {
    return ZinMOX_defineBus(handle, &ref, name, type, bits.data(),
                            static_cast<uint32_t>(bits.size()));
  }
  uint32_t undefine(const char* name, uint32_t type) {
    return ZinMOX_undefineName(handle, &ref, name, type);
  }
  // The size of one named signal, or 0xFFFFFFFF (with the failure message consumed) if the call
  // fails.
  uint32_t sizeOf(const char* name, bool output) {
    uint32_t size = 0xFFFFFFFFu;
    const char* names[] = {name};
    if (ZinMOX_getSignalSizes(handle, &ref, names, &size, 1, output ? 1 : 0) != 0) {
      EXPECT_EQ(failureOf(kFailure), std::string("Could not find a signal with the name: ") + name);
      return 0xFFFFFFFFu;
    }
    return size;
  }

  static std::string methodFailure(const std::function<void()>& call) {
    try {
      call();
    } catch (const std::logic_error& error) {
      return error.what();
    }
    ADD_FAILURE() << "no std::logic_error";
    return "";
  }

  ZinRT::ZinMOX_Core* core = nullptr;
  static constexpr uint32_t kNone = 0xFFFFFFFFu;
};

TEST_F(SignalTable, DefinitionChecksRunInTheirOrder) {
  std::vector<uint32_t> none;
  // An empty name wins over everything else.
  EXPECT_EQ(failureOf(define("", 9, 100)), "Invalid signal name.");
  EXPECT_EQ(methodFailure([&] { core->defineSignal("", 9, none); }), "Invalid signal name.");
  // No positions wins over an unknown type.
  EXPECT_EQ(methodFailure([&] { core->defineSignal("x", 9, none); }),
            "This signal cannot be defined with a size of 0.");
  // An unknown type wins over an index out of range.
  EXPECT_EQ(failureOf(define("x", 4, 100)),
            "This signal cannot be defined because the type is unknown.");
  EXPECT_EQ(failureOf(define("x", 9, 0)),
            "This signal cannot be defined because the type is unknown.");
  // Indexes: the width itself is out of range, the last bit is in range.
  EXPECT_EQ(failureOf(define("x", ZINMOX_ASYNC_OUTPUT, 8)), kIndexMessage);
  EXPECT_EQ(failureOf(defineBus("x", ZINMOX_SYNC_OUTPUT, {0, 1, 3})), kIndexMessage);
  EXPECT_EQ(failureOf(define("x", ZINMOX_ASYNC_INPUT, 4)), kIndexMessage);
  EXPECT_EQ(failureOf(define("x", ZINMOX_SYNC_INPUT, 6)), kIndexMessage);
  EXPECT_EQ(sizeOf("x", true), kNone) << "failed definitions leave the tables unchanged";
  EXPECT_EQ(sizeOf("x", false), kNone);
  EXPECT_EQ(define("x", ZINMOX_ASYNC_OUTPUT, 7), 0u);
  // An index is checked before the name is looked up.
  EXPECT_EQ(failureOf(define("x", ZINMOX_ASYNC_OUTPUT, 8)), kIndexMessage);
  EXPECT_EQ(failureOf(define("x", ZINMOX_ASYNC_OUTPUT, 7)),
            std::string("The name, x") + kDuplicateTail);
  expectNoMessages();
}

TEST_F(SignalTable, BusesKeepTheirPositionsAsGiven) {
  EXPECT_EQ(defineBus("rep", ZINMOX_ASYNC_OUTPUT, {3, 3, 0}), 0u);
  EXPECT_EQ(sizeOf("rep", true), 3u);
  // A name in use fails even for an identical definition, and the existing bus stays.
  EXPECT_EQ(failureOf(defineBus("rep", ZINMOX_ASYNC_OUTPUT, {3, 3, 0})),
            std::string("The name, rep") + kDuplicateTail);
  EXPECT_EQ(failureOf(defineBus("rep", ZINMOX_SYNC_OUTPUT, {1})),
            std::string("The name, rep") + kDuplicateTail);
  EXPECT_EQ(sizeOf("rep", true), 3u);
}

TEST_F(SignalTable, ArgumentChecksOfTheDefineAndUndefineCalls) {
  const uint32_t bits[] = {0, 1};
  EXPECT_EQ(failureOf(ZinMOX_defineSignal(handle, &ref, nullptr, 0, 0)),
            "ZinMOX_defineSignal() arg. failed:name!=0");
  EXPECT_EQ(failureOf(ZinMOX_defineBus(handle, &ref, nullptr, 0, nullptr, 0)),
            "ZinMOX_defineBus() arg. failed:name!=0");
  EXPECT_EQ(failureOf(ZinMOX_defineBus(handle, &ref, "b", 0, nullptr, 0)),
            "ZinMOX_defineBus() arg. failed:bitIndexArray!=0");
  EXPECT_EQ(failureOf(ZinMOX_defineBus(handle, &ref, "b", 0, bits, 0)),
            "ZinMOX_defineBus() arg. failed:arrayLen!=0");
  EXPECT_EQ(failureOf(ZinMOX_undefineName(handle, &ref, nullptr, 0)),
            "ZinMOX_undefineName() arg. failed:name!=0");
  EXPECT_EQ(sizeOf("b", true), kNone);
}

TEST_F(SignalTable, UndefinitionSelectsTheTableByTypeCode) {
  ASSERT_EQ(define("out", ZINMOX_SYNC_OUTPUT, 2), 0u);
  ASSERT_EQ(define("in", ZINMOX_SYNC_INPUT, 5), 0u);
  EXPECT_EQ(failureOf(undefine("", ZINMOX_SYNC_OUTPUT)), "Invalid signal name.");
  // Input codes search the inputs only.
  EXPECT_EQ(failureOf(undefine("out", ZINMOX_ASYNC_INPUT)),
            std::string("The name, out") + kUndefinedTail);
  EXPECT_EQ(failureOf(undefine("in", ZINMOX_ASYNC_OUTPUT)),
            std::string("The name, in") + kUndefinedTail);
  // Any code that is not an input code searches the outputs; sync and async share a table.
  EXPECT_EQ(undefine("out", 7), 0u);
  EXPECT_EQ(sizeOf("out", true), kNone);
  EXPECT_EQ(failureOf(undefine("out", 7)), std::string("The name, out") + kUndefinedTail);
  EXPECT_EQ(undefine("in", ZINMOX_ASYNC_INPUT), 0u);
  EXPECT_EQ(sizeOf("in", false), kNone);
  expectNoMessages();
}

TEST_F(SignalTable, ReservedNamesCoverEachPortAndCanBeUndefinedAndReused) {
  EXPECT_EQ(sizeOf("async_out_data", true), 8u);
  EXPECT_EQ(sizeOf("sync_out_data", true), 3u);
  EXPECT_EQ(sizeOf("async_in_data", false), 4u);
  EXPECT_EQ(sizeOf("sync_in_data", false), 6u);
  EXPECT_EQ(sizeOf("async_out_data", false), kNone) << "outputs are not in the input table";

  EXPECT_EQ(undefine("async_out_data", ZINMOX_ASYNC_OUTPUT), 0u);
  EXPECT_EQ(sizeOf("async_out_data", true), kNone);
  EXPECT_EQ(define("async_out_data", ZINMOX_ASYNC_INPUT, 1), 0u);
  EXPECT_EQ(defineBus("async_out_data", ZINMOX_SYNC_OUTPUT, {2, 0}), 0u);
  EXPECT_EQ(sizeOf("async_out_data", true), 2u);
  EXPECT_EQ(sizeOf("async_out_data", false), 1u);

  // Defining the reserved names again fails on the first one still in use.
  EXPECT_EQ(methodFailure([&] { core->addReservedSignals(); }),
            std::string("The name, async_out_data") + kDuplicateTail);
}

TEST_F(SignalTable, ReservedNamesExistOnlyForPortsOfNonZeroWidth) {
  ref = ZIN_CORE_REF{1, 2, 5};
  initMoxCore(ref, 0, 2, 0, 4);
  EXPECT_EQ(sizeOf("sync_out_data", true), 4u);
  EXPECT_EQ(sizeOf("sync_in_data", false), 2u);
  EXPECT_EQ(sizeOf("async_out_data", true), kNone);
  EXPECT_EQ(sizeOf("async_in_data", false), kNone);
  EXPECT_EQ(failureOf(undefine("async_out_data", ZINMOX_ASYNC_OUTPUT)),
            std::string("The name, async_out_data") + kUndefinedTail);
  // On a port of width 0 every position is out of range.
  EXPECT_EQ(failureOf(define("a", ZINMOX_ASYNC_OUTPUT, 0)), kIndexMessage);
  EXPECT_EQ(failureOf(define("a", ZINMOX_ASYNC_INPUT, 0)), kIndexMessage);

  // A core without any port: nothing is defined, the counts pushed to the framework are 0.
  ref = ZIN_CORE_REF{1, 2, 6};
  ZinRT::ZinMOX_Core* empty = initMoxCore(ref, 0, 0, 0, 0);
  ASSERT_NE(empty, nullptr);
  for (const char* name : {"async_out_data", "sync_out_data"}) EXPECT_EQ(sizeOf(name, true), kNone);
  for (const char* name : {"async_in_data", "sync_in_data"}) EXPECT_EQ(sizeOf(name, false), kNone);
  using ZinRT::Zin_SignalBase;
  for (uint32_t type :
       {Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_INPUT, Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_INPUT,
        Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_OUTPUT,
        Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_OUTPUT}) {
    EXPECT_EQ(empty->getCorePhysicalSignalCount(type), 0u);
  }
}

TEST_F(SignalTable, NamesAreUniquePerDirection) {
  EXPECT_EQ(defineBus("x", ZINMOX_ASYNC_OUTPUT, {0, 1}), 0u);
  EXPECT_EQ(define("x", ZINMOX_ASYNC_INPUT, 3), 0u) << "one input and one output may share a name";
  EXPECT_EQ(sizeOf("x", true), 2u);
  EXPECT_EQ(sizeOf("x", false), 1u);
  EXPECT_EQ(failureOf(define("x", ZINMOX_SYNC_OUTPUT, 0)),
            std::string("The name, x") + kDuplicateTail);
  EXPECT_EQ(failureOf(define("x", ZINMOX_SYNC_INPUT, 0)),
            std::string("The name, x") + kDuplicateTail);
  // Undefining one direction leaves the other.
  EXPECT_EQ(undefine("x", ZINMOX_SYNC_INPUT), 0u);
  EXPECT_EQ(sizeOf("x", true), 2u);
  EXPECT_EQ(sizeOf("x", false), kNone);
}

TEST_F(SignalTable, NamesIgnoreLetterCaseAndMessagesQuoteTheCallersName) {
  ASSERT_EQ(defineBus("Ctl", ZINMOX_ASYNC_OUTPUT, {0, 1, 2}), 0u);
  EXPECT_EQ(sizeOf("CTL", true), 3u);
  EXPECT_EQ(sizeOf("ctl", true), 3u);
  EXPECT_EQ(failureOf(define("ctl", ZINMOX_SYNC_OUTPUT, 0)),
            std::string("The name, ctl") + kDuplicateTail);
  EXPECT_EQ(undefine("CTL", ZINMOX_ASYNC_OUTPUT), 0u);
  EXPECT_EQ(sizeOf("Ctl", true), kNone);
  EXPECT_EQ(failureOf(undefine("cTL", ZINMOX_ASYNC_OUTPUT)),
            std::string("The name, cTL") + kUndefinedTail);

  ASSERT_EQ(define("Sense", ZINMOX_ASYNC_INPUT, 0), 0u);
  EXPECT_EQ(failureOf(define("SENSE", ZINMOX_SYNC_INPUT, 1)),
            std::string("The name, SENSE") + kDuplicateTail);
  EXPECT_EQ(failureOf(define("ASYNC_IN_DATA", ZINMOX_ASYNC_INPUT, 1)),
            std::string("The name, ASYNC_IN_DATA") + kDuplicateTail);
  // Only ASCII letters fold: '@' and '`' differ in the same bit as 'A' and 'a' but are distinct.
  EXPECT_EQ(define("s@", ZINMOX_ASYNC_INPUT, 1), 0u);
  EXPECT_EQ(define("s`", ZINMOX_ASYNC_INPUT, 2), 0u);
}

TEST_F(SignalTable, SizeQueryChecksItsArgumentsAndStopsAtTheFirstUnknownName) {
  ASSERT_EQ(defineBus("a", ZINMOX_SYNC_INPUT, {0, 1, 2, 3, 4}), 0u);
  ASSERT_EQ(define("c", ZINMOX_SYNC_INPUT, 0), 0u);
  uint32_t sizes[3] = {kNone, kNone, kNone};
  const char* names[3] = {"a", nullptr, "c"};
  EXPECT_EQ(failureOf(ZinMOX_getSignalSizes(handle, &ref, nullptr, sizes, 3, 0)),
            "ZinMOX_getSignalSizes() arg. failed:nameArray!=0");
  EXPECT_EQ(failureOf(ZinMOX_getSignalSizes(handle, &ref, names, nullptr, 3, 0)),
            "ZinMOX_getSignalSizes() arg. failed:sizeArray!=0");
  EXPECT_EQ(failureOf(ZinMOX_getSignalSizes(handle, &ref, names, sizes, 0, 0)),
            "ZinMOX_getSignalSizes() arg. failed:arrayLen!=0");
  EXPECT_EQ(failureOf(ZinMOX_getSignalSizes(handle, &ref, names, sizes, 3, 0)),
            "ZinMOX_getSignalSizes() arg. failed:nameArray[i]!=0");
  EXPECT_EQ(sizes[0], kNone) << "nothing is written when a name pointer is null";

  names[1] = "b";
  EXPECT_EQ(failureOf(ZinMOX_getSignalSizes(handle, &ref, names, sizes, 3, 0)),
            "Could not find a signal with the name: b");
  EXPECT_EQ(sizes[0], 5u);
  EXPECT_EQ(sizes[2], kNone);

  names[1] = "sync_in_data";
  EXPECT_EQ(ZinMOX_getSignalSizes(handle, &ref, names, sizes, 3, 0), 0u);
  EXPECT_EQ(sizes[0], 5u);
  EXPECT_EQ(sizes[1], 6u);
  EXPECT_EQ(sizes[2], 1u);
  // Outputs are searched when isOutput is non-zero (any value).
  const char* outputs[1] = {"async_out_data"};
  EXPECT_EQ(ZinMOX_getSignalSizes(handle, &ref, outputs, sizes, 1, 42), 0u);
  EXPECT_EQ(sizes[0], 8u);
  expectNoMessages();
}

TEST_F(SignalTable, SizeQueryOfTheCoreRefusesACountBeyondTheNames) {
  uint32_t sizes[3] = {kNone, kNone, kNone};
  EXPECT_THROW(core->getSignalSizes({"async_out_data"}, sizes, 3, 1), std::logic_error);
  EXPECT_EQ(sizes[1], kNone);
  EXPECT_EQ(sizes[2], kNone);
}

}  // namespace
