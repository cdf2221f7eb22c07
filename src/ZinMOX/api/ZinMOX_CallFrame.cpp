// Reporting of failures on the session.
#include "api/ZinMOX_CallFrame.h"

#include <cstring>

namespace ZinRT::mox {

namespace {
constexpr char ABORT_TEXT[] = "Zin abort command";
constexpr char INTERNAL_ERROR_TEXT[] = "Zin internal error.";
}  // namespace

void sendMessage(uint32_t handle, uint32_t code, const char* text) {
  try {
    ZinJtag_session_sendMessage(handle, code, text);
  } catch (...) {
    // The session is gone or cannot deliver: the return code still reports the failure.
  }
}

uint32_t sendExceptionMessage(uint32_t handle, const std::exception& error) {
  const char* text = error.what();
  // The abort is recognised by its whole text, so a longer text that starts with it is an error.
  const bool isAbort = text != nullptr && std::strcmp(text, ABORT_TEXT) == 0;
  sendMessage(handle, isAbort ? MESSAGE_ABORT : MESSAGE_ERROR, text != nullptr ? text : "");
  return CALL_FAILURE;
}

uint32_t sendInternalError(uint32_t handle) {
  sendMessage(handle, MESSAGE_ERROR, INTERNAL_ERROR_TEXT);
  return CALL_FAILURE;
}

}  // namespace ZinRT::mox
