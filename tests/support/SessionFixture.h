// A test fixture with one JTAG session on a scripted target, recording the session's messages.
#ifndef ZIN_TEST_SUPPORT_SESSIONFIXTURE_H
#define ZIN_TEST_SUPPORT_SESSIONFIXTURE_H

#include <gtest/gtest.h>

#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "ZinMOX/ZinMOX.h"
#include "ZinMOX/ZinMOX_Core.h"
#include "ZinTestKit/ScriptedTransport.h"
#include "support/WireFormat.h"

namespace ZinTest {

/// One message delivered to the session's host, with whether the session's target lock was held
/// (by any thread) when it was delivered.
struct RecordedMessage {
  uint32_t code;
  std::string text;
  bool lockHeld;
  bool operator==(const RecordedMessage&) const = default;
};

inline constexpr uint32_t kFailure = 0x80000000u;
inline constexpr uint32_t kErrorCode = 256;
inline constexpr uint32_t kAbortCode = 32768;

/// The text of the std::logic_error that `call` throws (a test failure if it throws none).
std::string logicErrorOf(const std::function<void()>& call);

/// Opens a session on a fresh ScriptedTransport in SetUp, records every message of the session
/// (thread-safe), and closes the session in TearDown (which also destroys its registered cores).
class SessionFixture : public ::testing::Test {
 protected:
  void SetUp() override;
  void TearDown() override;

  /// The messages recorded so far, in delivery order.
  std::vector<RecordedMessage> messages() const;
  void clearMessages();
  /// Checks that `result` is a failure reported by exactly one message with code 256, sent
  /// after the target lock was released, and returns its text. Clears the record.
  std::string errorOf(uint32_t result);
  /// Checks for the two messages of a call on a core of the wrong type: `text` (code 256) while
  /// the lock is held, then "Zin abort command" (code 32768) after it. Clears the record.
  void expectWrongCoreType(const std::string& text);
  void expectNoMessages();

  /// Places a MOX core with the given port widths at `coreRef` (full status layout), runs
  /// ZinMOX_initCore on it, and clears the transport's log and the recorded messages.
  ZinRT::ZinMOX_Core* initMoxCore(const ZIN_CORE_REF& coreRef, uint32_t asyncIn, uint32_t syncIn,
                                  uint32_t asyncOut, uint32_t syncOut);
  /// The MOX core registered at `coreRef`, or null.
  ZinRT::ZinMOX_Core* registeredCore(const ZIN_CORE_REF& coreRef) const;
  uint32_t defineBus(const char* name, uint32_t type, std::vector<uint32_t> bits);
  /// The image of the last write sequence sent to `ref` (a test failure if none was sent).
  WriteImage lastWrite(uint32_t asyncOut, uint32_t syncOut);

  /// "DD C K " for a core reference, as the command lines start.
  static std::string linePrefix(const ZIN_CORE_REF& coreRef);

  std::shared_ptr<ZinTestKit::ScriptedTransport> transport;
  uint32_t handle = 0;
  /// The reference most tests use: device 1, user chain 2, core 0.
  ZIN_CORE_REF ref{1, 2, 0};

 private:
  static void onMessage(void* user, uint32_t handle, uint32_t code, const char* text);

  mutable std::mutex mutex_;
  std::vector<RecordedMessage> messages_;
};

/// The word that the value-map arguments point to: the map's address.
inline uintptr_t mapWord(ZinRT::ZinMOX_ValueMap& map) {
  return reinterpret_cast<uintptr_t>(&map);
}

}  // namespace ZinTest

#endif
