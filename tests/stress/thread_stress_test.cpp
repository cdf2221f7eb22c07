// Several threads on one session (one core and a second core) and on a second session mix
// define, write, read, port, terminate and init calls through the exported functions. Every call
// returns 0 or 0x80000000, a failed call delivers exactly one message to the thread that made it
// and a successful one none, and no thread receives a message about another thread's signals.
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <cstdint>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "ZinMOX/ZinMOX.h"
#include "ZinRT/ZinJtag.h"
#include "ZinTestKit/ScriptedTransport.h"

namespace {

constexpr uint32_t kFailure = 0x80000000u;
constexpr uint32_t kWorkers = 6;

// The messages delivered on this thread (the call frame reports on the calling thread).
struct Delivered {
  uint32_t handle, code;
  std::string text;
};
thread_local std::vector<Delivered> delivered;

void recordOnThisThread(void*, uint32_t handle, uint32_t code, const char* text) {
  delivered.push_back({handle, code, text != nullptr ? text : ""});
}

// A scripted target with a 16/12/16/12 MOX core at each of `refs`.
std::shared_ptr<ZinTestKit::ScriptedTransport> moxTarget(const std::vector<ZIN_CORE_REF>& refs) {
  auto transport = std::make_shared<ZinTestKit::ScriptedTransport>();
  const ZinTestKit::MoxStatus status{
      .asyncInputCount = 16, .syncInputCount = 12, .asyncOutputCount = 16, .syncOutputCount = 12};
  for (const ZIN_CORE_REF& ref : refs) transport->placeMoxCore(ref, status);
  return transport;
}

// "t<id>_", the start of every signal name of one thread. (Built by appending: g++ 12 mistakes
// "t" + std::to_string(id) for an overlapping copy at -O3.)
std::string tagOf(uint32_t id) {
  std::string tag = "t";
  tag += std::to_string(id);
  tag += '_';
  return tag;
}

class Worker {
 public:
  Worker(uint32_t id, uint32_t handle, ZIN_CORE_REF ref)
      : id_(id), tag_(tagOf(id)), handle_(handle), ref_(ref), rng_(id * 2654435761u + 1) {}

  void run(std::chrono::steady_clock::time_point end) {
    for (uint32_t step = 0; step < 4000 && std::chrono::steady_clock::now() < end; ++step) {
      one(next() % 100);
    }
  }

  std::vector<std::string> problems;
  uint32_t calls = 0, failures = 0;

 private:
  uint32_t next() { return (rng_ = rng_ * 1664525u + 1013904223u) >> 8; }

  // Checks one call's result and the messages it delivered to this thread; a failure with an
  // `expected` text may only carry that text or the not-initialised one.
  void check(const char* call, uint32_t result, const std::string& expected = "") {
    ++calls;
    std::vector<Delivered> got;
    got.swap(delivered);
    const std::string where = tag_ + " " + call + ": ";
    failures += result == kFailure;
    if (result != 0 && result != kFailure) problems.push_back(where + std::to_string(result));
    if (got.size() != (result == kFailure ? 1u : 0u)) {
      problems.push_back(where + std::to_string(got.size()) + " messages");
    }
    for (const Delivered& m : got) {
      if (m.handle != handle_ || m.code != 256) problems.push_back(where + "wrong session or code");
      for (uint32_t other = 1; other <= kWorkers; ++other) {
        if (other != id_ && m.text.find(" " + tagOf(other)) != std::string::npos) {
          problems.push_back(where + "message about another thread's signal: " + m.text);
        }
      }
      if (!expected.empty() && m.text != expected &&
          m.text.rfind("Data structures not initialized", 0) != 0) {
        problems.push_back(where + "expected \"" + expected + "\", got \"" + m.text + "\"");
      }
    }
  }

  void one(uint32_t pick) {
    const std::string name = tag_ + std::to_string(next() % 3);
    ZinRT::ZinMOX_ValueMap map;
    uintptr_t word = reinterpret_cast<uintptr_t>(&map);
    uint8_t data[8][2] = {};
    const uint32_t h = handle_;
    ZIN_CORE_REF* r = &ref_;
    const uint8_t steps[16 * 2] = {};  // sixteen step vectors of twelve bits
    if (pick < 15) {
      check("define", ZinMOX_defineSignal(h, r, name.c_str(), ZINMOX_ASYNC_OUTPUT, next() % 16));
    } else if (pick < 25) {
      const uint32_t bits[3] = {next() % 12, next() % 12, next() % 12};
      check("defineBus", ZinMOX_defineBus(h, r, (name + "in").c_str(), ZINMOX_SYNC_INPUT, bits, 3));
    } else if (pick < 45) {
      map[name] = next() % 2 != 0 ? "1" : "0";
      check("writeValues", ZinMOX_writeValues(h, r, &word));
    } else if (pick < 55) {
      map[tag_ + "missing"] = "1";
      const uint32_t result = ZinMOX_writeValues(h, r, &word);
      if (result == 0) problems.push_back(tag_ + " write of an unknown name succeeded");
      check("write(missing)", result, "Could not find a signal with the name: " + tag_ + "missing");
    } else if (pick < 70) {
      check("readValues", ZinMOX_readValues(h, r, &word));
    } else if (pick < 78) {
      check("setPortBits", ZinMOX_setPortBits(h, r, data[0], data[1], 16, steps, data[3], 12));
    } else if (pick < 86) {
      check("getPortBits", ZinMOX_getPortBits(h, r, data[0], data[1], data[2], 16, data[3], data[4],
                                              data[5], data[6], data[7], 12));
    } else if (pick < 94) {
      check("undefineName", ZinMOX_undefineName(h, r, name.c_str(), ZINMOX_ASYNC_OUTPUT));
    } else if (pick < 97) {
      check("terminateCore", ZinMOX_terminateCore(h, r));
    } else {
      check("initCore", ZinMOX_initCore(h, r));
    }
  }

  uint32_t id_;
  std::string tag_;
  uint32_t handle_;
  ZIN_CORE_REF ref_;
  uint32_t rng_;
};

TEST(ThreadStress, ThreadsOnSharedAndSeparateSessionsKeepTheirMessagesApart) {
  const ZIN_CORE_REF first{1, 2, 0}, second{1, 2, 1};
  const uint32_t shared = ZinJtag_openSession(moxTarget({first, second}));
  const uint32_t separate = ZinJtag_openSession(moxTarget({first}));
  const std::vector<std::pair<uint32_t, ZIN_CORE_REF>> places = {
      {shared, first},  {shared, first},   {shared, first},
      {shared, second}, {separate, first}, {separate, first}};
  std::vector<std::unique_ptr<Worker>> workers;
  for (auto [handle, ref] : places) {
    ZinJtag_setMessageHandler(handle, &recordOnThisThread, nullptr);
    ASSERT_EQ(ZinMOX_initCore(handle, &ref), 0u);
    workers.push_back(std::make_unique<Worker>(workers.size() + 1, handle, ref));
  }
  const auto end = std::chrono::steady_clock::now() + std::chrono::milliseconds(1500);
  std::vector<std::thread> threads;
  for (auto& worker : workers) threads.emplace_back([&worker, end] { worker->run(end); });
  for (std::thread& thread : threads) thread.join();
  for (const auto& worker : workers) {
    EXPECT_GT(worker->calls, 10u);
    EXPECT_GT(worker->failures, 0u) << "each thread provokes failures of its own";
    for (const std::string& problem : worker->problems) ADD_FAILURE() << problem;
  }
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
