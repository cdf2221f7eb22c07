// The signal tables of a core: definition and undefinition checks in their order, reserved
// whole-port names, duplicates, case-insensitive names, and the size query.
#include <stdexcept>
#include <string>
#include <vector>

#include "support/SessionFixture.h"

namespace {

using namespace ZinTest;

const std::string kDuplicateTail =
    ", is already used by another signal and will not be re-defined. Note: Signal names are "
    "case-insensitive";
const std::string kUndefinedTail =
    ", has not been defined. Note: Signal names are case-insensitive";
const char* const kIndexMessage =
    "This signal cannot be defined because an index is greater than the number of this signal "
    "type.";
constexpr uint32_t kNone = 0xFFFFFFFFu;

class SignalTable : public SessionFixture {
 protected:
  void SetUp() override {
    SessionFixture::SetUp();
    core = initMoxCore(ref, 4, 6, 8, 3);  // A_in 4, S_in 6, A_out 8, S_out 3
  }
  uint32_t define(const char* name, uint32_t type, uint32_t bit) {
    return ZinMOX_defineSignal(handle, &ref, name, type, bit);
  }
  uint32_t undefine(const char* name, uint32_t type) {
    return ZinMOX_undefineName(handle, &ref, name, type);
  }
  // The size of one named signal, or kNone when the name is unknown.
  uint32_t sizeOf(const char* name, bool output) {
    uint32_t size = kNone;
    const char* names[] = {name};
    const uint32_t result = ZinMOX_getSignalSizes(handle, &ref, names, &size, 1, output ? 1 : 0);
    if (result == 0) return size;
    EXPECT_EQ(errorOf(result), std::string("Could not find a signal with the name: ") + name);
    return kNone;
  }

  ZinRT::ZinMOX_Core* core = nullptr;
};

TEST_F(SignalTable, DefinitionChecksRunInTheirOrder) {
  std::vector<uint32_t> none;
  // An empty name wins over everything; no positions over an unknown type; an unknown type over
  // an index out of range.
  EXPECT_EQ(errorOf(define("", 9, 100)), "Invalid signal name.");
  EXPECT_EQ(logicErrorOf([&] { core->defineSignal("", 9, none); }), "Invalid signal name.");
  EXPECT_EQ(logicErrorOf([&] { core->defineSignal("x", 9, none); }),
            "This signal cannot be defined with a size of 0.");
  for (uint32_t type : {4u, 9u}) {
    EXPECT_EQ(errorOf(define("x", type, 100)),
              "This signal cannot be defined because the type is unknown.");
  }
  // The width itself is out of range, the last bit is in range.
  EXPECT_EQ(errorOf(define("x", ZINMOX_ASYNC_OUTPUT, 8)), kIndexMessage);
  EXPECT_EQ(errorOf(defineBus("x", ZINMOX_SYNC_OUTPUT, {0, 1, 3})), kIndexMessage);
  EXPECT_EQ(errorOf(define("x", ZINMOX_ASYNC_INPUT, 4)), kIndexMessage);
  EXPECT_EQ(errorOf(define("x", ZINMOX_SYNC_INPUT, 6)), kIndexMessage);
  EXPECT_EQ(sizeOf("x", true), kNone) << "failed definitions leave the tables unchanged";
  EXPECT_EQ(sizeOf("x", false), kNone);
  EXPECT_EQ(define("x", ZINMOX_ASYNC_OUTPUT, 7), 0u);
  EXPECT_EQ(errorOf(define("x", ZINMOX_ASYNC_OUTPUT, 8)), kIndexMessage) << "before the lookup";
  EXPECT_EQ(errorOf(define("x", ZINMOX_ASYNC_OUTPUT, 7)), "The name, x" + kDuplicateTail);

  // Buses keep their positions as given, repeats included; a name in use fails even for an
  // identical definition, and the existing bus stays.
  EXPECT_EQ(defineBus("rep", ZINMOX_ASYNC_OUTPUT, {3, 3, 0}), 0u);
  EXPECT_EQ(errorOf(defineBus("rep", ZINMOX_ASYNC_OUTPUT, {3, 3, 0})),
            "The name, rep" + kDuplicateTail);
  EXPECT_EQ(errorOf(defineBus("rep", ZINMOX_SYNC_OUTPUT, {1})), "The name, rep" + kDuplicateTail);
  EXPECT_EQ(sizeOf("rep", true), 3u);

  const uint32_t bits[] = {0, 1};
  EXPECT_EQ(errorOf(ZinMOX_defineSignal(handle, &ref, nullptr, 0, 0)),
            "ZinMOX_defineSignal() arg. failed:name!=0");
  EXPECT_EQ(errorOf(ZinMOX_defineBus(handle, &ref, nullptr, 0, nullptr, 0)),
            "ZinMOX_defineBus() arg. failed:name!=0");
  EXPECT_EQ(errorOf(ZinMOX_defineBus(handle, &ref, "b", 0, nullptr, 0)),
            "ZinMOX_defineBus() arg. failed:bitIndexArray!=0");
  EXPECT_EQ(errorOf(ZinMOX_defineBus(handle, &ref, "b", 0, bits, 0)),
            "ZinMOX_defineBus() arg. failed:arrayLen!=0");
  EXPECT_EQ(errorOf(ZinMOX_undefineName(handle, &ref, nullptr, 0)),
            "ZinMOX_undefineName() arg. failed:name!=0");
  EXPECT_EQ(sizeOf("b", true), kNone);
}

TEST_F(SignalTable, NamesAreUniquePerDirectionAndIgnoreLetterCase) {
  EXPECT_EQ(defineBus("Ctl", ZINMOX_ASYNC_OUTPUT, {0, 1}), 0u);
  EXPECT_EQ(define("ctl", ZINMOX_ASYNC_INPUT, 3), 0u) << "an input and an output may share a name";
  EXPECT_EQ(sizeOf("CTL", true), 2u);
  EXPECT_EQ(sizeOf("cTl", false), 1u);
  // Messages quote the caller's spelling.
  EXPECT_EQ(errorOf(define("CTL", ZINMOX_SYNC_OUTPUT, 0)), "The name, CTL" + kDuplicateTail);
  EXPECT_EQ(errorOf(define("ctL", ZINMOX_SYNC_INPUT, 0)), "The name, ctL" + kDuplicateTail);
  EXPECT_EQ(errorOf(define("ASYNC_IN_DATA", ZINMOX_ASYNC_INPUT, 1)),
            "The name, ASYNC_IN_DATA" + kDuplicateTail);
  // Only ASCII letters fold: '@' and '`' differ in the same bit as 'A' and 'a'.
  EXPECT_EQ(define("s@", ZINMOX_ASYNC_INPUT, 1), 0u);
  EXPECT_EQ(define("s`", ZINMOX_ASYNC_INPUT, 2), 0u);

  // Input codes search the inputs only; any other code searches the outputs, where sync and
  // async share a table.
  EXPECT_EQ(errorOf(undefine("", ZINMOX_SYNC_OUTPUT)), "Invalid signal name.");
  EXPECT_EQ(errorOf(undefine("s@", ZINMOX_ASYNC_OUTPUT)), "The name, s@" + kUndefinedTail);
  EXPECT_EQ(undefine("CTL", 7), 0u);
  EXPECT_EQ(sizeOf("ctl", true), kNone);
  EXPECT_EQ(sizeOf("ctl", false), 1u) << "undefining one direction leaves the other";
  EXPECT_EQ(errorOf(undefine("cTL", ZINMOX_SYNC_OUTPUT)), "The name, cTL" + kUndefinedTail);
  EXPECT_EQ(undefine("Ctl", ZINMOX_SYNC_INPUT), 0u);
  EXPECT_EQ(sizeOf("ctl", false), kNone);
}

TEST_F(SignalTable, ReservedNamesCoverEachPortOfNonZeroWidthAndCanBeReused) {
  EXPECT_EQ(sizeOf("async_out_data", true), 8u);
  EXPECT_EQ(sizeOf("sync_out_data", true), 3u);
  EXPECT_EQ(sizeOf("async_in_data", false), 4u);
  EXPECT_EQ(sizeOf("sync_in_data", false), 6u);
  EXPECT_EQ(sizeOf("async_out_data", false), kNone) << "outputs are not in the input table";
  EXPECT_EQ(undefine("async_out_data", ZINMOX_ASYNC_OUTPUT), 0u);
  EXPECT_EQ(define("async_out_data", ZINMOX_ASYNC_INPUT, 1), 0u);
  EXPECT_EQ(defineBus("async_out_data", ZINMOX_SYNC_OUTPUT, {2, 0}), 0u);
  EXPECT_EQ(sizeOf("async_out_data", true), 2u);
  EXPECT_EQ(sizeOf("async_out_data", false), 1u);
  EXPECT_EQ(logicErrorOf([&] { core->addReservedSignals(); }),
            "The name, async_out_data" + kDuplicateTail)
      << "defining them again fails on the first one in use";

  ref = ZIN_CORE_REF{1, 2, 5};
  initMoxCore(ref, 0, 2, 0, 4);
  EXPECT_EQ(sizeOf("sync_out_data", true), 4u);
  EXPECT_EQ(sizeOf("sync_in_data", false), 2u);
  EXPECT_EQ(sizeOf("async_out_data", true), kNone);
  EXPECT_EQ(sizeOf("async_in_data", false), kNone);
  EXPECT_EQ(errorOf(define("a", ZINMOX_ASYNC_OUTPUT, 0)), kIndexMessage) << "a port of width 0";
  EXPECT_EQ(errorOf(define("a", ZINMOX_ASYNC_INPUT, 0)), kIndexMessage);

  ref = ZIN_CORE_REF{1, 2, 6};
  ASSERT_NE(initMoxCore(ref, 0, 0, 0, 0), nullptr);
  EXPECT_EQ(sizeOf("sync_out_data", true), kNone);
  EXPECT_EQ(sizeOf("sync_in_data", false), kNone);
}

TEST_F(SignalTable, SizeQueryChecksItsArgumentsAndStopsAtTheFirstUnknownName) {
  ASSERT_EQ(defineBus("a", ZINMOX_SYNC_INPUT, {0, 1, 2, 3, 4}), 0u);
  ASSERT_EQ(define("c", ZINMOX_SYNC_INPUT, 0), 0u);
  uint32_t sizes[3] = {kNone, kNone, kNone};
  const char* names[3] = {"a", nullptr, "c"};
  EXPECT_EQ(errorOf(ZinMOX_getSignalSizes(handle, &ref, nullptr, sizes, 3, 0)),
            "ZinMOX_getSignalSizes() arg. failed:nameArray!=0");
  EXPECT_EQ(errorOf(ZinMOX_getSignalSizes(handle, &ref, names, nullptr, 3, 0)),
            "ZinMOX_getSignalSizes() arg. failed:sizeArray!=0");
  EXPECT_EQ(errorOf(ZinMOX_getSignalSizes(handle, &ref, names, sizes, 0, 0)),
            "ZinMOX_getSignalSizes() arg. failed:arrayLen!=0");
  EXPECT_EQ(errorOf(ZinMOX_getSignalSizes(handle, &ref, names, sizes, 3, 0)),
            "ZinMOX_getSignalSizes() arg. failed:nameArray[i]!=0");
  EXPECT_EQ(sizes[0], kNone) << "nothing is written when a name pointer is null";
  names[1] = "b";
  EXPECT_EQ(errorOf(ZinMOX_getSignalSizes(handle, &ref, names, sizes, 3, 0)),
            "Could not find a signal with the name: b");
  EXPECT_EQ(sizes[0], 5u);
  EXPECT_EQ(sizes[2], kNone);
  names[1] = "sync_in_data";
  EXPECT_EQ(ZinMOX_getSignalSizes(handle, &ref, names, sizes, 3, 0), 0u);
  EXPECT_EQ(std::vector<uint32_t>(sizes, sizes + 3), (std::vector<uint32_t>{5, 6, 1}));
  const char* outputs[1] = {"async_out_data"};
  EXPECT_EQ(ZinMOX_getSignalSizes(handle, &ref, outputs, sizes, 1, 42), 0u) << "any non-zero";
  EXPECT_EQ(sizes[0], 8u);
  expectNoMessages();
  // The core's own query refuses a count beyond the names.
  EXPECT_THROW(core->getSignalSizes({"async_out_data"}, sizes, 3, 1), std::logic_error);
  EXPECT_EQ(sizes[1], 6u);
}

}  // namespace
