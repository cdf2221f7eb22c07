// A transport for tests: records every transfer and answers from what the test prepared.
#ifndef ZINTESTKIT_SCRIPTEDTRANSPORT_H
#define ZINTESTKIT_SCRIPTEDTRANSPORT_H

#include <condition_variable>
#include <cstdint>
#include <deque>
#include <map>
#include <mutex>
#include <string>
#include <tuple>
#include <vector>

#include "ZinRT/Zin_Transport.h"
#include "ZinTestKit/StatusWord.h"

namespace ZinTestKit {

/// A scripted target. Thread-safe: a test may inspect it or release a blocked transfer from
/// another thread.
class ScriptedTransport : public ZinRT::Zin_Transport {
 public:
  struct Transfer {
    std::string text;
    uint32_t readBitCount;
  };
  enum class Failure { None, Runtime, LogicError, BadAlloc, NonStandard };

  /// Places a core of any type with the given status bytes.
  void placeCore(const ZIN_CORE_REF& ref, const ZIN_CORE_INFO& info,
                 std::vector<unsigned char> status);
  /// Places a MOX core (type 9) whose status word says `status`.
  void placeMoxCore(const ZIN_CORE_REF& ref, const MoxStatus& status,
                    uint32_t manufacturerId = 0x1234, uint32_t revision = 1);
  void removeCore(const ZIN_CORE_REF& ref);

  /// Bytes answered to the next read sequences (those with a read bit count), in order; with none
  /// queued a read returns zeros.
  /// Bytes beyond the read buffer are dropped, missing ones read as zero.
  void queueReadData(std::vector<unsigned char> bytes);

  /// The next command sequence (or status read) throws: Runtime and LogicError with `text`,
  /// BadAlloc with std::bad_alloc, NonStandard with an int. A failed command sequence is not
  /// recorded among the transfers (the target never saw it); a failed status read is counted.
  void failNextCommand(Failure kind, std::string text = "scripted transfer failure");
  void failNextStatusRead(Failure kind, std::string text = "scripted status failure");

  /// The next command sequence waits inside the transport until release() is called.
  void blockNextCommand();
  /// Waits until a command sequence is blocked inside the transport (false on timeout).
  bool waitUntilBlocked(uint32_t timeoutMs);
  /// Lets the blocked command sequence go on; called before the sequence arrives, it lets the
  /// next blocked sequence pass at once.
  void release();

  std::vector<Transfer> transfers() const;
  uint32_t flushCount() const;
  uint32_t statusReadCount() const;
  void clearLog();

  void readStatus(const ZIN_CORE_REF& ref, ZIN_CORE_INFO& info, unsigned char* status,
                  uint32_t statusBytes, uint32_t statusBitCount) override;
  void commandSequence(const std::string& text, unsigned char* readData,
                       uint32_t readBitCount) override;
  void flush() override;
  bool listCores(std::vector<ZIN_CORE_REF>& refs) override;

 private:
  using Key = std::tuple<uint32_t, uint32_t, uint32_t>;
  struct PlacedCore {
    ZIN_CORE_INFO info;
    std::vector<unsigned char> status;
  };
  static Key keyOf(const ZIN_CORE_REF& ref) {
    return {ref.deviceIndex, ref.userChainNumber, ref.coreIndex};
  }
  static void raise(Failure kind, const std::string& text);
  void waitIfBlocked(std::unique_lock<std::mutex>& lock);

  mutable std::mutex mutex_;
  std::condition_variable changed_;
  std::map<Key, PlacedCore> cores_;
  std::deque<std::vector<unsigned char>> readData_;
  std::vector<Transfer> transfers_;
  Failure commandFailure_ = Failure::None;
  std::string commandFailureText_;
  Failure statusFailure_ = Failure::None;
  std::string statusFailureText_;
  bool blockNext_ = false;
  bool blocked_ = false;
  bool released_ = false;
  uint32_t flushes_ = 0;
  uint32_t statusReads_ = 0;
};

}  // namespace ZinTestKit

#endif
