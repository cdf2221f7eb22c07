// Writing named outputs from a value map: fitting of hexadecimal texts, pulse trains, key
// suffixes, the check pass, and what reaches the transport.
#include <cstdio>
#include <string>
#include <vector>

#include "ZinRT/ZinJtag.h"
#include "support/SessionFixture.h"
#include "support/WireFormat.h"

namespace {

using namespace ZinTest;
using ZinRT::ZinMOX_ValueMap;

constexpr uint32_t kAsyncOut = 32, kSyncOut = 16;

class WriteValues : public SessionFixture {
 protected:
  void SetUp() override {
    SessionFixture::SetUp();
    initMoxCore(ref, 0, 0, kAsyncOut, kSyncOut);
    for (uint32_t i = 0; i < 16; ++i) w16.push_back(8 + i);
    for (uint32_t i = 0; i < 8; ++i) w8.push_back(i);
    for (uint32_t i = 0; i < 12; ++i) p12.push_back(15 - i);
    defineBus("w16", ZINMOX_ASYNC_OUTPUT, w16);
    defineBus("w8", ZINMOX_ASYNC_OUTPUT, w8);
    defineBus("s1", ZINMOX_SYNC_OUTPUT, s1);
    defineBus("p3", ZINMOX_SYNC_OUTPUT, p3);
    defineBus("p12", ZINMOX_SYNC_OUTPUT, p12);
    transport->clearLog();
  }

  void defineBus(const char* name, uint32_t type, std::vector<uint32_t> bits) {
    ASSERT_EQ(
        ZinMOX_defineBus(handle, &ref, name, type, bits.data(), static_cast<uint32_t>(bits.size())),
        0u);
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
    auto sent = transport->transfers();
    if (sent.size() != before + 1) {
      ADD_FAILURE() << "expected one transfer, got " << sent.size() - before;
      return WriteImage::zeros(kAsyncOut, kSyncOut);
    }
    return decodeWriteCommand(sent.back().text, linePrefix(ref), kAsyncOut, kSyncOut);
  }

  // Writes `map`, expects the failure `text` and that nothing was sent.
  void writeFails(const ZinMOX_ValueMap& map, const std::string& text) {
    const std::size_t before = transport->transfers().size();
    EXPECT_EQ(write(map), kFailure);
    expectOnlyError(text);
    EXPECT_EQ(transport->transfers().size(), before) << "a failing write sends nothing";
  }

  static uint64_t asyncValue(const WriteImage& image, const std::vector<uint32_t>& positions) {
    uint64_t value = 0;
    for (std::size_t i = 0; i < positions.size(); ++i) {
      if (image.asyncValues[positions[i]] == '1') value |= uint64_t{1} << i;
    }
    return value;
  }

  // Only the given ports carry an update mark.
  static std::string marks(uint32_t width, const std::vector<uint32_t>& positions) {
    std::string result(width, '0');
    for (uint32_t p : positions) result[p] = '1';
    return result;
  }

  std::vector<uint32_t> w16, w8, p12;
  std::vector<uint32_t> s1{0}, p3{1, 2, 3};
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
    WriteImage image = writeOk({{c.signal, c.text}});
    const std::vector<uint32_t>& positions = std::string(c.signal) == "w16" ? w16 : w8;
    EXPECT_EQ(asyncValue(image, positions), c.value);
    EXPECT_EQ(image.asyncUpdate, marks(kAsyncOut, positions));
    EXPECT_EQ(image.syncUpdate, std::string(kSyncOut, '0'));
  }
  writeFails({{"w16", "0x12"}}, "Invalid Hex String: 0x12");
  writeFails({{"w16", "z5"}}, "Invalid Hex String: z");
  writeFails({{"w16", "12G4"}}, "Invalid Hex String: 12G4");
  writeFails({{"w16", ""}}, "Invalid Hex String: ");
  writeFails({{"p3", "zz"}}, "Invalid Hex String: zz");
}

TEST_F(WriteValues, PlainValuesOfSynchronousOutputsHoldOnAllSteps) {
  WriteImage image = writeOk({{"p3", "5"}});
  EXPECT_EQ(image.steps[1], std::string(16, '1'));
  EXPECT_EQ(image.steps[2], std::string(16, '0'));
  EXPECT_EQ(image.steps[3], std::string(16, '1'));
  EXPECT_EQ(image.syncUpdate, marks(kSyncOut, p3));
  EXPECT_EQ(image.asyncUpdate, std::string(kAsyncOut, '0'));
}

TEST_F(WriteValues, PulseTrainsPutStepZeroInTheLeastSignificantBlock) {
  // 12 bits take two bytes (four digits) per step; the text holds 32 blocks, of which the 16 at
  // the right end (step 0 rightmost) are used. Spare bits of each block are set and ignored.
  std::vector<uint32_t> stepValues;
  std::string text;
  for (int t = 31; t >= 0; --t) {
    char block[8];
    if (t >= 16) {
      std::snprintf(block, sizeof block, "%04X", 0xABCDu);
    } else {
      std::snprintf(block, sizeof block, "%04X",
                    (static_cast<unsigned>(t) << 12) | ((t * 0x123u + 0x5Au) & 0xFFFu));
    }
    text += block;
  }
  for (uint32_t t = 0; t < 16; ++t) stepValues.push_back((t * 0x123u + 0x5Au) & 0xFFFu);
  WriteImage image = writeOk({{"p12.pulsetrain", text}, {"w16", "1234"}});
  for (uint32_t i = 0; i < 12; ++i) {
    std::string expected;
    for (uint32_t t = 0; t < 16; ++t) expected.push_back(((stepValues[t] >> i) & 1) ? '1' : '0');
    EXPECT_EQ(image.steps[p12[i]], expected) << "value bit " << i << " on port bit " << p12[i];
  }
  EXPECT_EQ(image.syncUpdate, marks(kSyncOut, p12));
  EXPECT_EQ(asyncValue(image, w16), 0x1234u) << "all entries go out in the same transfer";
  EXPECT_EQ(image.asyncUpdate, marks(kAsyncOut, w16));

  // Short texts are fitted (sign-extended) to the whole train.
  image = writeOk({{"s1.pulsetrain", "1"}});
  EXPECT_EQ(image.steps[0], "1000000000000000");
  image = writeOk({{"s1.pulsetrain", "8"}});
  EXPECT_EQ(image.steps[0], "0111111111111111");
  image = writeOk({{"p3.pulsetrain", "0705"}});
  EXPECT_EQ(image.steps[1], "1100000000000000");
  EXPECT_EQ(image.steps[2], "0100000000000000");
  EXPECT_EQ(image.steps[3], "1100000000000000");
}

TEST_F(WriteValues, OnlyTheExactPulsetrainSuffixAsksForAPulseTrain) {
  const std::string plainOne(16, '1'), trainOne = "1000000000000000";
  EXPECT_EQ(writeOk({{"s1", "1"}}).steps[0], plainOne);
  EXPECT_EQ(writeOk({{"s1.value", "0"}}).steps[0], std::string(16, '0'));
  EXPECT_EQ(writeOk({{"s1.anything", "1"}}).steps[0], plainOne);
  EXPECT_EQ(writeOk({{"s1.PULSETRAIN", "1"}}).steps[0], plainOne);
  EXPECT_EQ(writeOk({{"s1.b.pulsetrain", "1"}}).steps[0], plainOne);
  EXPECT_EQ(writeOk({{"s1.pulsetrain", "1"}}).steps[0], trainOne);
  EXPECT_EQ(writeOk({{"S1.pulsetrain", "1"}}).steps[0], trainOne) << "names ignore letter case";
  // A plain value on an asynchronous output, whatever the other suffix.
  EXPECT_EQ(asyncValue(writeOk({{"w8.PULSETRAIN", "5A"}}), w8), 0x5Au);
}

TEST_F(WriteValues, ChecksEveryKeyBeforeExaminingAnyValue) {
  // The pulse train on an asynchronous output is refused in the check pass, even though the
  // other entry's text is bad.
  writeFails({{"w8.pulsetrain", "1"}, {"p3", "zz"}},
             ".pulsetrain cannot be used with the non-synchronous output: w8");
  writeFails({{"w16", "zz"}, {"nope.pulsetrain", "1"}},
             "Could not find a signal with the name: nope");
  writeFails({{"a.b", "1"}}, "Could not find a signal with the name: a");
}

TEST_F(WriteValues, TwoEntriesForOneSignalAreWrittenInMapOrder) {
  for (ZinMOX_ValueMap map : {ZinMOX_ValueMap{{"s1", "0"}, {"s1.pulsetrain", "1"}},
                              ZinMOX_ValueMap{{"s1", "1"}, {"S1.value", "0"}}}) {
    // The later entry in the map's own order is the one whose bits are sent.
    std::string expected;
    for (const auto& [key, text] : map) {
      expected = key == "s1.pulsetrain" ? "1000000000000000" : std::string(16, text[0]);
    }
    uintptr_t word = mapWord(map);
    ASSERT_EQ(ZinMOX_writeValues(handle, &ref, &word), 0u);
    auto sent = transport->transfers();
    ASSERT_FALSE(sent.empty());
    WriteImage image = decodeWriteCommand(sent.back().text, linePrefix(ref), kAsyncOut, kSyncOut);
    EXPECT_EQ(image.steps[0], expected);
    EXPECT_EQ(image.syncUpdate, marks(kSyncOut, s1));
  }
  expectNoMessages();
}

TEST_F(WriteValues, EmptyMapSendsTheImageWithNothingMarked) {
  writeOk({{"w8", "C3"}});
  WriteImage image = writeOk({});
  EXPECT_EQ(asyncValue(image, w8), 0xC3u) << "the output image persists between writes";
  EXPECT_EQ(image.asyncUpdate, std::string(kAsyncOut, '0'));
  EXPECT_EQ(image.syncUpdate, std::string(kSyncOut, '0'));
  EXPECT_EQ(transport->flushCount(), 2u);
}

TEST_F(WriteValues, ChecksTheMapArgument) {
  EXPECT_EQ(ZinMOX_writeValues(handle, &ref, nullptr), kFailure);
  expectOnlyError("ZinMOX_writeValues() arg. failed:outputHashMap!=0");
  uintptr_t nullWord = 0;
  EXPECT_EQ(ZinMOX_writeValues(handle, &ref, &nullWord), kFailure);
  expectOnlyError("ZinMOX_writeValues() arg. failed:*outputHashMap!=0");
  EXPECT_TRUE(transport->transfers().empty());
}

class EndToEnd : public SessionFixture {};

TEST_F(EndToEnd, DefineABusWriteItAndDecodeTheWire) {
  ZinTarget::MoxStatus status;
  status.asyncOutputCount = 8;
  status.syncOutputCount = 2;
  transport->placeMoxCore(ref, status);
  ASSERT_EQ(ZinMOX_initCore(handle, &ref), 0u);
  const uint32_t bits[] = {5, 1, 7, 0};
  ASSERT_EQ(ZinMOX_defineBus(handle, &ref, "ctl", ZINMOX_ASYNC_OUTPUT, bits, 4), 0u);
  ZinMOX_ValueMap map{{"ctl", "A"}};
  uintptr_t word = mapWord(map);
  ASSERT_EQ(ZinMOX_writeValues(handle, &ref, &word), 0u);
  // Value bits 1 and 3 of A land on port bits 1 and 0; ports 5, 1, 7, 0 are marked.
  map = {{"sync_out_data", "2"}};
  ASSERT_EQ(ZinMOX_writeValues(handle, &ref, &word), 0u);
  expectNoMessages();
  auto sent = transport->transfers();
  ASSERT_EQ(sent.size(), 2u);
  EXPECT_EQ(sent[0].text, "01 2 0 01 0 00000033 3000000000314\n01 2 0 02 0 00000004 0");
  EXPECT_EQ(sent[1].text, "01 2 0 01 0 00000033 3000003FFFC03\n01 2 0 02 0 00000004 0");
  EXPECT_EQ(sent[0].readBitCount, 0u);
  EXPECT_EQ(transport->flushCount(), 2u);
  EXPECT_FALSE(ZinJtag_session_isLocked(handle));
}

}  // namespace
