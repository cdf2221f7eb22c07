// Transfers of a session: every use of the transport is serialised by the session's mutex.
#include <mutex>

#include "ZinJtag_Session.h"

void ZinJtag_session_withTransport(uint32_t handle,
                                   const std::function<void(ZinRT::Zin_Transport&)>& work) {
  const auto session = ZinJtagDetail::findSession(handle, "ZinJtag_session_withTransport");
  std::lock_guard<std::recursive_mutex> guard(session->transportMutex);
  work(*session->transport);
}

void ZinJtag_target_flush(uint32_t handle) {
  const auto session = ZinJtagDetail::findSession(handle, "ZinJtag_target_flush");
  std::lock_guard<std::recursive_mutex> guard(session->transportMutex);
  session->transport->flush();
}
