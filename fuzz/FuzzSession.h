// A JTAG session on a scripted target for the fuzzers, with the checks every exported call must
// pass: a result of 0 without a message, or 0x80000000 with messages of the library's own texts.
#ifndef ZIN_FUZZ_FUZZSESSION_H
#define ZIN_FUZZ_FUZZSESSION_H

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "ZinMOX/ZinMOX.h"
#include "ZinTestKit/ScriptedTransport.h"

namespace ZinFuzz {

struct Message {
  uint32_t code;
  std::string text;
};

/// Prints what went wrong and aborts, so that the fuzzer (or the corpus replay) reports it.
[[noreturn]] void fail(const std::string& what);

class FuzzSession {
 public:
  FuzzSession();
  ~FuzzSession();
  FuzzSession(const FuzzSession&) = delete;
  FuzzSession& operator=(const FuzzSession&) = delete;

  /// Places a MOX core with the given widths (full status layout) at `ref`.
  void placeCore(const ZIN_CORE_REF& ref, uint32_t asyncIn, uint32_t syncIn, uint32_t asyncOut,
                 uint32_t syncOut);

  /// Checks the outcome of one exported call named `call` and forgets its messages: 0 with no
  /// message, or 0x80000000 with at least one message, each of code 256 or 32768 and each
  /// starting with one of the library's message beginnings (a text of the framework, such as a
  /// conversion or buffer error, or "Zin internal error." means a fault of the library).
  void check(const char* call, uint32_t result);

  uint32_t handle() const { return handle_; }
  ZinTestKit::ScriptedTransport& transport() { return *transport_; }

 private:
  static void onMessage(void* user, uint32_t handle, uint32_t code, const char* text);

  std::shared_ptr<ZinTestKit::ScriptedTransport> transport_;
  uint32_t handle_ = 0;
  std::vector<Message> messages_;
};

}  // namespace ZinFuzz

#endif
