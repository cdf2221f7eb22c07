// The core list (ownership, replacement, session close) and status reads and command sequences
// through a session's transport. The status word layouts are decoded in tests/mox.
#include <atomic>
#include <memory>
#include <stdexcept>
#include <vector>

#include "ZinRT/ZinJtag.h"
#include "ZinRT/Zin_CoreComm.h"
#include "ZinRT/Zin_CoreList.h"
#include "support/SessionFixture.h"

using ZinRT::Zin_Core;
using ZinRT::Zin_CoreList;
using ZinTestKit::ScriptedTransport;

namespace {

std::atomic<int> destroyed{0};
std::vector<uint32_t> progressCalls;

ZIN_PROGRESS_RETURN onProgress(uint32_t done, uint32_t all, uint32_t bits,
                               ZIN_PROGRESS_STATUS status) {
  progressCalls = {done, all, bits, static_cast<uint32_t>(status)};
  return ZIN_PROGRESS_CONTINUE;
}

class CountedCore : public Zin_Core {
 public:
  CountedCore(uint32_t handle, ZIN_CORE_REF ref)
      : Zin_Core(handle, ref, ZIN_CORE_INFO{1, 2, 3, 4, 5}) {}
  ~CountedCore() override { ++destroyed; }
};

class CoreListTest : public ZinTest::SessionFixture {
 protected:
  void SetUp() override {
    SessionFixture::SetUp();
    destroyed = 0;
  }
};

}  // namespace

TEST_F(CoreListTest, AddReplaceRemoveAndSessionCloseOwnTheCores) {
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

  // Closing a session destroys its cores and no other session's.
  const uint32_t otherHandle = ZinJtag_openSession(std::make_shared<ScriptedTransport>());
  Zin_CoreList::addCore(handle, new CountedCore(handle, ZIN_CORE_REF{0, 0, 0}));
  Zin_CoreList::addCore(handle, new CountedCore(handle, ZIN_CORE_REF{0, 0, 1}));
  Zin_CoreList::addCore(otherHandle, new CountedCore(otherHandle, ZIN_CORE_REF{0, 0, 0}));
  EXPECT_EQ(Zin_CoreList::coreCount(handle), 2u);
  ZinJtag_closeSession(handle);
  handle = 0;
  EXPECT_EQ(destroyed, 4);
  EXPECT_EQ(Zin_CoreList::coreCount(otherHandle), 1u);
  ZinJtag_closeSession(otherHandle);
  EXPECT_EQ(destroyed, 5);
}

// Status reads through the C entry point, which reports failures as a status instead of throwing
// (the kept bit counts are checked in tests/mox), and command sequences.
TEST_F(CoreListTest, StatusReadsAndCommandSequencesDeliverDataAndFailures) {
  const ZIN_CORE_REF ref{1, 0, 2};
  transport->placeCore(ref, ZIN_CORE_INFO{7, 9, 10, 0, 3}, {0xFF, 0xFF, 0xFF});
  ZIN_CORE_INFO info{};
  unsigned char bytes[2] = {0xAA, 0xAA};
  EXPECT_EQ(ZinCore_getCoreStatus(handle, ref, &info, bytes, 10), 0u);
  EXPECT_EQ((std::vector<unsigned>{bytes[0], bytes[1], info.manufacturerId, info.coreRevision}),
            (std::vector<unsigned>{0xFF, 0x03, 7, 3}));
  transport->failNextStatusRead(ScriptedTransport::Failure::NonStandard);
  EXPECT_EQ(ZinCore_getCoreStatus(handle, ref, &info, nullptr, 0), 0x80000000u);
  EXPECT_EQ(info.coreType, 0u);
  EXPECT_EQ(ZinCore_getCoreStatus(handle + 1000, ref, &info, nullptr, 0), 0x80000000u);

  transport->queueReadData({0x12, 0x34, 0x56});
  unsigned char read[2] = {0xEE, 0xEE};
  ZinRT::Zin_CoreComm::commandSequence(handle, "a\nb", read, 16, &onProgress);
  EXPECT_EQ((std::vector<unsigned>{read[0], read[1]}), (std::vector<unsigned>{0x12, 0x34}));
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
