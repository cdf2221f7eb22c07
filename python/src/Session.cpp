// Session state: opening, the message handler, calls with the GIL released, closing.
#include "Session.h"

#include <utility>

#include "Gil.h"
#include "ZinRT/ZinJtag.h"

namespace py = pybind11;

namespace zinmox {

namespace {

// The calls in progress on this thread, innermost first.
struct Capture {
  uint32_t handle;
  Messages* sink;
  Capture* outer;
};
thread_local Capture* activeCapture = nullptr;

class CaptureScope {
 public:
  CaptureScope(uint32_t handle, Messages& sink) : capture_{handle, &sink, activeCapture} {
    activeCapture = &capture_;
  }
  ~CaptureScope() { activeCapture = capture_.outer; }
  CaptureScope(const CaptureScope&) = delete;
  CaptureScope& operator=(const CaptureScope&) = delete;

 private:
  Capture capture_;
};

Failure closedFailure() {
  return Failure("Session", {}, "The session is closed.");
}

}  // namespace

SessionState::SessionState(TransportChoice transport) : transport_(std::move(transport)) {
  const uint32_t handle = ZinJtag_openSession(transport_.transport);
  ZinJtag_setMessageHandler(handle, &SessionState::onMessage, this);
  handle_ = handle;
}

SessionState::~SessionState() {
  const uint32_t handle = handle_.exchange(0);
  if (handle == 0) return;
  try {
    ZinJtag_closeSession(handle);
  } catch (...) {
    // Nothing can be reported from a destructor; the session is closed all the same.
  }
}

void SessionState::onMessage(void* user, uint32_t handle, uint32_t code, const char* text) {
  try {
    for (Capture* capture = activeCapture; capture != nullptr; capture = capture->outer) {
      if (capture->handle == handle) {
        capture->sink->push_back({code, text});
        return;
      }
    }
    auto* self = static_cast<SessionState*>(user);
    std::lock_guard<std::mutex> guard(self->pendingMutex_);
    self->pending_.push_back({code, text});
  } catch (...) {
    // Out of memory: the message is lost, but no exception may enter the library.
  }
}

void SessionState::logPending() {
  Messages pending;
  {
    std::lock_guard<std::mutex> guard(pendingMutex_);
    pending.swap(pending_);
  }
  logMessages(handle(), pending);
}

void SessionState::close() {
  const bool closed = withoutGil([this] {
    std::unique_lock<std::shared_mutex> guard(closeMutex_);
    const uint32_t handle = handle_.exchange(0);
    if (handle == 0) return false;
    ZinJtag_closeSession(handle);
    return true;
  });
  if (closed) logPending();
}

Messages SessionState::run(const std::function<void(uint32_t)>& work) {
  Messages messages;
  withoutGil([&] {
    std::shared_lock<std::shared_mutex> guard(closeMutex_);
    const uint32_t handle = handle_.load();
    if (handle == 0) throw closedFailure();
    CaptureScope capture(handle, messages);
    work(handle);
  });
  logPending();
  return messages;
}

void SessionState::call(const std::string& function,
                        const std::function<uint32_t(uint32_t)>& work) {
  uint32_t status = 0;
  Messages messages = run([&](uint32_t handle) { status = work(handle); });
  if (status != 0) throw Failure(function, std::move(messages));
  logMessages(handle(), messages);
}

}  // namespace zinmox
