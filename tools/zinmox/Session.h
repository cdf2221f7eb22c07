// One JTAG session of the tool on its target, with the cores it has initialised and the signals
// it has defined. A plain invocation uses one Session; `run` keeps one for all its lines.
#ifndef ZINMOX_TOOL_SESSION_H
#define ZINMOX_TOOL_SESSION_H

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "ZinHost/Signals.h"
#include "ZinHost/Target.h"
#include "ZinMOX/ZinMOX.h"
#include "ZinRT/ZinCore_Types.h"
#include "ZinRT/Zin_Transport.h"

namespace zinmox {

class Session {
 public:
  /// `targetText` as ZinHost::openTarget takes it; nothing is opened until the first use.
  explicit Session(std::string targetText = "");
  ~Session();
  Session(const Session&) = delete;
  Session& operator=(const Session&) = delete;

  /// Where the target comes from; may change only before the session is opened.
  void setTargetText(const std::string& targetText);
  const std::string& targetText() const { return targetText_; }
  /// The token and certificate authorities for a target server (and for `serve` itself).
  ZinHost::ServerAccess& serverAccess() { return access_; }

  /// The session handle; opens the target and the session on first use.
  uint32_t handle();
  /// The cores where a status read answers, in reference order.
  std::vector<ZIN_CORE_REF> listCores();

  /// Hands every later session message to `observer` as well (after it is printed); an empty
  /// function stops that. Clients that report failures elsewhere (the dashboard) collect them so.
  void setMessageObserver(std::function<void(uint32_t code, const std::string& text)> observer);

  /// Turns the return code of an exported call into a Failure; the session's messages have
  /// already been printed by then (`what` is printed only if none were).
  void check(uint32_t returnCode, const std::string& what);

  /// Makes sure the core at `ref` is initialised in this session (once per reference).
  void useCore(const ZIN_CORE_REF& ref);
  /// The information of an initialised core (its port widths), read once per core.
  const ZINMOX_CORE_INFO& coreInfo(const ZIN_CORE_REF& ref);
  /// Defines a signal on an initialised core. An identical definition made before is kept; a
  /// different one of the same name and direction is replaced.
  void defineSignal(const ZIN_CORE_REF& ref, const ZinHost::SignalDefinition& signal);
  /// Removes a name that was defined on the core.
  void undefineSignal(const ZIN_CORE_REF& ref, const std::string& name, ZinHost::Port port);
  /// Reads a signals file and defines its signals on the core (lists capped at the port widths).
  void loadSignals(const ZIN_CORE_REF& ref, const std::string& path);

  /// Whether the current command runs as a line of a script (run, demo).
  bool inScript() const { return inScript_; }
  void setInScript(bool inScript) { inScript_ = inScript; }

 private:
  static void onMessage(void* user, uint32_t handle, uint32_t code, const char* text);

  using DefinitionKey = std::pair<bool, std::string>;  // (input?, lower-case name)
  struct Definition {
    ZinHost::Port port;
    std::vector<uint32_t> bits;
  };
  struct CoreState {
    std::map<DefinitionKey, Definition> definitions;
    std::optional<ZINMOX_CORE_INFO> info;
  };

  std::string targetText_;
  ZinHost::ServerAccess access_;
  std::shared_ptr<ZinRT::Zin_Transport> transport_;
  uint32_t handle_ = 0;
  uint64_t messageCount_ = 0;
  uint64_t checkedCount_ = 0;  // messageCount_ at the last check
  bool inScript_ = false;
  std::function<void(uint32_t, const std::string&)> observer_;
  std::map<uint32_t, CoreState> cores_;  // by packed reference
};

}  // namespace zinmox

#endif
