// The requests waiting for the server's request thread, in two lanes that take turns when both
// hold requests: a client with a status read or a short sequence waits for the small requests
// ahead of it and as many large ones at most, however many clients flood the server with large
// sequences, and clients with small requests cannot starve the large ones either.
#ifndef ZINNET_SRC_REQUESTQUEUE_H
#define ZINNET_SRC_REQUESTQUEUE_H

#include <cstddef>
#include <deque>
#include <functional>
#include <mutex>

namespace ZinNet {

class RequestQueue {
 public:
  /// Requests with a body of at most this many bytes take the small lane.
  static constexpr size_t kSmallRequestBytes = 64 * 1024;

  void push(size_t bodyBytes, std::function<void()> job) {
    std::lock_guard<std::mutex> lock(mutex_);
    (bodyBytes <= kSmallRequestBytes ? small_ : large_).push_back(std::move(job));
  }

  /// Drops what still waits (after the request thread has stopped).
  void clear() {
    std::lock_guard<std::mutex> lock(mutex_);
    small_.clear();
    large_.clear();
  }

  /// The oldest request of the lane whose turn it is, else of the other; null when none waits.
  std::function<void()> pop() {
    std::lock_guard<std::mutex> lock(mutex_);
    lastSmall_ = !small_.empty() && (!lastSmall_ || large_.empty());
    std::deque<std::function<void()>>& lane = lastSmall_ ? small_ : large_;
    if (lane.empty()) return nullptr;
    std::function<void()> job = std::move(lane.front());
    lane.pop_front();
    return job;
  }

 private:
  std::mutex mutex_;
  std::deque<std::function<void()>> small_;
  std::deque<std::function<void()>> large_;
  bool lastSmall_ = false;  // the lane of the last request taken
};

}  // namespace ZinNet

#endif
