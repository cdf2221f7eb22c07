#include "support/SessionFixture.h"

#include <cstdio>

#include "ZinRT/ZinJtag.h"
#include "ZinRT/Zin_CoreList.h"

namespace ZinTest {

void SessionFixture::SetUp() {
  transport = std::make_shared<ZinTarget::ScriptedTransport>();
  handle = ZinJtag_openSession(transport);
  ZinJtag_setMessageHandler(handle, &SessionFixture::onMessage, this);
}

void SessionFixture::TearDown() {
  if (handle != 0) ZinJtag_closeSession(handle);
  handle = 0;
}

void SessionFixture::onMessage(void* user, uint32_t messageHandle, uint32_t code,
                               const char* text) {
  auto* self = static_cast<SessionFixture*>(user);
  bool locked = ZinJtag_session_isLocked(messageHandle);
  std::lock_guard<std::mutex> guard(self->mutex_);
  self->messages_.push_back({code, text ? text : "<null>", locked});
}

std::vector<RecordedMessage> SessionFixture::messages() const {
  std::lock_guard<std::mutex> guard(mutex_);
  return messages_;
}

void SessionFixture::clearMessages() {
  std::lock_guard<std::mutex> guard(mutex_);
  messages_.clear();
}

void SessionFixture::expectOnlyError(const std::string& text) {
  std::vector<RecordedMessage> recorded = messages();
  ASSERT_EQ(recorded.size(), 1u) << "expected only \"" << text << "\"; first: \""
                                 << (recorded.empty() ? "" : recorded[0].text) << "\"";
  EXPECT_EQ(recorded[0].text, text);
  EXPECT_EQ(recorded[0].code, kErrorCode);
  EXPECT_FALSE(recorded[0].lockHeld) << "the frame reports after releasing the target lock";
  clearMessages();
}

void SessionFixture::expectNoMessages() {
  std::vector<RecordedMessage> recorded = messages();
  EXPECT_TRUE(recorded.empty()) << "unexpected message: \"" << recorded[0].text << "\"";
}

ZinRT::ZinMOX_Core* SessionFixture::initMoxCore(const ZIN_CORE_REF& coreRef, uint32_t asyncIn,
                                                uint32_t syncIn, uint32_t asyncOut,
                                                uint32_t syncOut) {
  ZinTarget::MoxStatus status;
  status.asyncInputCount = asyncIn;
  status.syncInputCount = syncIn;
  status.asyncOutputCount = asyncOut;
  status.syncOutputCount = syncOut;
  transport->placeMoxCore(coreRef, status);
  ZIN_CORE_REF copy = coreRef;
  uint32_t result = ZinMOX_initCore(handle, &copy);
  EXPECT_EQ(result, 0u) << "ZinMOX_initCore failed";
  ZinRT::ZinMOX_Core* core = registeredCore(coreRef);
  EXPECT_NE(core, nullptr) << "no MOX core registered after ZinMOX_initCore";
  transport->clearLog();
  clearMessages();
  return core;
}

ZinRT::ZinMOX_Core* SessionFixture::registeredCore(const ZIN_CORE_REF& coreRef) const {
  return dynamic_cast<ZinRT::ZinMOX_Core*>(ZinRT::Zin_CoreList::getCore(handle, coreRef));
}

std::string SessionFixture::linePrefix(const ZIN_CORE_REF& coreRef) {
  char text[32];
  std::snprintf(text, sizeof text, "%02X %X %X ", coreRef.deviceIndex, coreRef.userChainNumber,
                coreRef.coreIndex);
  return text;
}

}  // namespace ZinTest
