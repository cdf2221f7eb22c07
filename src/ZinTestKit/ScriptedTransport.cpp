// The scripted transport of the tests.
#include "ZinTestKit/ScriptedTransport.h"

#include <algorithm>
#include <chrono>
#include <cstring>
#include <new>
#include <stdexcept>
#include <utility>

namespace ZinTestKit {

void ScriptedTransport::placeCore(const ZIN_CORE_REF& ref, const ZIN_CORE_INFO& info,
                                  std::vector<unsigned char> status) {
  std::lock_guard<std::mutex> guard(mutex_);
  cores_[keyOf(ref)] = PlacedCore{info, std::move(status)};
}

void ScriptedTransport::placeMoxCore(const ZIN_CORE_REF& ref, const MoxStatus& status,
                                     uint32_t manufacturerId, uint32_t revision) {
  const ZIN_CORE_INFO info{manufacturerId, 9, status.majorVersion, status.minorVersion, revision};
  placeCore(ref, info, buildMoxStatusWord(status));
}

void ScriptedTransport::removeCore(const ZIN_CORE_REF& ref) {
  std::lock_guard<std::mutex> guard(mutex_);
  cores_.erase(keyOf(ref));
}

void ScriptedTransport::queueReadData(std::vector<unsigned char> bytes) {
  std::lock_guard<std::mutex> guard(mutex_);
  readData_.push_back(std::move(bytes));
}

void ScriptedTransport::failNextCommand(Failure kind, std::string text) {
  std::lock_guard<std::mutex> guard(mutex_);
  commandFailure_ = kind;
  commandFailureText_ = std::move(text);
}

void ScriptedTransport::failNextStatusRead(Failure kind, std::string text) {
  std::lock_guard<std::mutex> guard(mutex_);
  statusFailure_ = kind;
  statusFailureText_ = std::move(text);
}

void ScriptedTransport::blockNextCommand() {
  std::lock_guard<std::mutex> guard(mutex_);
  blockNext_ = true;
  released_ = false;
}

bool ScriptedTransport::waitUntilBlocked(uint32_t timeoutMs) {
  std::unique_lock<std::mutex> lock(mutex_);
  return changed_.wait_for(lock, std::chrono::milliseconds(timeoutMs), [this] { return blocked_; });
}

void ScriptedTransport::release() {
  std::lock_guard<std::mutex> guard(mutex_);
  released_ = true;
  changed_.notify_all();
}

std::vector<ScriptedTransport::Transfer> ScriptedTransport::transfers() const {
  std::lock_guard<std::mutex> guard(mutex_);
  return transfers_;
}

uint32_t ScriptedTransport::flushCount() const {
  std::lock_guard<std::mutex> guard(mutex_);
  return flushes_;
}

uint32_t ScriptedTransport::statusReadCount() const {
  std::lock_guard<std::mutex> guard(mutex_);
  return statusReads_;
}

void ScriptedTransport::clearLog() {
  std::lock_guard<std::mutex> guard(mutex_);
  transfers_.clear();
  flushes_ = 0;
  statusReads_ = 0;
}

void ScriptedTransport::raise(Failure kind, const std::string& text) {
  switch (kind) {
    case Failure::None:
      return;
    case Failure::Runtime:
      throw std::runtime_error(text);
    case Failure::LogicError:
      throw std::logic_error(text);
    case Failure::BadAlloc:
      throw std::bad_alloc();
    case Failure::NonStandard:
      throw 42;  // not derived from std::exception
  }
}

void ScriptedTransport::waitIfBlocked(std::unique_lock<std::mutex>& lock) {
  if (!blockNext_) return;
  blockNext_ = false;
  blocked_ = true;
  changed_.notify_all();
  changed_.wait(lock, [this] { return released_; });
  released_ = false;
  blocked_ = false;
}

void ScriptedTransport::readStatus(const ZIN_CORE_REF& ref, ZIN_CORE_INFO& info,
                                   unsigned char* status, uint32_t statusBytes,
                                   uint32_t statusBitCount) {
  std::lock_guard<std::mutex> guard(mutex_);
  ++statusReads_;
  const Failure failure = std::exchange(statusFailure_, Failure::None);
  raise(failure, statusFailureText_);
  const auto it = cores_.find(keyOf(ref));
  if (it == cores_.end()) return;  // nobody answers: info and status stay zero
  info = it->second.info;
  const uint32_t wanted = statusBitCount / 8 + (statusBitCount % 8 != 0 ? 1 : 0);
  const size_t count = std::min<size_t>({statusBytes, wanted, it->second.status.size()});
  if (count == 0 || status == nullptr) return;
  std::memcpy(status, it->second.status.data(), count);
  if (count == wanted && statusBitCount % 8 != 0) {
    status[count - 1] &= static_cast<unsigned char>((1u << (statusBitCount % 8)) - 1);
  }
}

void ScriptedTransport::commandSequence(const std::string& text, unsigned char* readData,
                                        uint32_t readBitCount) {
  std::unique_lock<std::mutex> lock(mutex_);
  const Failure failure = std::exchange(commandFailure_, Failure::None);
  raise(failure, commandFailureText_);
  waitIfBlocked(lock);
  transfers_.push_back(Transfer{text, readBitCount});
  if (readBitCount == 0 || readData == nullptr || readData_.empty()) return;
  const std::vector<unsigned char> bytes = std::move(readData_.front());
  readData_.pop_front();
  const size_t room = readBitCount / 8 + (readBitCount % 8 != 0 ? 1 : 0);
  std::memcpy(readData, bytes.data(), std::min(room, bytes.size()));
}

void ScriptedTransport::flush() {
  std::lock_guard<std::mutex> guard(mutex_);
  ++flushes_;
}

bool ScriptedTransport::listCores(std::vector<ZIN_CORE_REF>& refs) {
  std::lock_guard<std::mutex> guard(mutex_);
  for (const auto& [key, core] : cores_) {
    refs.push_back(ZIN_CORE_REF{std::get<0>(key), std::get<1>(key), std::get<2>(key)});
  }
  return true;
}

}  // namespace ZinTestKit
