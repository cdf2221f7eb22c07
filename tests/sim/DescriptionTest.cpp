// Target descriptions: the JSON format, its error reports and the demo design.
#include <gtest/gtest.h>

#include <fstream>
#include <optional>

#include "SimTestUtil.h"
#include "ZinSim/DescriptionJson.h"

namespace {

using ZinSim::DescriptionError;

// A description with one chain whose first core is `core` (JSON text).
std::string withCore(const std::string& core) {
  return R"({"devices": [{"index": 1, "chains": [{"number": 2, "cores": [)" + core + "]}]}]}";
}

// The description error that `call` throws, if any.
template <class Call>
std::optional<DescriptionError> errorOf(Call&& call) {
  try {
    call();
  } catch (const DescriptionError& e) {
    return e;
  }
  return std::nullopt;
}

TEST(Description, EveryProblemIsNamedByItsPointer) {
  struct Case {
    std::string json, pointer, problem;
  };
  const std::string core = "/devices/0/chains/0/cores/0";
  const std::vector<Case> cases = {
      {"{", "", "not valid JSON"},
      {"[]", "", "expected an object, found array"},
      {"{}", "/devices", "missing"},
      {R"({"devices": {}})", "/devices", "expected an array, found object"},
      {R"({"devices": [], "extra": 1})", "/extra", "unknown key"},
      {R"({"devices": [{"index": 256}]})", "/devices/0/index",
       "expected a number from 0 to 255, found 256"},
      {R"({"devices": [{"index": 3}, {"index": 3}]})", "/devices/1/index",
       "device 3 is described twice"},
      {R"({"devices": [{"chains": [{"number": 16}]}]})", "/devices/0/chains/0/number",
       "from 0 to 15"},
      {R"({"devices": [{"chains": [{}, {"number": 0}]}]})", "/devices/0/chains/1/number",
       "user chain 0 is described twice"},
      {R"({"devices": [{"chains": [{"cores": [{"index": 1}, {}]}]}]})",
       "/devices/0/chains/0/cores/1", "core 1 is described twice"},
      {withCore(R"({"async_inputs": "many"})"), core + "/async_inputs",
       "expected a number, found string"},
      {withCore(R"({"async_inputs": 70000})"), core + "/async_inputs", "from 0 to 65535"},
      {withCore(R"({"major_version": 5, "sync_outputs": 256})"), core + "/sync_outputs",
       "does not fit the status word of version 5.0 (at most 255)"},
      {withCore(R"({"major_version": 9, "qx_version": {"major": 1}})"), core + "/qx_version",
       "needs core version 10.0"},
      {withCore(R"({"clock": {"cycles_per_sequence": 1.5}})"), core + "/clock/cycles_per_sequence",
       "expected a number from 0 to 4294967295, found 1.5"},
      {withCore(R"({"async_inputs": 18446744073709551616})"), core + "/async_inputs",
       "from 0 to 65535, found 1.8446744073709552e+19"},
      // Nesting: 32 levels are read, 33 are not; a long value is echoed only in part.
      {R"({"devices": [], "name": )" + std::string(32, '[') + std::string(32, ']') + "}", "/name",
       "expected a text, found array"},
      {R"({"devices": [], "name": )" + std::string(33, '[') + std::string(33, ']') + "}", "",
       "nested deeper than 32 levels"},
      {withCore(R"({"wiring": [{"input": )" + std::string(70000, '[') + std::string(70000, ']') +
                "}]}"),
       "", "nested deeper than 32 levels"},
      {withCore(R"({"wiring": [{"input": ")" + std::string(40000, 'x') + "\"}]}"),
       core + "/wiring/0/input", "found \"xxxxxxxx"},
      {withCore(R"({"wiring": [{"source": {"kind": "constant"}}]})"), core + "/wiring/0/input",
       "missing; expected \"async\" or \"sync\""},
      {withCore(
           R"({"async_inputs": 2, "wiring": [{"input": "async", "first": 1, "count": 2, "source": {"kind": "constant"}}]})"),
       core + "/wiring/0/count", "input bits 1 to 2 are not all below async_inputs (2)"},
      {withCore(R"({"async_inputs": 2, "wiring": [{"input": "async"}]})"),
       core + "/wiring/0/source", "missing"},
      {withCore(
           R"({"async_inputs": 2, "wiring": [{"input": "async", "source": {"kind": "noise"}}]})"),
       core + "/wiring/0/source/kind",
       "expected \"constant\" or \"loopback\" or \"counter\" or \"square\", found \"noise\""},
      {withCore(
           R"({"async_inputs": 2, "wiring": [{"input": "async", "source": {"kind": "constant", "value": 2}}]})"),
       core + "/wiring/0/source/value", "from 0 to 1"},
      {withCore(
           R"({"async_inputs": 2, "async_outputs": 1, "wiring": [{"input": "async", "count": 2, "source": {"kind": "loopback", "output": "async"}}]})"),
       core + "/wiring/0/source/bit", "output bits 0 to 1 are not all below async_outputs (1)"},
      {withCore(
           R"({"sync_inputs": 2, "wiring": [{"input": "sync", "count": 2, "source": {"kind": "counter", "bit": 62}}]})"),
       core + "/wiring/0/source/bit", "counter bits 62 to 63"},
      {withCore(
           R"({"sync_inputs": 2, "wiring": [{"input": "sync", "source": {"kind": "square"}}]})"),
       core + "/wiring/0/source/period", "missing"},
      {withCore(
           R"({"sync_inputs": 2, "wiring": [{"input": "sync", "source": {"kind": "square", "period": 1}}]})"),
       core + "/wiring/0/source/period", "at least 2"},
      {withCore(
           R"({"sync_inputs": 2, "wiring": [{"input": "sync", "source": {"kind": "counter", "period": 1}}]})"),
       core + "/wiring/0/source/period", "unknown key"},
      {withCore(R"({"type": 3, "async_inputs": 1})"), core + "/type",
       "only MOX cores (type 9) have ports"},
      {withCore(R"({"type": 3, "status": "XYZ"})"), core + "/status", "hexadecimal digits"},
      {withCore(R"({"status": "01"})"), core + "/status", "built from its widths"},
  };
  for (const Case& c : cases) {
    const auto e = errorOf([&] { ZinSim::parseDescription(c.json); });
    ASSERT_TRUE(e) << "accepted " << c.json;
    EXPECT_EQ(e->pointer(), c.pointer) << e->what();
    EXPECT_NE(e->problem().find(c.problem), std::string::npos) << e->what();
    const std::string shown = c.pointer.empty() ? "(description)" : c.pointer;
    EXPECT_EQ(std::string(e->what()).rfind(shown + ": ", 0), 0u) << e->what();
    EXPECT_LT(e->problem().size(), 200u);
  }
}

TEST(Description, FilesAndDescriptionsBuiltInCode) {
  const std::string path = ::testing::TempDir() + "/zinsim_description.json";
  {
    std::ofstream file(path);
    file << withCore(R"({"async_outputs": 70000})");
  }
  auto e = errorOf([&] { ZinSim::loadDescription(path); });
  ASSERT_TRUE(e);
  EXPECT_EQ(e->pointer(), "/devices/0/chains/0/cores/0/async_outputs");
  EXPECT_NE(std::string(e->what()).find(path), std::string::npos) << e->what();
  EXPECT_TRUE(errorOf([&] { ZinSim::loadDescription(path + ".missing"); }));
  ZinSim::TargetDescription twice;
  twice.cores = {ZinSimTest::moxCore({0, 1, 2}, 1, 1, 1, 1),
                 ZinSimTest::moxCore({0, 1, 2}, 1, 1, 1, 1)};
  e = errorOf([&] { ZinSim::Target target(twice); });
  ASSERT_TRUE(e);
  EXPECT_EQ(e->pointer(), "/cores/1");
  EXPECT_EQ(e->problem(), "device 00 chain 1 core 2 is described twice");
  ZinSim::TargetDescription wide;
  wide.cores = {ZinSimTest::moxCore({0, 0, 16}, 1, 1, 1, 1)};
  EXPECT_THROW(ZinSim::Target{wide}, DescriptionError);
}

TEST(Description, DemoDesignHasEveryLayoutAndAnotherType) {
  const ZinSim::TargetDescription demo = ZinSim::demoDescription();
  ASSERT_EQ(demo.cores.size(), 4u);
  ZinSim::Target target;
  std::vector<ZIN_CORE_REF> refs;
  target.listCores(refs);
  ASSERT_EQ(refs.size(), 4u);
  std::vector<uint32_t> keys;
  for (const ZIN_CORE_REF& ref : refs) {
    ZIN_CORE_INFO info{};
    std::vector<unsigned char> status(16);
    target.readStatus(ref, info, status.data(), 16, 128);
    keys.push_back(info.coreType == 9 ? (info.coreMajorVersion << 4 | info.coreMinorVersion) : 0);
  }
  EXPECT_EQ(keys, (std::vector<uint32_t>{0xA2, 0x65, 0x51, 0}));
  // The full-layout core counts on sync inputs 8 to 11 and loops its async outputs back.
  const ZIN_CORE_REF full{0, 1, 0};
  target.advance(5);
  EXPECT_EQ(target.syncInputLevels(full).substr(8), "1010");  // 5, least significant bit first
  EXPECT_EQ(target.asyncInputLevels(full), std::string(16, '0'));
}

// Every field of a core is read and written; the demo design and that core come back the same.
TEST(Description, ReadsEveryFieldAndWritesWhatItReads) {
  ZinSim::TargetDescription d = ZinSim::parseDescription(withCore(R"({
      "index": 7, "name": "probe", "manufacturer_id": "0x1A5", "type": 9,
      "major_version": 10, "minor_version": 3, "revision": 4,
      "qx_version": {"major": 2, "minor": 17, "alpha": 1},
      "async_inputs": 5, "sync_inputs": 6, "async_outputs": 3, "sync_outputs": 2,
      "clock": {"cycles_per_sequence": 0},
      "wiring": [{"input": "sync", "first": 4, "count": 2,
                  "source": {"kind": "square", "period": 10, "phase": 3}},
                 {"input": "async", "count": 3, "source": {"kind": "constant", "value": 1}}]})"));
  const ZinSim::TargetDescription demo = ZinSim::demoDescription();
  d.cores.insert(d.cores.begin(), demo.cores.begin(), demo.cores.end());
  std::swap(d.cores.front(), d.cores.back());  // the writer orders the cores by reference
  const std::string text = ZinSim::descriptionToJson(d, -1);
  const ZinSim::TargetDescription again = ZinSim::descriptionFromJson(nlohmann::json::parse(text));
  // Written a second time, the text is the same: nothing was lost or reordered on the way.
  EXPECT_EQ(ZinSim::descriptionToJson(again, -1), text);
  ASSERT_EQ(again.cores.size(), 5u);
  EXPECT_EQ(again.cores[3].status, (std::vector<unsigned char>{0xEE, 0xFF, 0xC0, 0x00}));
  const ZinSim::CoreDescription& c = again.cores[4];  // read, written and read again
  EXPECT_EQ(std::tuple(c.ref.deviceIndex, c.ref.userChainNumber, c.ref.coreIndex),
            std::tuple(1u, 2u, 7u));
  EXPECT_EQ(std::tuple(c.manufacturerId, c.qxMinorVersion, c.syncInputs, c.cyclesPerSequence),
            std::tuple(0x1A5u, 17u, 6u, 0u));
  ASSERT_EQ(c.wiring.size(), 2u);
  EXPECT_EQ(c.wiring[0].source.kind, ZinSim::InputSource::Kind::Square);
  EXPECT_EQ(std::tuple(c.wiring[0].source.phase, c.wiring[1].count), std::tuple(3u, 3u));
}

}  // namespace
