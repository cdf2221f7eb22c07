// The RTL loopback design against the simulated target: the same random command sequences go to
// both; once both have settled after each sequence, read data and output levels must agree, and
// status reads once per configuration (docs/rtlsim.md). ZINMOX_RTL_DIFF_SEQUENCES (default 150)
// and ZINMOX_RTL_DIFF_SEED (default 1) choose a longer or another run.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include "ModelPins.h"
#include "Vloop_16_8_16_12.h"
#include "Vloop_1_1_1_1.h"
#include "Vloop_3_5_7_2.h"
#include "ZinHub/HubTransport.h"
#include "ZinSim/Target.h"
#include "verilated.h"

namespace {

constexpr ZIN_CORE_REF kRef{0, 1, 0};
constexpr uint64_t kSettleCycles = 40;  // pulse trains hold their last step after 16 cycles

uint64_t envNumber(const char* name, uint64_t fallback) {
  const char* text = std::getenv(name);
  return text != nullptr && *text != '\0' ? std::strtoull(text, nullptr, 10) : fallback;
}

// The information fields agree, and so does the status word from record bit 40 on.
void expectSameStatus(ZinRT::Zin_Transport& sim, ZinRT::Zin_Transport& rtl) {
  ZIN_CORE_INFO info[2] = {};
  unsigned char status[2][16] = {};
  sim.readStatus(kRef, info[0], status[0], 16, 128);
  rtl.readStatus(kRef, info[1], status[1], 16, 128);
  EXPECT_EQ(std::memcmp(&info[0], &info[1], sizeof info[0]), 0);
  EXPECT_EQ(std::memcmp(status[0] + 5, status[1] + 5, 11), 0);
}

struct Widths {
  unsigned asyncOut, syncOut, asyncIn, syncIn;
};

std::string levelText(uint64_t port, unsigned width) {
  std::string text(width, '0');
  for (unsigned i = 0; i < width; ++i) text[i] = ((port >> i) & 1U) != 0 ? '1' : '0';
  return text;
}

std::shared_ptr<ZinSim::Target> simTwin(Widths w) {
  ZinSim::CoreDescription core;
  core.ref = kRef;
  core.asyncOutputs = w.asyncOut;
  core.syncOutputs = w.syncOut;
  core.asyncInputs = w.asyncIn;
  core.syncInputs = w.syncIn;
  ZinSim::TargetDescription description;
  description.cores.push_back(core);
  return std::make_shared<ZinSim::Target>(description);
}

std::string hex8(size_t value) {
  char text[16];
  std::snprintf(text, sizeof text, "%08zX", value);
  return text;
}

struct Sequence {
  std::string text;
  uint32_t readBits = 0;
};

// A random command sequence for one core, in the library's line format: stage + commit, stage,
// commit, capture + clear, capture, or clear.
Sequence randomSequence(const Widths& widths, std::mt19937_64& rng) {
  const int pick = std::uniform_int_distribution<int>(0, 9)(rng);
  const uint32_t capture = 4 * widths.asyncIn + 6 * widths.syncIn + 16;
  const std::string commit = "00 1 0 02 0 00000004 0", clear = "00 1 0 04 1 00000004 0";
  const std::string read = "00 1 0 03 1 " + hex8(capture) + " 0";
  const uint32_t readBits = (capture + 7) / 8 * 8;
  const auto stageLine = [&] {
    const size_t bits = 2 * widths.asyncOut + 17 * widths.syncOut;  // the number's low L-1 bits
    std::string hex((bits + 3) / 4, '0');
    for (size_t digit = 0; digit < hex.size(); ++digit) {
      const size_t valid = std::min<size_t>(4, bits - 4 * digit);
      hex[hex.size() - 1 - digit] = "0123456789ABCDEF"[rng() & ((1U << valid) - 1)];
    }
    return "00 1 0 01 0 " + hex8(bits + 1) + " " + hex;
  };
  if (pick < 4) return {stageLine() + "\n" + commit};
  if (pick == 4) return {stageLine()};
  if (pick == 5) return {commit};
  if (pick < 8) return {read + "\n" + clear, readBits + 8};
  return pick == 8 ? Sequence{read, readBits} : Sequence{clear, 8};
}

// The verilated loopback design behind the hub transport, against its simulated twin.
template <class Model>
void runPair(Widths widths, ZinRtl::ClockRatio ratio) {
  VerilatedContext context;
  Model model(&context);
  ZinRtl::ModelPins<Model> pins(model, ratio);
  pins.powerOn();
  ZinHub::HubTransport rtl(std::make_shared<ZinHub::PinJtagEngine>(pins));
  const std::shared_ptr<ZinSim::Target> sim = simTwin(widths);
  expectSameStatus(*sim, rtl);
  std::vector<ZIN_CORE_REF> cores;
  ASSERT_TRUE(rtl.listCores(cores));
  ASSERT_EQ(cores.size(), 1U);

  const uint64_t count = envNumber("ZINMOX_RTL_DIFF_SEQUENCES", 150);
  std::mt19937_64 rng(envNumber("ZINMOX_RTL_DIFF_SEED", 1));
  for (uint64_t n = 0; n < count; ++n) {
    const Sequence sequence = randomSequence(widths, rng);
    const uint32_t bits = sequence.readBits;
    std::vector<unsigned char> simData(bits / 8 + 1), rtlData(bits / 8 + 1);
    sim->commandSequence(sequence.text, simData.data(), bits);
    rtl.commandSequence(sequence.text, rtlData.data(), bits);
    sim->advance(kSettleCycles);
    pins.runDesignCycles(kSettleCycles);
    ASSERT_EQ(rtlData, simData) << "read data after sequence " << n << ":\n" << sequence.text;
    ASSERT_EQ(levelText(model.async_out_o, widths.asyncOut) + " " +
                  levelText(model.sync_out_o, widths.syncOut),
              sim->asyncOutputLevels(kRef) + " " + sim->syncOutputLevels(kRef))
        << "levels after sequence " << n;
  }
  model.final();
}

// Each configuration runs at its own clock ratio: design clock faster than TCK, slower, and
// much faster, so the handshakes meet every phase relation.
TEST(RtlDiff, SmallestCore) {
  runPair<Vloop_1_1_1_1>({1, 1, 1, 1}, {7, 5});
}
TEST(RtlDiff, OddWidths) {
  runPair<Vloop_3_5_7_2>({3, 5, 7, 2}, {3, 7});
}
TEST(RtlDiff, DemoCoreWidths) {
  runPair<Vloop_16_8_16_12>({16, 8, 16, 12}, {13, 4});
}

}  // namespace
