// JTAG sessions: handles, messages, the re-entrant target lock, and closing.
#include <gtest/gtest.h>

#include <atomic>
#include <future>
#include <memory>
#include <mutex>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

#include "ZinRT/ZinJtag.h"
#include "ZinTestKit/ScriptedTransport.h"

namespace {

struct Received {
  uint32_t handle, code;
  std::string text;
  bool operator==(const Received&) const = default;
};

struct Inbox {
  std::mutex mutex;
  std::vector<Received> messages;

  static void handler(void* user, uint32_t handle, uint32_t code, const char* text) {
    auto* inbox = static_cast<Inbox*>(user);
    std::lock_guard<std::mutex> guard(inbox->mutex);
    inbox->messages.push_back({handle, code, text});
  }
};

uint32_t openScripted() {
  return ZinJtag_openSession(std::make_shared<ZinTestKit::ScriptedTransport>());
}

std::string whatOf(const std::function<void()>& call) {
  try {
    call();
  } catch (const std::exception& e) {
    return e.what();
  }
  return "";
}

std::vector<uint32_t> closedHandles;
std::vector<bool> openDuringHook;
void recordClose(uint32_t handle) {
  closedHandles.push_back(handle);
  openDuringHook.push_back(whatOf([handle] { ZinJtag_session_isLocked(handle); }).empty());
}

}  // namespace

TEST(JtagSession, HandlesReachTheirTransportAndMessagesTheirOwnSession) {
  auto transport = std::make_shared<ZinTestKit::ScriptedTransport>();
  const uint32_t a = ZinJtag_openSession(transport);
  const uint32_t b = openScripted();
  EXPECT_TRUE(a != 0 && b != 0 && a != b);
  ZinJtag_target_flush(a);
  EXPECT_EQ(transport->flushCount(), 1u);
  ZinRT::Zin_Transport* seen = nullptr;
  ZinJtag_session_withTransport(a, [&seen](ZinRT::Zin_Transport& t) { seen = &t; });
  EXPECT_EQ(seen, transport.get());
  EXPECT_THROW(ZinJtag_openSession(nullptr), std::invalid_argument);

  Inbox inboxA, inboxB;
  ZinJtag_setMessageHandler(a, &Inbox::handler, &inboxA);
  ZinJtag_setMessageHandler(b, &Inbox::handler, &inboxB);
  ZinJtag_session_sendMessage(a, ZINJTAG_MSG_ERROR, "first");
  ZinJtag_session_sendMessage(b, ZINJTAG_MSG_ABORT, "other");
  ZinJtag_session_sendMessage(a, ZINJTAG_MSG_ABORT, "second");
  ZinJtag_session_sendMessage(a, ZINJTAG_MSG_ERROR, nullptr);
  EXPECT_EQ(inboxA.messages, (std::vector<Received>{{a, ZINJTAG_MSG_ERROR, "first"},
                                                    {a, ZINJTAG_MSG_ABORT, "second"},
                                                    {a, ZINJTAG_MSG_ERROR, ""}}));
  EXPECT_EQ(inboxB.messages, (std::vector<Received>{{b, ZINJTAG_MSG_ABORT, "other"}}));
  // A null handler restores the default one, which writes to standard error.
  ZinJtag_setMessageHandler(a, nullptr, nullptr);
  testing::internal::CaptureStderr();
  ZinJtag_session_sendMessage(a, 0x100, "to stderr");
  EXPECT_EQ(testing::internal::GetCapturedStderr(),
            "ZinJtag[" + std::to_string(a) + "] code 0x0100: to stderr\n");
  EXPECT_EQ(inboxA.messages.size(), 3u);

  // A closed handle is refused everywhere, with its number in the text.
  ZinJtag_closeSession(a);
  EXPECT_THROW(ZinJtag_closeSession(a), std::invalid_argument);
  EXPECT_THROW(ZinJtag_session_sendMessage(a, ZINJTAG_MSG_ERROR, "x"), std::invalid_argument);
  EXPECT_THROW(ZinJtag_target_flush(a), std::invalid_argument);
  EXPECT_THROW(ZinJtagTargetLock(a, 10), std::invalid_argument);
  EXPECT_THROW(ZinJtag_session_isLocked(a), std::invalid_argument);
  EXPECT_NE(whatOf([a] { ZinJtag_session_sendMessage(a, 1, "x"); }).find(std::to_string(a)),
            std::string::npos);
  ZinJtag_closeSession(b);
}

TEST(JtagSession, TargetLockIsReentrantCountedAndTimesOutForAnotherThread) {
  const uint32_t h = openScripted();
  EXPECT_FALSE(ZinJtag_session_isLocked(h));
  auto held = std::make_unique<ZinJtagTargetLock>(h, 60000);
  {
    ZinJtagTargetLock inner(h, 0);  // re-entry does not wait, even with no time to wait
    EXPECT_TRUE(ZinJtag_session_isLocked(h));
  }
  EXPECT_TRUE(ZinJtag_session_isLocked(h));
  EXPECT_EQ(ZinJtag_session_lockCount(h), 2u);
  const std::string failure = std::async(std::launch::async, [h] {
                                return whatOf([h] { ZinJtagTargetLock lock(h, 50); });
                              }).get();
  EXPECT_EQ(failure,
            "ZinJtag: target lock of session " + std::to_string(h) + " not obtained within 50 ms");
  // A waiter gets the lock once the holder lets go.
  std::promise<void> started;
  auto waiter = std::async(std::launch::async, [h, &started] {
    started.set_value();
    ZinJtagTargetLock lock(h, 60000);
    return ZinJtag_session_isLocked(h);
  });
  started.get_future().wait();
  held.reset();
  EXPECT_TRUE(waiter.get());
  EXPECT_FALSE(ZinJtag_session_isLocked(h));
  ZinJtag_closeSession(h);
}

// Close hooks run once per close while the session is still open; a session closed while its lock
// is held stays alive for the lock.
TEST(JtagSession, CloseRunsHooksOnceAndKeepsALockedSessionForItsLock) {
  ZinJtag_addSessionCloseHook(&recordClose);
  ZinJtag_addSessionCloseHook(&recordClose);  // registered once
  EXPECT_THROW(ZinJtag_addSessionCloseHook(nullptr), std::invalid_argument);
  closedHandles.clear();
  openDuringHook.clear();
  auto transport = std::make_shared<ZinTestKit::ScriptedTransport>();
  std::weak_ptr<ZinTestKit::ScriptedTransport> watch = transport;
  const uint32_t h = ZinJtag_openSession(std::move(transport));
  {
    ZinJtagTargetLock lock(h, 1000);
    ZinJtag_closeSession(h);
    EXPECT_EQ(closedHandles, std::vector<uint32_t>{h});
    EXPECT_EQ(openDuringHook, std::vector<bool>{true});
    EXPECT_THROW(ZinJtag_session_isLocked(h), std::invalid_argument);
    EXPECT_FALSE(watch.expired());  // the lock still holds the session
  }
  EXPECT_TRUE(watch.expired());  // released with the last lock
}
