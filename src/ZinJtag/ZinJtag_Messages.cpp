// Session messages: per-session handlers and the default handler that writes to standard error.
#include <cstdio>
#include <mutex>

#include "ZinJtag_Session.h"

namespace {

void writeToStandardError(void*, uint32_t handle, uint32_t code, const char* text) {
  std::fprintf(stderr, "ZinJtag[%u] code 0x%04X: %s\n", static_cast<unsigned>(handle),
               static_cast<unsigned>(code), text);
  std::fflush(stderr);
}

}  // namespace

void ZinJtag_setMessageHandler(uint32_t handle, ZinJtag_MessageHandler handler, void* user) {
  const auto session = ZinJtagDetail::findSession(handle, "ZinJtag_setMessageHandler");
  std::lock_guard<std::recursive_mutex> guard(session->messageMutex);
  session->handler = handler;
  session->handlerUser = handler != nullptr ? user : nullptr;
}

void ZinJtag_session_sendMessage(uint32_t handle, uint32_t code, const char* text) {
  const auto session = ZinJtagDetail::findSession(handle, "ZinJtag_session_sendMessage");
  // Held while the handler runs: the messages of a session reach its host one at a time and in
  // the order they were sent. Recursive, so a handler may itself send a message.
  std::lock_guard<std::recursive_mutex> guard(session->messageMutex);
  const ZinJtag_MessageHandler handler =
      session->handler != nullptr ? session->handler : &writeToStandardError;
  handler(session->handlerUser, handle, code, text != nullptr ? text : "");
}
