// The hub protocol codec: CRC, request layouts, and how replies are judged.
#include <gtest/gtest.h>

#include <stdexcept>
#include <string>
#include <vector>

#include "ZinHub/Crc16.h"
#include "ZinHub/HubCodec.h"

namespace ZinHub {
namespace {

BitVector bytesMsbFirst(const std::string& text) {
  BitVector bits;
  for (unsigned char c : text) {
    for (int i = 7; i >= 0; --i) bits.push_back(static_cast<uint8_t>((c >> i) & 1));
  }
  return bits;
}

// What a hub returns: capture word, the record, its CRC.
BitVector hubReply(const BitVector& record, unsigned captureWord = 0x015A) {
  BitVector tdo;
  appendNumber(tdo, captureWord, 16);
  tdo.insert(tdo.end(), record.begin(), record.end());
  appendCrc(tdo, crc16(record, 0, record.size()));
  return tdo;
}

BitVector statusRecord() {
  BitVector record;
  appendNumber(record, 0x01020A09A5ULL, 40);  // revision 1, minor 2, major 10, MOX, maker 0xA5
  appendNumber(record, 0x0123456789ULL, 64);
  record.resize(kStatusRecordBits, 1);
  return record;
}

TEST(HubCodec, CrcHasKnownValuesAndZeroResidueAndGuardsRequestsAndReplies) {
  const struct {
    std::string data;
    uint16_t crc;
  } cases[] = {{"", 0xFFFF}, {std::string(1, '\0'), 0xE1F0}, {"A", 0xB915}, {"123456789", 0x29B1}};
  for (const auto& c : cases) {
    BitVector bits = bytesMsbFirst(c.data);
    EXPECT_EQ(crc16(bits, 0, bits.size()), c.crc) << '"' << c.data << '"';
    appendCrc(bits, c.crc);
    EXPECT_EQ(crc16(bits, 0, bits.size()), 0) << '"' << c.data << '"';
  }
  BitVector data;
  appendNumber(data, 0x2D, 7);
  const BitVector stage = stageRequest(3, data);
  ASSERT_EQ(stage.size(), 16U + 7 + 16);
  EXPECT_EQ(readNumber(stage, 0, 16), 0xA531U);  // op 1, core 3, key
  EXPECT_EQ(crc16(stage, 16, 7 + 16), 0);        // the hub's register ends at 0

  const BitVector good = hubReply(statusRecord());
  const StatusRecord record = parseStatusReply(good, "core at 0:1:0");
  const ZIN_CORE_INFO& info = record.info;
  EXPECT_EQ((std::vector<uint32_t>{info.manufacturerId, info.coreType, info.coreMajorVersion,
                                   info.coreMinorVersion, info.coreRevision}),
            (std::vector<uint32_t>{0xA5, 9, 10, 2, 1}));
  EXPECT_EQ(record.status[0], 0xA5);
  EXPECT_EQ(record.status[5], 0x89);  // record bit 40 starts byte 5
  EXPECT_EQ(record.status[15], 0xFF);
  for (size_t bit = 16; bit < good.size(); ++bit) {
    BitVector bad = good;
    bad[bit] ^= 1;
    EXPECT_THROW(parseStatusReply(bad, "core at 0:1:0"), std::runtime_error) << "bit " << bit;
  }
  BitVector hub;
  appendNumber(hub, 0x0301, 32);
  BitVector hubInfo = hubReply(hub);
  ASSERT_EQ(parseInfoReply(hubInfo)->coreCount, 3U);
  hubInfo[40] ^= 1;
  EXPECT_THROW(parseInfoReply(hubInfo), std::runtime_error);
}

TEST(HubCodec, ChainsWithoutHubMeanNoCore) {
  const BitVector zeros(160, 0), ones(160, 1);
  const BitVector wrongVersion = hubReply(statusRecord(), 0x025A);
  for (const BitVector* tdo : {&zeros, &ones, &wrongVersion}) {
    EXPECT_FALSE(parseCaptureWord(*tdo).hub);
    EXPECT_EQ(parseStatusReply(*tdo, "x").info.coreType, 0U);
    EXPECT_FALSE(parseInfoReply(*tdo).has_value());
  }
  const CaptureWord flags = parseCaptureWord(hubReply({}, 0x315A));
  EXPECT_TRUE(flags.hub && flags.busy && flags.stagedInvalid);
}

TEST(HubCodec, StartBitMustComeWithinWaitBits) {
  const unsigned waitBits = 8;
  for (unsigned delay : {0U, 8U, 9U}) {
    BitVector tdo(16 + delay + 1 + kResultBits, 0);
    tdo[16 + delay] = 1;
    tdo[16 + delay + 1] = 1;  // done
    if (delay <= waitBits) {
      EXPECT_EQ(parseResultReply(tdo, waitBits, "core at 0:1:2"), 1U);
    } else {
      try {
        parseResultReply(tdo, waitBits, "core at 0:1:2");
        ADD_FAILURE() << "a late start bit was accepted";
      } catch (const std::runtime_error& e) {
        EXPECT_STREQ(e.what(), "core at 0:1:2 did not answer within 8 TCK cycles");
      }
    }
  }
}

TEST(HubCodec, CaptureReplyBecomesLittleEndianBytes) {
  const size_t n = 10;
  BitVector captured;
  appendNumber(captured, 0x2B7, n);
  BitVector tdo(16 + 3, 0);
  tdo.push_back(1);  // start bit after three wait bits
  tdo.insert(tdo.end(), captured.begin(), captured.end());
  appendCrc(tdo, crc16(captured, 0, n));
  tdo.resize(tdo.size() + 20, 0);  // the hub shifts zeros after its reply
  unsigned char out[4] = {};
  parseCaptureReply(tdo, 64, n, "core at 0:1:0", out);
  EXPECT_EQ(out[0], 0xB7);
  EXPECT_EQ(out[1], 0x02);  // the CRC does not leak into the 16 bits above N
  EXPECT_EQ(out[2], 0x00);
  tdo[20] ^= 1;
  EXPECT_THROW(parseCaptureReply(tdo, 64, n, "core at 0:1:0", out), std::runtime_error);
}

}  // namespace
}  // namespace ZinHub
