// Helpers of the simulator tests: small descriptions, command texts and a decoder of read data
// written independently of the simulator.
#ifndef ZIN_TESTS_SIM_SIMTESTUTIL_H
#define ZIN_TESTS_SIM_SIMTESTUTIL_H

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "ZinSim/Target.h"
#include "support/WireFormat.h"

namespace ZinSimTest {

/// A MOX core description (full layout) at `ref` with the given widths and default wiring.
inline ZinSim::CoreDescription moxCore(ZIN_CORE_REF ref, uint32_t asyncIn, uint32_t syncIn,
                                       uint32_t asyncOut, uint32_t syncOut) {
  ZinSim::CoreDescription core;
  core.ref = ref;
  core.asyncInputs = asyncIn;
  core.syncInputs = syncIn;
  core.asyncOutputs = asyncOut;
  core.syncOutputs = syncOut;
  return core;
}

inline std::shared_ptr<ZinSim::Target> targetWith(std::vector<ZinSim::CoreDescription> cores) {
  ZinSim::TargetDescription description;
  description.cores = std::move(cores);
  return std::make_shared<ZinSim::Target>(description);
}

/// The two-line write sequence of `image` for the core at `prefix` ("DD C K ").
inline std::string writeText(const std::string& prefix, const ZinTest::WriteImage& image) {
  const size_t bits = 2 * image.asyncValues.size() + 17 * image.steps.size() + 1;
  char length[16];
  std::snprintf(length, sizeof length, "%08zX", bits);
  return prefix + "01 0 " + length + " " + ZinTest::writeDataHex(image) + "\n" + prefix +
         "02 0 00000004 0";
}

/// Sends the read sequence of a core with the given input widths and decodes the answer.
inline ZinTest::InputImage readInputs(ZinSim::Target& target, const std::string& prefix,
                                      uint32_t asyncIn, uint32_t syncIn) {
  const uint32_t r = ZinTest::readBitCount(asyncIn, syncIn);
  std::vector<unsigned char> data(r / 8, 0);
  target.commandSequence(ZinTest::readCommandText(prefix, asyncIn, syncIn), data.data(), r);
  const uint64_t n = 4ull * asyncIn + 6ull * syncIn;
  auto bit = [&](uint64_t j) {  // B[j] is bit n-1-j of the little-endian number
    const uint64_t b = n - 1 - j;
    return ((data[b / 8] >> (b % 8)) & 1) ? '1' : '0';
  };
  ZinTest::InputImage image = ZinTest::InputImage::zeros(asyncIn, syncIn);
  for (uint64_t i = 0; i < asyncIn; ++i) {
    image.asyncValue[i] = bit(4 * i);
    image.asyncUp[i] = bit(4 * i + 1);
    image.asyncDown[i] = bit(4 * i + 2);
    EXPECT_EQ(bit(4 * i + 3), '0') << "unused bit of async input " << i;
  }
  for (uint64_t i = 0; i < syncIn; ++i) {
    const uint64_t base = 4ull * asyncIn + 6 * i;
    image.syncValue[i] = bit(base);
    image.syncUp[i] = bit(base + 1);
    image.syncDown[i] = bit(base + 2);
    image.syncSyncUp[i] = bit(base + 3);
    image.syncSyncDown[i] = bit(base + 4);
    EXPECT_EQ(bit(base + 5), '0') << "unused bit of sync input " << i;
  }
  for (uint64_t b = n; b < 8ull * data.size(); ++b) {
    EXPECT_EQ((data[b / 8] >> (b % 8)) & 1, 0) << "read bit " << b << " above the input image";
  }
  return image;
}

}  // namespace ZinSimTest

#endif
