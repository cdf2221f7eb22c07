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
  const size_t n = 4ull * asyncIn + 6ull * syncIn;
  const std::string all = ZinTest::unpackBits(data.data(), r);
  EXPECT_EQ(all.find('1', n), std::string::npos) << "a read bit above the input image";
  const std::string b(all.rend() - static_cast<long>(n), all.rend());  // B[j] is bit n-1-j
  ZinTest::InputImage image = ZinTest::InputImage::zeros(asyncIn, syncIn);
  std::string* const places[] = {&image.asyncValue, &image.asyncUp,     &image.asyncDown,
                                 &image.syncValue,  &image.syncUp,      &image.syncDown,
                                 &image.syncSyncUp, &image.syncSyncDown};
  for (size_t i = 0; i < asyncIn; ++i) {
    for (size_t f = 0; f < 3; ++f) (*places[f])[i] = b[4 * i + f];
    EXPECT_EQ(b[4 * i + 3], '0') << "unused bit of async input " << i;
  }
  for (size_t i = 0, base = 4ull * asyncIn; i < syncIn; ++i, base += 6) {
    for (size_t f = 0; f < 5; ++f) (*places[3 + f])[i] = b[base + f];
    EXPECT_EQ(b[base + 5], '0') << "unused bit of sync input " << i;
  }
  return image;
}

}  // namespace ZinSimTest

#endif
