// The fuzzers' session and the checks of an exported call's outcome.
#include "FuzzSession.h"

#include <cstdio>
#include <cstdlib>
#include <string_view>

#include "ZinRT/ZinJtag.h"

namespace ZinFuzz {

namespace {

// How the messages of the library begin; anything else reaching the host is a fault.
constexpr std::string_view kLibraryMessages[] = {
    "ZinMOX_",  // argument checks, wrong core type
    "Arg. to function ZinMOX_getCoreInfo() failed:",
    "Data structures not initialized for MOX core Device:",
    "Zin abort command",
    "The name, ",
    "This signal cannot be defined",
    "Invalid signal name.",
    "Could not find a signal with the name: ",
    ".pulsetrain cannot be used with the non-synchronous output: ",
    "Invalid Hex String: ",
};

bool isLibraryMessage(const std::string& text) {
  for (std::string_view start : kLibraryMessages) {
    if (std::string_view(text).substr(0, start.size()) == start) return true;
  }
  return false;
}

}  // namespace

void fail(const std::string& what) {
  std::fprintf(stderr, "fuzz check failed: %s\n", what.c_str());
  std::abort();
}

FuzzSession::FuzzSession() : transport_(std::make_shared<ZinTestKit::ScriptedTransport>()) {
  handle_ = ZinJtag_openSession(transport_);
  ZinJtag_setMessageHandler(handle_, &FuzzSession::onMessage, this);
}

FuzzSession::~FuzzSession() {
  ZinJtag_closeSession(handle_);
}

void FuzzSession::placeCore(const ZIN_CORE_REF& ref, uint32_t asyncIn, uint32_t syncIn,
                            uint32_t asyncOut, uint32_t syncOut) {
  ZinTestKit::MoxStatus status;
  status.asyncInputCount = asyncIn;
  status.syncInputCount = syncIn;
  status.asyncOutputCount = asyncOut;
  status.syncOutputCount = syncOut;
  transport_->placeMoxCore(ref, status);
}

void FuzzSession::onMessage(void* user, uint32_t, uint32_t code, const char* text) {
  static_cast<FuzzSession*>(user)->messages_.push_back({code, text != nullptr ? text : ""});
}

void FuzzSession::check(const char* call, uint32_t result) {
  const std::vector<Message> messages = std::move(messages_);
  messages_.clear();
  if (result == ZINMOX_SUCCESS) {
    if (!messages.empty()) fail(std::string(call) + " succeeded but reported: " + messages[0].text);
    return;
  }
  if (result != ZINMOX_FAILURE) fail(std::string(call) + " returned " + std::to_string(result));
  if (messages.empty()) fail(std::string(call) + " failed without a message");
  for (const Message& m : messages) {
    if (m.code != ZINJTAG_MSG_ERROR && m.code != ZINJTAG_MSG_ABORT) {
      fail(std::string(call) + " reported code " + std::to_string(m.code) + ": " + m.text);
    }
    if (!isLibraryMessage(m.text)) fail(std::string(call) + " reported: " + m.text);
  }
}

}  // namespace ZinFuzz
