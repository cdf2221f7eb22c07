// The shared reader of the dashboard.
#include "ReadHub.h"

#include <algorithm>
#include <cmath>

namespace zinmox::dashboard {

namespace {

bool sameShape(const std::vector<Reading>& a, const std::vector<Reading>& b) {
  if (a.size() != b.size()) return false;
  for (size_t i = 0; i < a.size(); ++i) {
    if (a[i].name != b[i].name || a[i].width != b[i].width || a[i].sync != b[i].sync) return false;
  }
  return true;
}

}  // namespace

ReadHub::ReadHub(HostLink& host) : host_(host) {}

ReadHub::~ReadHub() {
  stop();
}

void ReadHub::start() {
  thread_ = std::thread([this] { run(); });
}

void ReadHub::stop() {
  {
    std::lock_guard<std::mutex> lock(mutex_);
    stopping_ = true;
    changed();
  }
  settle_.notify_all();
  if (thread_.joinable()) thread_.join();
}

bool ReadHub::stopped() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return stopping_;
}

void ReadHub::changed() {
  ++generation_;
  wake_.notify_all();
}

LiveSettings ReadHub::configure(const std::optional<std::string>& core,
                                const std::optional<double>& rateHz,
                                const std::optional<bool>& paused) {
  if (rateHz && !(std::isfinite(*rateHz) && *rateHz >= kMinRateHz && *rateHz <= kMaxRateHz)) {
    throw ApiError(400, "rate_hz must be between " + std::to_string(int(kMinRateHz)) + " and " +
                            std::to_string(int(kMaxRateHz)) + " reads per second");
  }
  const std::optional<std::string> canonical =
      core ? std::optional<std::string>(host_.moxCore(*core)) : std::nullopt;
  std::lock_guard<std::mutex> lock(mutex_);
  if (canonical && *canonical != settings_.core) {
    settings_.core = *canonical;
    history_.clear();
    error_.clear();
  }
  if (rateHz) settings_.rateHz = *rateHz;
  if (paused) settings_.paused = *paused;
  changed();
  settle_.notify_all();
  return settings_;
}

LiveSettings ReadHub::settings() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return settings_;
}

void ReadHub::notify() {
  std::lock_guard<std::mutex> lock(mutex_);
  changed();
}

void ReadHub::run() {
  auto next = std::chrono::steady_clock::now();
  std::unique_lock<std::mutex> lock(mutex_);
  while (!stopping_) {
    if (settings_.core.empty() || settings_.paused) {
      settle_.wait(lock);
      next = std::chrono::steady_clock::now();
      continue;
    }
    if (settle_.wait_until(lock, next) != std::cv_status::timeout) continue;  // a new setting
    const std::string core = settings_.core;
    const auto period = std::chrono::duration_cast<std::chrono::steady_clock::duration>(
        std::chrono::duration<double>(1.0 / settings_.rateHz));
    lock.unlock();
    readOnce(core);
    lock.lock();
    // Keep the pace; after a stall (a slow target), start again from now instead of catching up.
    next += period;
    const auto now = std::chrono::steady_clock::now();
    if (next < now) next = now;
  }
}

void ReadHub::readOnce(const std::string& core) {
  std::vector<Reading> inputs;
  std::string error;
  try {
    inputs = host_.read(core);
  } catch (const std::exception& failure) {
    error = failure.what();
  }
  const auto now = std::chrono::steady_clock::now();
  std::lock_guard<std::mutex> lock(mutex_);
  ++reads_;
  if (core != settings_.core) return;  // the core changed while reading
  error_ = error;
  if (error.empty()) {
    if (!history_.empty() && !sameShape(history_.back().inputs, inputs)) history_.clear();
    const auto time = std::chrono::duration_cast<std::chrono::microseconds>(now - start_);
    history_.push_back(Sample{nextSeq_++, static_cast<uint64_t>(time.count()), std::move(inputs)});
    if (history_.size() > kHistoryLength) history_.pop_front();
  }
  changed();
}

HubState ReadHub::wait(uint64_t seen, uint64_t afterSeq, std::chrono::milliseconds timeout,
                       size_t maxSamples) {
  std::unique_lock<std::mutex> lock(mutex_);
  wake_.wait_for(lock, timeout, [&] { return stopping_ || generation_ != seen; });
  HubState state;
  state.generation = generation_;
  state.settings = settings_;
  state.error = error_;
  state.historyStart = history_.empty() ? 0 : history_.front().seq;
  for (auto it = history_.rbegin(); it != history_.rend() && it->seq > afterSeq; ++it) {
    if (state.samples.size() == maxSamples) break;
    state.samples.push_back(*it);
  }
  std::reverse(state.samples.begin(), state.samples.end());
  return state;
}

std::pair<std::string, std::vector<Sample>> ReadHub::history() {
  std::lock_guard<std::mutex> lock(mutex_);
  return {settings_.core, std::vector<Sample>(history_.begin(), history_.end())};
}

uint64_t ReadHub::readCount() {
  std::lock_guard<std::mutex> lock(mutex_);
  return reads_;
}

}  // namespace zinmox::dashboard
