// Calls from several threads on one core are serialised by the session's target lock: a
// terminate waits for a call that is inside its transfer, and that call completes.
#include <chrono>
#include <future>
#include <thread>

#include "ZinRT/ZinJtag.h"
#include "ZinRT/Zin_CoreList.h"
#include "support/SessionFixture.h"
#include "support/WireFormat.h"

namespace {

using namespace ZinTest;
using namespace std::chrono_literals;

class Concurrency : public SessionFixture {};

TEST_F(Concurrency, TerminateWaitsForACallInsideItsTransfer) {
  initMoxCore(ref, 0, 0, 4, 0);
  transport->blockNextCommand();
  const uint8_t data = 0x09, mask = 0x0F;
  std::future<uint32_t> writer = std::async(std::launch::async, [&] {
    return ZinMOX_setPortBits(handle, &ref, &data, &mask, 4, nullptr, nullptr, 0);
  });
  ASSERT_TRUE(transport->waitUntilBlocked(10000));

  std::future<uint32_t> terminator =
      std::async(std::launch::async, [&] { return ZinMOX_terminateCore(handle, &ref); });
  EXPECT_EQ(terminator.wait_for(300ms), std::future_status::timeout)
      << "terminate must wait for the target lock held by the running call";
  EXPECT_NE(registeredCore(ref), nullptr);

  transport->release();
  EXPECT_EQ(writer.get(), 0u);
  EXPECT_EQ(terminator.get(), 0u);
  EXPECT_EQ(ZinRT::Zin_CoreList::getCore(handle, ref), nullptr);
  expectNoMessages();
  auto sent = transport->transfers();
  ASSERT_EQ(sent.size(), 1u);
  WriteImage image = decodeWriteCommand(sent[0].text, linePrefix(ref), 4, 0);
  EXPECT_EQ(image.asyncValues, "1001");
  EXPECT_EQ(transport->flushCount(), 1u);
}

TEST_F(Concurrency, CallsOnOneCoreFromTwoThreadsDoNotOverlap) {
  initMoxCore(ref, 4, 0, 0, 0);
  transport->blockNextCommand();
  std::future<uint32_t> reader = std::async(std::launch::async, [&] {
    ZinRT::ZinMOX_ValueMap map;
    uintptr_t word = mapWord(map);
    return ZinMOX_readValues(handle, &ref, &word);
  });
  ASSERT_TRUE(transport->waitUntilBlocked(10000));
  std::future<uint32_t> definer = std::async(std::launch::async, [&] {
    return ZinMOX_defineSignal(handle, &ref, "late", ZINMOX_ASYNC_INPUT, 3);
  });
  EXPECT_EQ(definer.wait_for(300ms), std::future_status::timeout);
  transport->release();
  EXPECT_EQ(reader.get(), 0u);
  EXPECT_EQ(definer.get(), 0u);
  EXPECT_FALSE(ZinJtag_session_isLocked(handle));
  expectNoMessages();
}

}  // namespace
