// Status reads of an RTL model and of its simulated twin must agree.
#ifndef ZIN_TESTS_RTL_DIFF_SAMESTATUS_H
#define ZIN_TESTS_RTL_DIFF_SAMESTATUS_H

#include <gtest/gtest.h>

#include <vector>

#include "ZinRT/Zin_Transport.h"

/// The information fields agree, and the status word too: a MOX core's from bit 40 (the bits
/// the library decodes; below them the record carries the information), any other core's whole.
inline void expectSameStatus(ZinRT::Zin_Transport& sim, ZinRT::Zin_Transport& rtl,
                             const ZIN_CORE_REF& ref) {
  ZIN_CORE_INFO info[2] = {};
  std::vector<unsigned char> status[2] = {std::vector<unsigned char>(16),
                                          std::vector<unsigned char>(16)};
  sim.readStatus(ref, info[0], status[0].data(), 16, 128);
  rtl.readStatus(ref, info[1], status[1].data(), 16, 128);
  auto fields = [](const ZIN_CORE_INFO& i) {
    return std::vector<uint32_t>{i.manufacturerId, i.coreType, i.coreMajorVersion,
                                 i.coreMinorVersion, i.coreRevision};
  };
  EXPECT_EQ(fields(info[1]), fields(info[0])) << "core " << ref.coreIndex;
  const size_t first = info[0].coreType == 9 ? 5 : 0;
  EXPECT_EQ(std::vector<unsigned char>(status[1].begin() + first, status[1].end()),
            std::vector<unsigned char>(status[0].begin() + first, status[0].end()))
      << "core " << ref.coreIndex;
}

#endif
