// Named values through value maps: fitting of hexadecimal texts, pulse trains and key suffixes on
// writes, the check pass before anything is staged, and every input under its suffixed keys on
// reads.
#include <cstdio>
#include <random>
#include <string>
#include <vector>

#include "ZinRT/ZinJtag.h"
#include "support/SessionFixture.h"

namespace {

using namespace ZinTest;
using ZinRT::ZinMOX_ValueMap;

constexpr uint32_t kAsyncOut = 32, kSyncOut = 16;

std::vector<uint32_t> range(uint32_t first, uint32_t n, int stride = 1) {
  std::vector<uint32_t> positions;
  for (uint32_t i = 0; i < n; ++i) positions.push_back(first + stride * static_cast<int>(i));
  return positions;
}

class WriteValues : public SessionFixture {
 protected:
  void SetUp() override {
    SessionFixture::SetUp();
    initMoxCore(ref, 0, 0, kAsyncOut, kSyncOut);
    ASSERT_EQ(defineBus("w16", ZINMOX_ASYNC_OUTPUT, w16), 0u);
    ASSERT_EQ(defineBus("w8", ZINMOX_ASYNC_OUTPUT, w8), 0u);
    ASSERT_EQ(defineBus("s1", ZINMOX_SYNC_OUTPUT, {0}), 0u);
    ASSERT_EQ(defineBus("p3", ZINMOX_SYNC_OUTPUT, p3), 0u);
    ASSERT_EQ(defineBus("p12", ZINMOX_SYNC_OUTPUT, p12), 0u);
    transport->clearLog();
  }
  uint32_t write(ZinMOX_ValueMap map) {
    uintptr_t word = mapWord(map);
    return ZinMOX_writeValues(handle, &ref, &word);
  }
  // Writes `map`, expects success and exactly one new transfer, and decodes it.
  WriteImage writeOk(const ZinMOX_ValueMap& map) {
    const std::size_t before = transport->transfers().size();
    EXPECT_EQ(write(map), 0u);
    expectNoMessages();
    EXPECT_EQ(transport->transfers().size(), before + 1);
    return lastWrite(kAsyncOut, kSyncOut);
  }
  // Writes `map`, expects the failure `text` and that nothing was sent.
  void writeFails(const ZinMOX_ValueMap& map, const std::string& text) {
    const std::size_t before = transport->transfers().size();
    EXPECT_EQ(errorOf(write(map)), text);
    EXPECT_EQ(transport->transfers().size(), before) << "a failing write sends nothing";
  }
  static uint64_t valueAt(const WriteImage& image, const std::vector<uint32_t>& positions) {
    uint64_t value = 0;
    for (std::size_t i = 0; i < positions.size(); ++i) {
      if (image.asyncValues[positions[i]] == '1') value |= uint64_t{1} << i;
    }
    return value;
  }
  static std::string marks(uint32_t width, const std::vector<uint32_t>& positions) {
    std::string result(width, '0');
    for (uint32_t p : positions) result[p] = '1';
    return result;
  }

  const std::vector<uint32_t> w16 = range(8, 16), w8 = range(0, 8), p3 = range(1, 3),
                              p12 = range(15, 12, -1);
};

TEST_F(WriteValues, FitsTextsToTheSignalWidth) {
  struct Case {
    const char* signal;
    const char* text;
    uint64_t value;
  };
  const std::vector<Case> fitted = {
      {"w16", "8", 0xFFF8},     // sign extension from a digit with bit 3 set
      {"w16", "7", 0x0007},     //
      {"w16", "08", 0x0008},    // a leading 0 keeps the value positive
      {"w16", "abCd", 0xABCD},  // either letter case
      {"w8", "12345", 0x45},    // the last two digits are kept
      {"w8", "0x12", 0x12},     // the prefix is among the dropped characters
      {"w8", "zz05", 0x05},     // dropped characters are not examined
      {"w8", "F", 0xFF},        //
  };
  for (const Case& c : fitted) {
    SCOPED_TRACE(std::string(c.signal) + " = " + c.text);
    const WriteImage image = writeOk({{c.signal, c.text}});
    const std::vector<uint32_t>& positions = std::string(c.signal) == "w16" ? w16 : w8;
    EXPECT_EQ(valueAt(image, positions), c.value);
    EXPECT_EQ(image.asyncUpdate, marks(kAsyncOut, positions));
    EXPECT_EQ(image.syncUpdate, std::string(kSyncOut, '0'));
  }
  for (const char* bad : {"0x12", "12G4", ""}) {
    writeFails({{"w16", bad}}, std::string("Invalid Hex String: ") + bad);
  }
  writeFails({{"w16", "z5"}}, "Invalid Hex String: z");
  writeFails({{"p3", "zz"}}, "Invalid Hex String: zz");
}

TEST_F(WriteValues, SynchronousOutputsHoldPlainValuesAndFollowPulseTrains) {
  WriteImage image = writeOk({{"p3", "5"}});
  EXPECT_EQ(image.steps[1], std::string(16, '1'));
  EXPECT_EQ(image.steps[2], std::string(16, '0'));
  EXPECT_EQ(image.steps[3], std::string(16, '1'));
  EXPECT_EQ(image.syncUpdate, marks(kSyncOut, p3));
  EXPECT_EQ(image.asyncUpdate, std::string(kAsyncOut, '0'));
  image = writeOk({{"sync_out_data", "A5C3"}});  // a run of two bytes
  for (uint32_t i = 0; i < kSyncOut; ++i) {
    EXPECT_EQ(image.steps[i], std::string(16, ((0xA5C3u >> i) & 1u) != 0 ? '1' : '0')) << i;
  }

  // 12 bits take four digits per step; of the 32 blocks of the text the 16 at the right end
  // (step 0 rightmost) are used. Spare bits of each block are set and ignored.
  const auto stepValue = [](uint32_t t) { return (t * 0x123u + 0x5Au) & 0xFFFu; };
  std::string text;
  for (uint32_t t = 32; t-- > 0;) {
    char block[8];
    std::snprintf(block, sizeof block, "%04X", t >= 16 ? 0xABCDu : (t << 12) | stepValue(t));
    text += block;
  }
  image = writeOk({{"p12.pulsetrain", text}, {"w16", "1234"}});
  for (uint32_t i = 0; i < 12; ++i) {
    std::string expected;
    for (uint32_t t = 0; t < 16; ++t) expected.push_back(((stepValue(t) >> i) & 1) ? '1' : '0');
    EXPECT_EQ(image.steps[p12[i]], expected) << "value bit " << i << " on port bit " << p12[i];
  }
  EXPECT_EQ(image.syncUpdate, marks(kSyncOut, p12));
  EXPECT_EQ(valueAt(image, w16), 0x1234u) << "all entries go out in the same transfer";
  EXPECT_EQ(image.asyncUpdate, marks(kAsyncOut, w16));

  // Short texts are fitted (sign-extended) to the whole train.
  EXPECT_EQ(writeOk({{"s1.pulsetrain", "1"}}).steps[0], "1000000000000000");
  EXPECT_EQ(writeOk({{"s1.pulsetrain", "8"}}).steps[0], "0111111111111111");
  image = writeOk({{"p3.pulsetrain", "0705"}});
  EXPECT_EQ(image.steps[1], "1100000000000000");
  EXPECT_EQ(image.steps[2], "0100000000000000");
  EXPECT_EQ(image.steps[3], "1100000000000000");
}

TEST_F(WriteValues, OnlyTheExactPulsetrainSuffixAsksForAPulseTrain) {
  const std::string plainOne(16, '1'), trainOne = "1000000000000000";
  for (const char* key : {"s1", "s1.anything", "s1.PULSETRAIN", "s1.b.pulsetrain"})
    EXPECT_EQ(writeOk({{key, "1"}}).steps[0], plainOne) << key;
  for (const char* key : {"s1.pulsetrain", "S1.pulsetrain"})
    EXPECT_EQ(writeOk({{key, "1"}}).steps[0], trainOne) << key;
  EXPECT_EQ(writeOk({{"s1.value", "0"}}).steps[0], std::string(16, '0'));
  EXPECT_EQ(valueAt(writeOk({{"w8.PULSETRAIN", "5A"}}), w8), 0x5Au) << "a plain value";

  // Every key is checked before any value is examined.
  writeFails({{"w8.pulsetrain", "1"}, {"p3", "zz"}},
             ".pulsetrain cannot be used with the non-synchronous output: w8");
  writeFails({{"w16", "zz"}, {"nope.pulsetrain", "1"}},
             "Could not find a signal with the name: nope");
  writeFails({{"a.b", "1"}}, "Could not find a signal with the name: a");

  // Two entries for one signal: the later one in the map's own order is sent.
  for (ZinMOX_ValueMap map : {ZinMOX_ValueMap{{"s1", "0"}, {"s1.pulsetrain", "1"}},
                              ZinMOX_ValueMap{{"s1", "1"}, {"S1.value", "0"}}}) {
    std::string expected;
    for (const auto& [key, text] : map) {
      expected = key == "s1.pulsetrain" ? trainOne : std::string(16, text[0]);
    }
    const WriteImage image = writeOk(map);
    EXPECT_EQ(image.steps[0], expected);
    EXPECT_EQ(image.syncUpdate, marks(kSyncOut, {0}));
  }
}

TEST_F(WriteValues, AnEmptyMapSendsTheImageWithNothingMarked) {
  writeOk({{"w8", "C3"}});
  const WriteImage image = writeOk({});
  EXPECT_EQ(valueAt(image, w8), 0xC3u) << "the output image persists between writes";
  EXPECT_EQ(image.asyncUpdate, std::string(kAsyncOut, '0'));
  EXPECT_EQ(image.syncUpdate, std::string(kSyncOut, '0'));
  EXPECT_EQ(transport->flushCount(), 2u);

  const std::string w = "ZinMOX_writeValues() arg. failed:", r = "ZinMOX_readValues() arg. failed:";
  uintptr_t nullWord = 0;
  EXPECT_EQ(errorOf(ZinMOX_writeValues(handle, &ref, nullptr)), w + "outputHashMap!=0");
  EXPECT_EQ(errorOf(ZinMOX_readValues(handle, &ref, nullptr)), r + "inputHashMap!=0");
  EXPECT_EQ(errorOf(ZinMOX_writeValues(handle, &ref, &nullWord)), w + "*outputHashMap!=0");
  EXPECT_EQ(errorOf(ZinMOX_readValues(handle, &ref, &nullWord)), r + "*inputHashMap!=0");
  EXPECT_EQ(transport->transfers().size(), 2u);
}

class ReadValues : public SessionFixture {
 protected:
  uint32_t read(ZinMOX_ValueMap& map) {
    uintptr_t word = mapWord(map);
    return ZinMOX_readValues(handle, &ref, &word);
  }
  // Enters into `expected` the texts of one signal as `image` gives them: the hexadecimal text of
  // the port characters at the positions (value bit i at port bit at[i]) under each key.
  static void report(ZinMOX_ValueMap& expected, const InputImage& image, const std::string& name,
                     bool sync, const std::vector<uint32_t>& at) {
    const char* suffixes[] = {".value", ".activity_up", ".activity_down", ".sync_activity_up",
                              ".sync_activity_down"};
    for (int k = 0; k < (sync ? 5 : 3); ++k) {
      const std::string& port = *image.vectors()[sync * 3 + k];
      std::string bits;
      for (std::size_t i = at.size(); i-- > 0;) bits.push_back(port[at[i]]);
      expected[name + suffixes[k]] = bitsToHex(bits);
    }
    expected[name] = expected[name + ".value"];
  }
};

TEST_F(ReadValues, ReportsEveryInputUnderItsKeysAndKeepsOtherKeys) {
  initMoxCore(ref, 4, 3, 2, 0);
  const std::vector<uint32_t> a{2, 0}, s{1}, ctl{0, 2};
  ASSERT_EQ(defineBus("a", ZINMOX_ASYNC_INPUT, a), 0u);
  ASSERT_EQ(defineBus("s", ZINMOX_SYNC_INPUT, s), 0u);
  ASSERT_EQ(defineBus("Ctl", ZINMOX_SYNC_INPUT, ctl), 0u);
  std::mt19937 rng(31);
  const InputImage image = InputImage::random(4, 3, rng);
  transport->clearLog();
  transport->queueReadData(readDataFor(image));

  ZinMOX_ValueMap map{{"unrelated", "keep"}, {"a.value", "stale"}, {"async_out_data", "7"}};
  ASSERT_EQ(read(map), 0u);
  expectNoMessages();
  ZinMOX_ValueMap expected{{"unrelated", "keep"}, {"async_out_data", "7"}};
  report(expected, image, "a", false, a);
  report(expected, image, "s", true, s);
  report(expected, image, "Ctl", true, ctl);
  report(expected, image, "async_in_data", false, range(0, 4));
  report(expected, image, "sync_in_data", true, range(0, 3));
  EXPECT_EQ(map, expected);
  const auto sent = transport->transfers();
  ASSERT_EQ(sent.size(), 1u) << "one read for all signals";
  EXPECT_EQ(sent[0].text, readCommandText(linePrefix(ref), 4, 3));
}

TEST_F(ReadValues, EachReadReportsTheInputsDefinedThenIntoWhatTheMapHoldsThen) {
  initMoxCore(ref, 4, 2, 0, 0);
  ASSERT_EQ(defineBus("n", ZINMOX_ASYNC_INPUT, {3, 1}), 0u);
  struct Named {
    const char* name;
    bool sync;
    std::vector<uint32_t> at;
  };
  const Named n{"n", false, {3, 1}}, m{"m", true, {1}};
  std::mt19937 rng(5);
  // Reads a random image into `map` and expects exactly `kept` and the reports of the ports and
  // of `named`.
  const auto readExpecting = [&](ZinMOX_ValueMap& map, ZinMOX_ValueMap kept,
                                 const std::vector<Named>& named) {
    const InputImage image = InputImage::random(4, 2, rng);
    transport->queueReadData(readDataFor(image));
    ASSERT_EQ(read(map), 0u);
    report(kept, image, "async_in_data", false, range(0, 4));
    report(kept, image, "sync_in_data", true, range(0, 2));
    for (const Named& signal : named) report(kept, image, signal.name, signal.sync, signal.at);
    EXPECT_EQ(map, kept);
  };
  ZinMOX_ValueMap map;
  readExpecting(map, {}, {n});
  // The caller removes, changes and adds entries, enough to make the map rehash.
  map.erase("n.activity_up");
  map.erase("sync_in_data");
  map["n"] = "stale";
  ZinMOX_ValueMap others;
  for (int i = 0; i < 300; ++i) others["other" + std::to_string(i)] = "x";
  map.insert(others.begin(), others.end());
  readExpecting(map, others, {n});

  ASSERT_EQ(defineBus("m", ZINMOX_SYNC_INPUT, {1}), 0u);
  ZinMOX_ValueMap fresh;
  readExpecting(fresh, {}, {n, m});
  ASSERT_EQ(ZinMOX_undefineName(handle, &ref, "n", ZINMOX_ASYNC_INPUT), 0u);
  fresh.clear();
  readExpecting(fresh, {}, {m});
}

TEST_F(ReadValues, WithoutNamedInputsOrOnAFailedReadTheMapStaysAsItWas) {
  initMoxCore(ref, 3, 0, 0, 0);
  ASSERT_EQ(ZinMOX_undefineName(handle, &ref, "async_in_data", ZINMOX_ASYNC_INPUT), 0u);
  ZinMOX_ValueMap map{{"x", "1"}};
  ASSERT_EQ(read(map), 0u);
  EXPECT_EQ(transport->transfers().size(), 1u) << "the read still happens";
  ASSERT_EQ(ZinMOX_defineSignal(handle, &ref, "in", ZINMOX_ASYNC_INPUT, 2), 0u);
  transport->failNextCommand(ZinTestKit::ScriptedTransport::Failure::Runtime, "cable unplugged");
  EXPECT_EQ(errorOf(read(map)), "cable unplugged");
  EXPECT_EQ(map, (ZinMOX_ValueMap{{"x", "1"}}));
}

}  // namespace
