// The registry of open sessions: opening, closing, lookup and the close hooks.
#include <algorithm>
#include <exception>
#include <limits>
#include <map>
#include <stdexcept>
#include <string>
#include <vector>

#include "ZinJtag_Session.h"

namespace {

struct Registry {
  std::mutex mutex;
  std::map<uint32_t, std::shared_ptr<ZinJtagSessionState>> sessions;
  uint32_t nextHandle = 1;
  std::vector<void (*)(uint32_t)> closeHooks;
};

Registry& registry() {
  static Registry instance;
  return instance;
}

// The next free handle; 0 is never handed out, also after the counter wraps.
uint32_t allocateHandle(Registry& r) {
  while (r.nextHandle == 0 || r.sessions.count(r.nextHandle) != 0) ++r.nextHandle;
  return r.nextHandle++;
}

}  // namespace

namespace ZinJtagDetail {

std::shared_ptr<ZinJtagSessionState> findSession(uint32_t handle, const char* caller) {
  Registry& r = registry();
  std::lock_guard<std::mutex> guard(r.mutex);
  const auto it = r.sessions.find(handle);
  if (it == r.sessions.end()) {
    throw std::invalid_argument(std::string(caller) + ": no open JTAG session with handle " +
                                std::to_string(handle));
  }
  return it->second;
}

}  // namespace ZinJtagDetail

uint32_t ZinJtag_openSession(std::shared_ptr<ZinRT::Zin_Transport> transport) {
  if (!transport) throw std::invalid_argument("ZinJtag_openSession: null transport");
  Registry& r = registry();
  std::lock_guard<std::mutex> guard(r.mutex);
  const uint32_t handle = allocateHandle(r);
  r.sessions.emplace(handle, std::make_shared<ZinJtagSessionState>(handle, std::move(transport)));
  return handle;
}

void ZinJtag_closeSession(uint32_t handle) {
  const auto session = ZinJtagDetail::findSession(handle, "ZinJtag_closeSession");
  if (session->closing.exchange(true)) {
    throw std::invalid_argument("ZinJtag_closeSession: session " + std::to_string(handle) +
                                " is already being closed");
  }
  // The close waits for the call in progress to leave the target lock, and calls that wait for
  // the lock after it fail instead of finding destroyed cores.
  ZinJtagTargetLock lock(handle, std::numeric_limits<uint32_t>::max());
  {
    std::lock_guard<std::mutex> guard(session->lockMutex);
    session->closed = true;
  }
  Registry& r = registry();
  std::vector<void (*)(uint32_t)> hooks;
  {
    std::lock_guard<std::mutex> guard(r.mutex);
    hooks = r.closeHooks;
  }
  // The hooks run while the session is still open, so that what they destroy may still use it.
  // A failing hook still lets the session close; its exception is passed on afterwards.
  std::exception_ptr failure;
  for (auto* hook : hooks) {
    try {
      hook(handle);
    } catch (...) {
      if (!failure) failure = std::current_exception();
    }
  }
  {
    std::lock_guard<std::mutex> guard(r.mutex);
    r.sessions.erase(handle);
  }
  if (failure) std::rethrow_exception(failure);
}

void ZinJtag_addSessionCloseHook(void (*hook)(uint32_t handle)) {
  if (hook == nullptr) throw std::invalid_argument("ZinJtag_addSessionCloseHook: null hook");
  Registry& r = registry();
  std::lock_guard<std::mutex> guard(r.mutex);
  if (std::find(r.closeHooks.begin(), r.closeHooks.end(), hook) == r.closeHooks.end()) {
    r.closeHooks.push_back(hook);
  }
}
