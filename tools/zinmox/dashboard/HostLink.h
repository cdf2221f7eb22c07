// The dashboard's one link to the tool's host code: target opening, the session and its core
// bookkeeping, reference, bit-list and hex texts. Everything the dashboard does to a target
// passes through HostLink, under its one lock, so requests from several tabs and the shared
// reader never interleave inside the session.
#ifndef ZINMOX_DASHBOARD_HOSTLINK_H
#define ZINMOX_DASHBOARD_HOSTLINK_H

#include <cstdint>
#include <map>
#include <mutex>
#include <nlohmann/json.hpp>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "Reading.h"

namespace zinmox {
class Session;
}

namespace zinmox::dashboard {

/// A request that the dashboard refuses: the HTTP status and a text for the user.
class ApiError : public std::runtime_error {
 public:
  ApiError(int status, const std::string& text) : std::runtime_error(text), status_(status) {}
  int status() const { return status_; }

 private:
  int status_;
};

/// A name defined through the dashboard.
struct Definition {
  std::string name;
  std::string port;  // "async_out", "sync_out", "async_in", "sync_in"
  std::string bits;  // "0-7"
  uint32_t width = 0;
};

/// Names per core that the dashboard defines at most, and their longest length.
inline constexpr size_t kMaxNamesPerCore = 64;
inline constexpr size_t kMaxNameLength = 64;

class HostLink {
 public:
  explicit HostLink(Session& session);
  ~HostLink();
  HostLink(const HostLink&) = delete;
  HostLink& operator=(const HostLink&) = delete;

  /// How the target is named ("the built-in demo design", ...). Opens it on first use.
  std::string targetName();
  /// {"target": ..., "cores": [{"core": "0:1:0", "mox": true, "core_type": 9, ...}]}.
  nlohmann::json scan();
  /// The canonical text of a MOX core's reference ("0x0:1:0" gives "0:1:0"); 400 for a
  /// malformed text, 404 when no MOX core is there.
  std::string moxCore(const std::string& refText);
  /// {"core", "info": {twelve fields}, "names": [definitions and whole ports], "outputs": {...}}.
  nlohmann::json coreDetails(const std::string& refText);

  void define(const std::string& refText, const std::string& name, const std::string& port,
              const std::string& bits);
  void undefine(const std::string& refText, const std::string& name, const std::string& port);
  /// Drives outputs in one transfer: (NAME or NAME.pulsetrain, hex) pairs.
  void write(const std::string& refText,
             const std::vector<std::pair<std::string, std::string>>& assignments);
  /// Every input of the core with its activity, in one read (which clears the activity).
  std::vector<Reading> read(const std::string& refText);

  /// Changes whenever a name is defined or removed, or an output is written.
  uint64_t version();

 private:
  std::string moxCoreLocked(const std::string& refText);
  void collectScan();
  [[noreturn]] void rethrow(const std::exception& error);
  template <typename Work>
  auto guarded(Work&& work);

  Session& session_;
  std::mutex mutex_;
  std::vector<std::string> messages_;  // the session's messages during the current call
  nlohmann::json scan_;                // filled on first use
  std::map<std::string, std::vector<Definition>> names_;               // by core
  std::map<std::string, std::map<std::string, std::string>> written_;  // core: key -> hex
  uint64_t version_ = 1;
};

}  // namespace zinmox::dashboard

#endif
