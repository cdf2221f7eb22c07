// The verilated demo design against the simulated demo design, and the library driving the RTL
// through the hub transport.
#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "ModelPins.h"
#include "SameStatus.h"
#include "Vzinmox_demo_top.h"
#include "ZinHub/HubTransport.h"
#include "ZinMOX/ZinMOX.h"
#include "ZinRT/ZinJtag.h"
#include "ZinSim/Target.h"
#include "verilated.h"

namespace {

class VerilatedDemo {
 public:
  VerilatedDemo() : model_(&context_), pins_(model_, ZinRtl::ClockRatio{}) {
    pins_.powerOn();
    transport =
        std::make_shared<ZinHub::HubTransport>(std::make_shared<ZinHub::PinJtagEngine>(pins_));
  }
  ~VerilatedDemo() { model_.final(); }

  std::shared_ptr<ZinHub::HubTransport> transport;

 private:
  VerilatedContext context_;
  Vzinmox_demo_top model_;
  ZinRtl::ModelPins<Vzinmox_demo_top> pins_;
};

bool sameRef(const ZIN_CORE_REF& a, const ZIN_CORE_REF& b) {
  return a.deviceIndex == b.deviceIndex && a.userChainNumber == b.userChainNumber &&
         a.coreIndex == b.coreIndex;
}

TEST(RtlDemo, SameCoresAndStatusAsTheSimulatedDemo) {
  VerilatedDemo rtl;
  ZinSim::Target sim;
  std::vector<ZIN_CORE_REF> rtlCores, simCores;
  ASSERT_TRUE(rtl.transport->listCores(rtlCores));
  ASSERT_TRUE(sim.listCores(simCores));
  ASSERT_EQ(rtlCores.size(), simCores.size());
  for (size_t i = 0; i < simCores.size(); ++i) {
    ASSERT_TRUE(sameRef(rtlCores[i], simCores[i])) << "core " << i;
    expectSameStatus(sim, *rtl.transport, simCores[i]);
  }
}

TEST(RtlDemo, LibraryWritesAndReadsThroughTheHub) {
  VerilatedDemo rtl;
  const uint32_t handle = ZinJtag_openSession(rtl.transport);
  ZIN_CORE_REF ref{0, 1, 1};  // the middle-layout core, plain loopback
  ASSERT_EQ(ZinMOX_initCore(handle, &ref), ZINMOX_SUCCESS);
  uint32_t bits[] = {0, 1, 2, 3, 4, 5, 6, 7};
  ASSERT_EQ(ZinMOX_defineBus(handle, &ref, "leds", ZINMOX_ASYNC_OUTPUT, bits, 8), ZINMOX_SUCCESS);
  ASSERT_EQ(ZinMOX_defineBus(handle, &ref, "leds_in", ZINMOX_ASYNC_INPUT, bits, 8), ZINMOX_SUCCESS);
  ASSERT_EQ(ZinMOX_defineSignal(handle, &ref, "strobe", ZINMOX_SYNC_OUTPUT, 1), ZINMOX_SUCCESS);
  ASSERT_EQ(ZinMOX_defineSignal(handle, &ref, "strobe_in", ZINMOX_SYNC_INPUT, 1), ZINMOX_SUCCESS);

  ZinRT::ZinMOX_ValueMap values{{"leds", "A5"}, {"strobe.pulsetrain", "0000000000000100"}};
  uintptr_t word = reinterpret_cast<uintptr_t>(&values);
  ASSERT_EQ(ZinMOX_writeValues(handle, &ref, &word), ZINMOX_SUCCESS);
  ZinRT::ZinMOX_ValueMap inputs;
  word = reinterpret_cast<uintptr_t>(&inputs);
  ASSERT_EQ(ZinMOX_readValues(handle, &ref, &word), ZINMOX_SUCCESS);
  EXPECT_EQ(inputs["leds_in"], "A5");
  EXPECT_EQ(inputs["leds_in.activity_up"], "A5");
  // A one-step pulse (step 1) came and went during the read's wait bits.
  EXPECT_EQ(inputs["strobe_in"], "0");
  EXPECT_EQ(inputs["strobe_in.sync_activity_up"], "1");
  EXPECT_EQ(inputs["strobe_in.sync_activity_down"], "1");
  ZinJtag_closeSession(handle);
}

}  // namespace
