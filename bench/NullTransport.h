// A transport that does nothing, so that benchmarks measure only the host library.
#ifndef ZIN_BENCH_NULLTRANSPORT_H
#define ZIN_BENCH_NULLTRANSPORT_H

#include <cstdint>
#include <string>
#include <vector>

#include "ZinRT/Zin_Transport.h"
#include "ZinTestKit/StatusWord.h"

namespace ZinBench {

/// Answers every status read with one MOX core of the widths it was made with, whatever the
/// reference; command sequences and flushes do nothing, so read data stay the zeros the
/// framework put there.
class NullTransport : public ZinRT::Zin_Transport {
 public:
  explicit NullTransport(const ZinTestKit::MoxStatus& status);

  void readStatus(const ZIN_CORE_REF& ref, ZIN_CORE_INFO& info, unsigned char* status,
                  uint32_t statusBytes, uint32_t statusBitCount) override;
  void commandSequence(const std::string& text, unsigned char* readData,
                       uint32_t readBitCount) override;
  void flush() override {}

 private:
  ZIN_CORE_INFO info_;
  std::vector<unsigned char> statusWord_;
};

}  // namespace ZinBench

#endif
