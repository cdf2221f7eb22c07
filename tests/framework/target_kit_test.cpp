// The target kit: the MOX status-word builder read with getBits, and the scripted transport.
#include <gtest/gtest.h>

#include <future>
#include <new>
#include <stdexcept>
#include <vector>

#include "ZinRT/Zin_ByteBuffer.h"
#include "ZinTarget/ScriptedTransport.h"
#include "ZinTarget/StatusWord.h"

using ZinRT::Zin_ByteBuffer;
using ZinTarget::MoxStatus;
using ZinTarget::ScriptedTransport;

namespace {

Zin_ByteBuffer wordOf(const MoxStatus& s) {
  const std::vector<unsigned char> bytes = ZinTarget::buildMoxStatusWord(s);
  EXPECT_EQ(bytes.size(), ZinTarget::kStatusWordBytes);
  return Zin_ByteBuffer(bytes.data(), static_cast<uint32_t>(bytes.size()));
}

MoxStatus counts(uint32_t major, uint32_t minor, uint32_t ai, uint32_t si, uint32_t ao,
                 uint32_t so) {
  MoxStatus s;
  s.majorVersion = major;
  s.minorVersion = minor;
  s.asyncInputCount = ai;
  s.syncInputCount = si;
  s.asyncOutputCount = ao;
  s.syncOutputCount = so;
  return s;
}

}  // namespace

TEST(StatusWord, OldestLayoutHoldsEightBitCounts) {
  const MoxStatus s = counts(6, 1, 255, 1, 0x80, 7);  // key 0x61
  EXPECT_EQ(ZinTarget::versionKey(s), 0x61u);
  const Zin_ByteBuffer w = wordOf(s);
  EXPECT_EQ(w.getBits(0, 32), 0u);
  EXPECT_EQ(w.getBits(40, 8), 255u);
  EXPECT_EQ(w.getBits(48, 8), 1u);
  EXPECT_EQ(w.getBits(56, 8), 0x80u);
  EXPECT_EQ(w.getBits(64, 8), 7u);
  EXPECT_EQ(w.getBits(72, 32), 0u);
  EXPECT_THROW(ZinTarget::buildMoxStatusWord(counts(6, 1, 256, 0, 0, 0)), std::invalid_argument);
  MoxStatus withQx = s;
  withQx.qxMajorVersion = 1;
  EXPECT_THROW(ZinTarget::buildMoxStatusWord(withQx), std::invalid_argument);
  // The key is an OR: 5/18 gives 0x52, still the oldest layout.
  EXPECT_EQ(ZinTarget::versionKey(counts(5, 18, 0, 0, 0, 0)), 0x52u);
}

TEST(StatusWord, MiddleLayoutHoldsSixteenBitCounts) {
  for (const auto& [major, minor] : {std::pair{6u, 2u}, std::pair{9u, 15u}}) {
    const Zin_ByteBuffer w = wordOf(counts(major, minor, 0xFFFF, 0x1234, 1, 300));
    EXPECT_EQ(w.getBits(40, 16), 0xFFFFu);
    EXPECT_EQ(w.getBits(56, 16), 0x1234u);
    EXPECT_EQ(w.getBits(72, 16), 1u);
    EXPECT_EQ(w.getBits(88, 16), 300u);
    EXPECT_EQ(w.getBits(104, 24), 0u);
  }
  EXPECT_THROW(ZinTarget::buildMoxStatusWord(counts(6, 2, 0, 0x10000, 0, 0)),
               std::invalid_argument);
}

TEST(StatusWord, FullLayoutHoldsQxVersionAndCounts) {
  MoxStatus s = counts(10, 0, 3, 0xFFFF, 0x8001, 12);
  s.qxMajorVersion = 0xF;
  s.qxMinorVersion = 0xA5;
  s.qxMinorVersionAlpha = 0x3C;
  const Zin_ByteBuffer w = wordOf(s);
  EXPECT_EQ(w.getBits(0, 32), 0u);
  EXPECT_EQ(w.getBits(32, 8), 0u);
  EXPECT_EQ(w.getBits(40, 4), 0xFu);
  EXPECT_EQ(w.getBits(44, 8), 0xA5u);
  EXPECT_EQ(w.getBits(52, 8), 0x3Cu);
  EXPECT_EQ(w.getBits(60, 16), 3u);
  EXPECT_EQ(w.getBits(76, 16), 0xFFFFu);
  EXPECT_EQ(w.getBits(92, 16), 0x8001u);
  EXPECT_EQ(w.getBits(108, 16), 12u);
  EXPECT_EQ(w.getBits(124, 4), 0u);
  s.qxMajorVersion = 0x10;
  EXPECT_THROW(ZinTarget::buildMoxStatusWord(s), std::invalid_argument);
}

TEST(ScriptedTransport, AnswersStatusReadsOfPlacedCores) {
  ScriptedTransport t;
  const ZIN_CORE_REF mox{2, 1, 0};
  const ZIN_CORE_REF plain{0, 3, 1};
  t.placeMoxCore(mox, counts(10, 0, 1, 2, 3, 4), 0x42, 5);
  t.placeCore(plain, ZIN_CORE_INFO{1, 3, 1, 0, 0}, {0xFF, 0xFF});

  ZIN_CORE_INFO info{};
  std::vector<unsigned char> status(16, 0);
  t.readStatus(mox, info, status.data(), 16, 128);
  EXPECT_EQ(info.manufacturerId, 0x42u);
  EXPECT_EQ(info.coreType, 9u);
  EXPECT_EQ(info.coreMajorVersion, 10u);
  EXPECT_EQ(info.coreRevision, 5u);
  EXPECT_EQ(status, ZinTarget::buildMoxStatusWord(counts(10, 0, 1, 2, 3, 4)));

  std::vector<unsigned char> few(4, 0);
  t.readStatus(plain, info, few.data(), 4, 12);  // only the asked bits arrive
  EXPECT_EQ(few, (std::vector<unsigned char>{0xFF, 0x0F, 0, 0}));

  ZIN_CORE_INFO none{};
  std::vector<unsigned char> zeros(4, 0);
  t.readStatus(ZIN_CORE_REF{9, 9, 9}, none, zeros.data(), 4, 32);
  EXPECT_EQ(none.coreType, 0u);
  EXPECT_EQ(zeros, std::vector<unsigned char>(4, 0));
  EXPECT_EQ(t.statusReadCount(), 3u);

  std::vector<ZIN_CORE_REF> refs;
  EXPECT_TRUE(t.listCores(refs));
  ASSERT_EQ(refs.size(), 2u);
  EXPECT_EQ(refs[0].userChainNumber, 3u);
  EXPECT_EQ(refs[1].deviceIndex, 2u);
  t.removeCore(plain);
  refs.clear();
  t.listCores(refs);
  EXPECT_EQ(refs.size(), 1u);
}

TEST(ScriptedTransport, RecordsTransfersAnswersQueuedReadsAndFails) {
  ScriptedTransport t;
  t.queueReadData({1, 2, 3});
  t.queueReadData({9});
  t.commandSequence("write", nullptr, 0);  // a write does not take queued data
  unsigned char read[2] = {0, 0};
  t.commandSequence("read", read, 12);
  EXPECT_EQ(read[0], 1);
  EXPECT_EQ(read[1], 2);
  unsigned char next[2] = {0, 0};
  t.commandSequence("read again", next, 16);
  EXPECT_EQ(next[0], 9);
  EXPECT_EQ(next[1], 0);
  t.flush();
  ASSERT_EQ(t.transfers().size(), 3u);
  EXPECT_EQ(t.transfers()[1].text, "read");
  EXPECT_EQ(t.transfers()[1].readBitCount, 12u);
  EXPECT_EQ(t.flushCount(), 1u);

  t.failNextCommand(ScriptedTransport::Failure::LogicError, "logic");
  EXPECT_THROW(t.commandSequence("x", nullptr, 0), std::logic_error);
  t.failNextCommand(ScriptedTransport::Failure::BadAlloc);
  EXPECT_THROW(t.commandSequence("x", nullptr, 0), std::bad_alloc);
  t.failNextCommand(ScriptedTransport::Failure::NonStandard);
  EXPECT_THROW(t.commandSequence("x", nullptr, 0), int);
  t.failNextStatusRead(ScriptedTransport::Failure::Runtime, "status");
  ZIN_CORE_INFO info{};
  EXPECT_THROW(t.readStatus(ZIN_CORE_REF{}, info, nullptr, 0, 0), std::runtime_error);
  t.commandSequence("after", nullptr, 0);  // failures are one-shot
  EXPECT_EQ(t.transfers().size(), 4u);
  t.clearLog();
  EXPECT_TRUE(t.transfers().empty());
  EXPECT_EQ(t.flushCount(), 0u);
  EXPECT_EQ(t.statusReadCount(), 0u);
}

TEST(ScriptedTransport, BlockedCommandWaitsForRelease) {
  ScriptedTransport t;
  EXPECT_FALSE(t.waitUntilBlocked(10));
  t.blockNextCommand();
  auto sender = std::async(std::launch::async, [&t] { t.commandSequence("held", nullptr, 0); });
  ASSERT_TRUE(t.waitUntilBlocked(10000));
  EXPECT_TRUE(t.transfers().empty());
  t.release();
  sender.get();
  ASSERT_EQ(t.transfers().size(), 1u);
  t.commandSequence("free", nullptr, 0);  // only the next command was blocked
  EXPECT_EQ(t.transfers().size(), 2u);
}
