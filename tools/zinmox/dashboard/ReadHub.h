// The dashboard's one reader. A single thread reads the inputs of the live core at the chosen
// rate and keeps the latest reads; every open page is served from them, so the target sees at
// most one read per refresh interval however many pages watch.
#ifndef ZINMOX_DASHBOARD_READHUB_H
#define ZINMOX_DASHBOARD_READHUB_H

#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <deque>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "HostLink.h"
#include "Reading.h"

namespace zinmox::dashboard {

/// Read rates the hub accepts, in reads per second, and how many reads it keeps.
inline constexpr double kMinRateHz = 1;
inline constexpr double kMaxRateHz = 50;
inline constexpr double kDefaultRateHz = 20;
inline constexpr size_t kHistoryLength = 1000;

/// One read of the live core.
struct Sample {
  uint64_t seq = 0;     // 1, 2, ... over the dashboard's life
  uint64_t timeUs = 0;  // since the hub started
  std::vector<Reading> inputs;
};

/// What the hub does: which core it reads, how often, and whether it is paused.
struct LiveSettings {
  std::string core;  // empty: no core chosen yet
  double rateHz = kDefaultRateHz;
  bool paused = false;
};

/// A view of the hub's state for one page: the settings, the reads it has not seen yet and the
/// last read error.
struct HubState {
  uint64_t generation = 0;  // changes with every read, setting and error
  LiveSettings settings;
  std::vector<Sample> samples;
  std::string error;
  uint64_t historyStart = 0;  // seq of the oldest kept read (0: none kept)
};

class ReadHub {
 public:
  explicit ReadHub(HostLink& host);
  ~ReadHub();
  ReadHub(const ReadHub&) = delete;
  ReadHub& operator=(const ReadHub&) = delete;

  void start();
  /// Stops the thread and wakes every waiting page.
  void stop();
  bool stopped() const;

  /// Changes the settings (a missing one stays). A new core, or a change in the set of inputs,
  /// starts a new history. Throws ApiError for a rate out of bounds or a core that is not there.
  LiveSettings configure(const std::optional<std::string>& core,
                         const std::optional<double>& rateHz, const std::optional<bool>& paused);

  LiveSettings settings() const;
  /// Wakes the pages without a read: names or outputs changed.
  void notify();

  /// Waits until the generation differs from `seen` (or `timeout` passes, or the hub stops) and
  /// returns the state with the reads after `afterSeq` (at most `maxSamples`, the latest).
  HubState wait(uint64_t seen, uint64_t afterSeq, std::chrono::milliseconds timeout,
                size_t maxSamples);
  /// The kept reads, oldest first, and the core they come from.
  std::pair<std::string, std::vector<Sample>> history();
  /// Reads made since the start.
  uint64_t readCount();

 private:
  void run();
  void readOnce(const std::string& core);
  void changed();  // bumps the generation and wakes the pages (mutex_ held)

  HostLink& host_;
  mutable std::mutex mutex_;
  std::condition_variable wake_;    // pages waiting for news
  std::condition_variable settle_;  // the reader waiting for its next tick or a setting
  LiveSettings settings_;
  std::deque<Sample> history_;
  std::string error_;
  uint64_t generation_ = 1;
  uint64_t nextSeq_ = 1;
  uint64_t reads_ = 0;
  bool stopping_ = false;
  std::chrono::steady_clock::time_point start_ = std::chrono::steady_clock::now();
  std::thread thread_;
};

}  // namespace zinmox::dashboard

#endif
