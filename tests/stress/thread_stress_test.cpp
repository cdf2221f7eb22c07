// Several threads on one session (one core and a second core) and on a second session mix
// define, write, read, port, terminate and init calls through the exported functions. Every call
// must return 0 or 0x80000000, a failed call must deliver exactly one message to the thread that
// made it and a successful one none, and no thread may receive a message about another thread's
// signals.
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <cstdint>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "ZinMOX/ZinMOX.h"
#include "ZinRT/ZinJtag.h"
#include "ZinTarget/ScriptedTransport.h"

namespace {

constexpr uint32_t kFailure = 0x80000000u;
constexpr auto kRunTime = std::chrono::milliseconds(1500);
constexpr uint32_t kMaxStepsPerThread = 4000;
constexpr uint32_t kWorkers = 6;

// The messages the session handler delivered on this thread (the call frame reports on the
// calling thread), with the session they came from.
struct Delivered {
  uint32_t handle;
  uint32_t code;
  std::string text;
};
thread_local std::vector<Delivered> delivered;

void recordOnThisThread(void*, uint32_t handle, uint32_t code, const char* text) {
  delivered.push_back({handle, code, text != nullptr ? text : ""});
}

std::shared_ptr<ZinTarget::ScriptedTransport> moxTarget(const std::vector<ZIN_CORE_REF>& refs) {
  auto transport = std::make_shared<ZinTarget::ScriptedTransport>();
  ZinTarget::MoxStatus status;
  status.asyncInputCount = 16;
  status.syncInputCount = 12;
  status.asyncOutputCount = 16;
  status.syncOutputCount = 12;
  for (const ZIN_CORE_REF& ref : refs) transport->placeMoxCore(ref, status);
  return transport;
}

// "t<id>_", the beginning of every signal name of one thread. (Built by appending: g++ 12
// mistakes "t" + std::to_string(id) for an overlapping copy at -O3.)
std::string tagOf(uint32_t id) {
  std::string tag = "t";
  tag += std::to_string(id);
  tag += '_';
  return tag;
}

// One thread's work: its own signal names carry its tag, so its messages are recognisable.
class Worker {
 public:
  Worker(uint32_t id, uint32_t handle, ZIN_CORE_REF ref)
      : id_(id), tag_(tagOf(id)), handle_(handle), ref_(ref), rng_(id * 2654435761u + 1) {}

  void run(std::chrono::steady_clock::time_point end) {
    for (uint32_t step = 0; step < kMaxStepsPerThread && std::chrono::steady_clock::now() < end;
         ++step) {
      one(next() % 100);
    }
  }

  std::vector<std::string> problems;
  uint32_t calls = 0;
  uint32_t failures = 0;

 private:
  uint32_t next() {
    rng_ = rng_ * 1664525u + 1013904223u;
    return rng_ >> 8;
  }

  // Checks one call: the result, and the messages it delivered to this thread.
  void check(const char* call, uint32_t result, const std::string& expectedText = "") {
    ++calls;
    std::vector<Delivered> got;
    got.swap(delivered);
    const std::string where = tag_ + " " + call + ": ";
    if (result != 0 && result != kFailure)
      problems.push_back(where + "result " + std::to_string(result));
    if (result == 0 && !got.empty())
      problems.push_back(where + "succeeded with \"" + got[0].text + "\"");
    if (result == kFailure) {
      ++failures;
      if (got.size() != 1) problems.push_back(where + std::to_string(got.size()) + " messages");
    }
    for (const Delivered& m : got) {
      if (m.handle != handle_) problems.push_back(where + "message of another session: " + m.text);
      if (m.code != 256)
        problems.push_back(where + "code " + std::to_string(m.code) + ": " + m.text);
      // Another thread's names never appear (the not-initialised message names no signal).
      for (uint32_t other = 1; other <= kWorkers; ++other) {
        std::string otherName = " ";
        otherName += tagOf(other);
        if (other != id_ && m.text.find(otherName) != std::string::npos) {
          problems.push_back(where + "message about another thread's signal: " + m.text);
        }
      }
      if (!expectedText.empty() && result == kFailure && m.text != expectedText &&
          m.text.rfind("Data structures not initialized", 0) != 0) {
        problems.push_back(where + "expected \"" + expectedText + "\", got \"" + m.text + "\"");
      }
    }
  }

  void one(uint32_t pick) {
    const std::string name = tag_ + std::to_string(next() % 3);
    if (pick < 15) {
      check("defineSignal",
            ZinMOX_defineSignal(handle_, &ref_, name.c_str(), ZINMOX_ASYNC_OUTPUT, next() % 16));
    } else if (pick < 25) {
      const uint32_t bits[3] = {next() % 12, next() % 12, next() % 12};
      check("defineBus",
            ZinMOX_defineBus(handle_, &ref_, (name + "in").c_str(), ZINMOX_SYNC_INPUT, bits, 3));
    } else if (pick < 45) {
      ZinRT::ZinMOX_ValueMap map{{name, next() % 2 != 0 ? "1" : "0"}};
      uintptr_t word = reinterpret_cast<uintptr_t>(&map);
      check("writeValues", ZinMOX_writeValues(handle_, &ref_, &word));
    } else if (pick < 55) {
      const std::string missing = tag_ + "missing";
      ZinRT::ZinMOX_ValueMap map{{missing, "1"}};
      uintptr_t word = reinterpret_cast<uintptr_t>(&map);
      const uint32_t result = ZinMOX_writeValues(handle_, &ref_, &word);
      if (result == 0) problems.push_back(tag_ + " write of an unknown name succeeded");
      check("writeValues(missing)", result, "Could not find a signal with the name: " + missing);
    } else if (pick < 70) {
      ZinRT::ZinMOX_ValueMap map;
      uintptr_t word = reinterpret_cast<uintptr_t>(&map);
      check("readValues", ZinMOX_readValues(handle_, &ref_, &word));
    } else if (pick < 78) {
      uint8_t data[2 * 16] = {};
      check("setPortBits", ZinMOX_setPortBits(handle_, &ref_, data, data, 16, data, data, 12));
    } else if (pick < 86) {
      uint8_t out[8][2] = {};
      check("getPortBits", ZinMOX_getPortBits(handle_, &ref_, out[0], out[1], out[2], 16, out[3],
                                              out[4], out[5], out[6], out[7], 12));
    } else if (pick < 94) {
      check("undefineName", ZinMOX_undefineName(handle_, &ref_, name.c_str(), ZINMOX_ASYNC_OUTPUT));
    } else if (pick < 97) {
      check("terminateCore", ZinMOX_terminateCore(handle_, &ref_));
    } else {
      check("initCore", ZinMOX_initCore(handle_, &ref_));
    }
  }

  uint32_t id_;
  std::string tag_;
  uint32_t handle_;
  ZIN_CORE_REF ref_;
  uint32_t rng_;
};

TEST(ThreadStress, ThreadsOnSharedAndSeparateSessionsKeepTheirMessagesApart) {
  const ZIN_CORE_REF first{1, 2, 0};
  const ZIN_CORE_REF second{1, 2, 1};
  const uint32_t shared = ZinJtag_openSession(moxTarget({first, second}));
  const uint32_t separate = ZinJtag_openSession(moxTarget({first}));
  for (uint32_t handle : {shared, separate}) {
    ZinJtag_setMessageHandler(handle, &recordOnThisThread, nullptr);
  }
  for (auto [handle, ref] : {std::pair{shared, first}, {shared, second}, {separate, first}}) {
    ASSERT_EQ(ZinMOX_initCore(handle, &ref), 0u);
  }

  std::vector<std::unique_ptr<Worker>> workers;
  workers.push_back(std::make_unique<Worker>(1, shared, first));
  workers.push_back(std::make_unique<Worker>(2, shared, first));
  workers.push_back(std::make_unique<Worker>(3, shared, first));
  workers.push_back(std::make_unique<Worker>(4, shared, second));
  workers.push_back(std::make_unique<Worker>(5, separate, first));
  workers.push_back(std::make_unique<Worker>(6, separate, first));
  const auto end = std::chrono::steady_clock::now() + kRunTime;
  std::vector<std::thread> threads;
  for (auto& worker : workers) threads.emplace_back([&worker, end] { worker->run(end); });
  for (std::thread& thread : threads) thread.join();

  uint32_t calls = 0;
  for (const auto& worker : workers) {
    calls += worker->calls;
    EXPECT_GT(worker->calls, 0u);
    EXPECT_GT(worker->failures, 0u) << "each thread provokes failures of its own";
    for (const std::string& problem : worker->problems) ADD_FAILURE() << problem;
  }
  EXPECT_GT(calls, 100u);
  for (uint32_t handle : {shared, separate}) {
    EXPECT_FALSE(ZinJtag_session_isLocked(handle));
    ZinJtag_closeSession(handle);
  }
}

// A close waits for the call in progress on another thread instead of destroying its core under
// it, and a call after the close fails cleanly.
TEST(ThreadStress, CloseWaitsForTheCallInProgressAndLaterCallsFail) {
  ZIN_CORE_REF ref{1, 2, 0};
  const auto transport = moxTarget({ref});
  const uint32_t handle = ZinJtag_openSession(transport);
  ZinJtag_setMessageHandler(handle, &recordOnThisThread, nullptr);
  ASSERT_EQ(ZinMOX_initCore(handle, &ref), 0u);
  ZinRT::ZinMOX_ValueMap map;
  uintptr_t word = reinterpret_cast<uintptr_t>(&map);
  transport->blockNextCommand();
  std::atomic<uint32_t> readResult{1};
  std::thread reader([&] { readResult = ZinMOX_readValues(handle, &ref, &word); });
  ASSERT_TRUE(transport->waitUntilBlocked(5000));
  std::atomic<bool> closed{false};
  std::thread closer([&] {
    ZinJtag_closeSession(handle);
    closed = true;
  });
  std::this_thread::sleep_for(std::chrono::milliseconds(200));
  EXPECT_FALSE(closed) << "the close did not wait for the call in progress";
  transport->release();
  reader.join();
  closer.join();
  EXPECT_EQ(readResult, 0u);
  EXPECT_EQ(ZinMOX_readValues(handle, &ref, &word), kFailure);
}

}  // namespace
