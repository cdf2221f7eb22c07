// The core list (ownership, replacement, session close) and status reads and command sequences
// through a session's transport.
#include <gtest/gtest.h>

#include <atomic>
#include <cstring>
#include <memory>
#include <stdexcept>
#include <vector>

#include "ZinMOX/ZinMOX.h"
#include "ZinRT/ZinJtag.h"
#include "ZinRT/Zin_CoreComm.h"
#include "ZinRT/Zin_CoreList.h"
#include "ZinTestKit/ScriptedTransport.h"
#include "ZinTestKit/StatusWord.h"

using ZinRT::Zin_Core;
using ZinRT::Zin_CoreList;
using ZinTestKit::ScriptedTransport;

namespace {

std::atomic<int> destroyed{0};

class CountedCore : public Zin_Core {
 public:
  CountedCore(uint32_t handle, ZIN_CORE_REF ref)
      : Zin_Core(handle, ref, ZIN_CORE_INFO{1, 2, 3, 4, 5}) {}
  ~CountedCore() override { ++destroyed; }
};

class CoreListTest : public ::testing::Test {
 protected:
  void SetUp() override {
    transport = std::make_shared<ScriptedTransport>();
    handle = ZinJtag_openSession(transport);
    destroyed = 0;
  }
  void TearDown() override {
    if (handle != 0) ZinJtag_closeSession(handle);
  }
  std::shared_ptr<ScriptedTransport> transport;
  uint32_t handle = 0;
};

}  // namespace

TEST_F(CoreListTest, AddReplaceAndRemoveOwnTheCores) {
  const ZIN_CORE_REF ref{1, 2, 3};
  auto* first = new CountedCore(handle, ref);
  Zin_CoreList::addCore(handle, first);
  EXPECT_EQ(Zin_CoreList::getCore(handle, ref), first);
  EXPECT_EQ(Zin_CoreList::getCore(handle, ZIN_CORE_REF{1, 2, 4}), nullptr);
  EXPECT_EQ(Zin_CoreList::getCore(handle + 1000, ref), nullptr);

  Zin_CoreList::addCore(handle, first);  // again at its own place: kept
  EXPECT_EQ(destroyed, 0);
  auto* second = new CountedCore(handle, ref);
  Zin_CoreList::addCore(handle, second);  // replaces and destroys the first
  EXPECT_EQ(destroyed, 1);
  EXPECT_EQ(Zin_CoreList::getCore(handle, ref), second);
  EXPECT_EQ(Zin_CoreList::coreCount(handle), 1u);
  EXPECT_THROW(Zin_CoreList::addCore(handle, nullptr), std::invalid_argument);

  Zin_Core* removed = second;
  Zin_CoreList::removeCore(handle + 1000, &removed);  // not registered on that session
  EXPECT_EQ(removed, nullptr);
  EXPECT_EQ(destroyed, 1);
  removed = second;
  Zin_CoreList::removeCore(handle, &removed);
  EXPECT_EQ(removed, nullptr);
  EXPECT_EQ(destroyed, 2);
  EXPECT_EQ(Zin_CoreList::getCore(handle, ref), nullptr);
  EXPECT_THROW(Zin_CoreList::removeCore(handle, nullptr), std::invalid_argument);
}

TEST_F(CoreListTest, ClosingASessionDestroysOnlyItsCores) {
  auto other = std::make_shared<ScriptedTransport>();
  const uint32_t otherHandle = ZinJtag_openSession(other);
  Zin_CoreList::addCore(handle, new CountedCore(handle, ZIN_CORE_REF{0, 0, 0}));
  Zin_CoreList::addCore(handle, new CountedCore(handle, ZIN_CORE_REF{0, 0, 1}));
  Zin_CoreList::addCore(otherHandle, new CountedCore(otherHandle, ZIN_CORE_REF{0, 0, 0}));
  EXPECT_EQ(Zin_CoreList::coreCount(handle), 2u);

  ZinJtag_closeSession(handle);
  handle = 0;
  EXPECT_EQ(destroyed, 2);
  EXPECT_EQ(Zin_CoreList::coreCount(otherHandle), 1u);
  ZinJtag_closeSession(otherHandle);
  EXPECT_EQ(destroyed, 3);
}

// Status reads through the C entry point, which reports failures as a status instead of
// throwing (the kept bit counts are checked in tests/mox).
TEST_F(CoreListTest, CStatusReadFillsInfoAndReportsFailures) {
  const ZIN_CORE_REF ref{1, 0, 2};
  transport->placeCore(ref, ZIN_CORE_INFO{7, 9, 10, 0, 3}, {0xFF, 0xFF, 0xFF});
  ZIN_CORE_INFO info{};
  unsigned char bytes[2] = {0xAA, 0xAA};
  EXPECT_EQ(ZinCore_getCoreStatus(handle, ref, &info, bytes, 10), 0u);
  EXPECT_EQ(bytes[0], 0xFF);
  EXPECT_EQ(bytes[1], 0x03);
  EXPECT_EQ(info.manufacturerId, 7u);
  EXPECT_EQ(info.coreRevision, 3u);
  transport->failNextStatusRead(ScriptedTransport::Failure::NonStandard);
  EXPECT_EQ(ZinCore_getCoreStatus(handle, ref, &info, nullptr, 0), 0x80000000u);
  EXPECT_EQ(info.coreType, 0u);
  EXPECT_EQ(ZinCore_getCoreStatus(handle + 1000, ref, &info, nullptr, 0), 0x80000000u);
}

// The target kit's status words (the scripted and the simulated targets answer them) decode to
// what they were built from in each layout, and counts that a layout cannot hold are refused.
TEST_F(CoreListTest, StatusWordsOfEveryLayoutDecodeToTheirFields) {
  struct Case {
    uint32_t major, minor, ai, si, ao, so, qxMajor, qxMinor;
  };
  const Case cases[] = {{6, 1, 255, 1, 0x80, 7, 0, 0},          // key 0x61: eight-bit counts
                        {5, 18, 3, 4, 5, 6, 0, 0},              // key 0x52 (an OR, not a sum)
                        {9, 15, 0xFFFF, 0x1234, 1, 300, 0, 0},  // sixteen-bit counts
                        {10, 0, 3, 0xFFFF, 0x8001, 12, 0xF, 0xA5}};
  ZIN_CORE_REF ref{1, 2, 0};
  for (const Case& c : cases) {
    ZinTestKit::MoxStatus s;
    s.majorVersion = c.major;
    s.minorVersion = c.minor;
    s.asyncInputCount = c.ai;
    s.syncInputCount = c.si;
    s.asyncOutputCount = c.ao;
    s.syncOutputCount = c.so;
    s.qxMajorVersion = c.qxMajor;
    s.qxMinorVersion = c.qxMinor;
    transport->placeMoxCore(ref, s);
    ZINMOX_CORE_INFO info{};
    ASSERT_EQ(ZinMOX_getInfo(handle, &ref, &info), 0u);
    EXPECT_EQ((std::vector<uint32_t>{info.async_input_count, info.sync_input_count,
                                     info.async_output_count, info.sync_output_count,
                                     info.qx_major_version, info.qx_minor_version}),
              (std::vector<uint32_t>{c.ai, c.si, c.ao, c.so, c.qxMajor, c.qxMinor}))
        << c.major << "." << c.minor;
    s.qxMajorVersion = 0x10;  // four bits in the full layout, none in the older ones
    EXPECT_THROW(ZinTestKit::buildMoxStatusWord(s), std::invalid_argument);
    s.qxMajorVersion = 0;
    s.syncInputCount = ZinTestKit::versionKey(s) >= 0x62 ? 0x10000 : 0x100;
    EXPECT_THROW(ZinTestKit::buildMoxStatusWord(s), std::invalid_argument);
  }
}

namespace {
std::vector<uint32_t> progressCalls;
ZIN_PROGRESS_RETURN onProgress(uint32_t done, uint32_t all, uint32_t bits,
                               ZIN_PROGRESS_STATUS status) {
  progressCalls = {done, all, bits, static_cast<uint32_t>(status)};
  return ZIN_PROGRESS_CONTINUE;
}
}  // namespace

TEST_F(CoreListTest, CommandSequenceDeliversReadDataAndFailures) {
  transport->queueReadData({0x12, 0x34, 0x56});
  unsigned char read[2] = {0xEE, 0xEE};
  ZinRT::Zin_CoreComm::commandSequence(handle, "a\nb", read, 16, &onProgress);
  EXPECT_EQ(read[0], 0x12);
  EXPECT_EQ(read[1], 0x34);
  EXPECT_EQ(progressCalls, (std::vector<uint32_t>{2, 2, 16, ZIN_PROGRESS_DONE}));
  ASSERT_EQ(transport->transfers().size(), 1u);
  EXPECT_EQ(transport->transfers()[0].text, "a\nb");
  EXPECT_EQ(transport->transfers()[0].readBitCount, 16u);

  EXPECT_THROW(ZinRT::Zin_CoreComm::commandSequence(handle, "x", nullptr, 8, nullptr),
               std::invalid_argument);
  transport->failNextCommand(ScriptedTransport::Failure::Runtime, "broken");
  EXPECT_THROW(ZinRT::Zin_CoreComm::commandSequence(handle, "y", nullptr, 0, nullptr),
               std::runtime_error);
  EXPECT_EQ(transport->transfers().size(), 1u);
}
