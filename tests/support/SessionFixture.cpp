#include "support/SessionFixture.h"

#include <cstdio>
#include <stdexcept>

#include "ZinRT/ZinJtag.h"
#include "ZinRT/Zin_CoreList.h"

namespace ZinTest {

std::string logicErrorOf(const std::function<void()>& call) {
  try {
    call();
  } catch (const std::logic_error& error) {
    return error.what();
  }
  ADD_FAILURE() << "no std::logic_error";
  return "";
}

void SessionFixture::SetUp() {
  transport = std::make_shared<ZinTestKit::ScriptedTransport>();
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
  const bool locked = ZinJtag_session_isLocked(messageHandle);
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

std::string SessionFixture::errorOf(uint32_t result) {
  EXPECT_EQ(result, kFailure);
  const std::vector<RecordedMessage> recorded = messages();
  clearMessages();
  EXPECT_EQ(recorded.size(), 1u) << "first: " << (recorded.empty() ? "" : recorded[0].text);
  if (recorded.empty()) return "";
  EXPECT_EQ(recorded[0].code, kErrorCode) << recorded[0].text;
  EXPECT_FALSE(recorded[0].lockHeld) << "the frame reports after releasing the target lock";
  return recorded[0].text;
}

void SessionFixture::expectWrongCoreType(const std::string& text) {
  EXPECT_EQ(messages(), (std::vector<RecordedMessage>{{kErrorCode, text, true},
                                                      {kAbortCode, "Zin abort command", false}}));
  clearMessages();
}

void SessionFixture::expectNoMessages() {
  const std::vector<RecordedMessage> recorded = messages();
  EXPECT_TRUE(recorded.empty()) << "unexpected message: \"" << recorded[0].text << "\"";
}

ZinRT::ZinMOX_Core* SessionFixture::initMoxCore(const ZIN_CORE_REF& coreRef, uint32_t asyncIn,
                                                uint32_t syncIn, uint32_t asyncOut,
                                                uint32_t syncOut) {
  transport->placeMoxCore(coreRef, {.asyncInputCount = asyncIn,
                                    .syncInputCount = syncIn,
                                    .asyncOutputCount = asyncOut,
                                    .syncOutputCount = syncOut});
  ZIN_CORE_REF copy = coreRef;
  EXPECT_EQ(ZinMOX_initCore(handle, &copy), 0u) << "ZinMOX_initCore failed";
  ZinRT::ZinMOX_Core* core = registeredCore(coreRef);
  EXPECT_NE(core, nullptr) << "no MOX core registered after ZinMOX_initCore";
  transport->clearLog();
  clearMessages();
  return core;
}

ZinRT::ZinMOX_Core* SessionFixture::registeredCore(const ZIN_CORE_REF& coreRef) const {
  return dynamic_cast<ZinRT::ZinMOX_Core*>(ZinRT::Zin_CoreList::getCore(handle, coreRef));
}

uint32_t SessionFixture::defineBus(const char* name, uint32_t type, std::vector<uint32_t> bits) {
  return ZinMOX_defineBus(handle, &ref, name, type, bits.data(),
                          static_cast<uint32_t>(bits.size()));
}

WriteImage SessionFixture::lastWrite(uint32_t asyncOut, uint32_t syncOut) {
  const auto sent = transport->transfers();
  if (sent.empty()) {
    ADD_FAILURE() << "nothing was sent";
    return WriteImage::zeros(asyncOut, syncOut);
  }
  return decodeWriteCommand(sent.back().text, linePrefix(ref), asyncOut, syncOut);
}

std::string SessionFixture::linePrefix(const ZIN_CORE_REF& coreRef) {
  char text[32];
  std::snprintf(text, sizeof text, "%02X %X %X ", coreRef.deviceIndex, coreRef.userChainNumber,
                coreRef.coreIndex);
  return text;
}

}  // namespace ZinTest
