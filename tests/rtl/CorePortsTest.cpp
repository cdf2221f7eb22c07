// The design side of a 1/1/1/1 core at its own pins: the activity latches against the clear
// strobe, cycle by cycle, and the capture snapshot.
#include <gtest/gtest.h>

#include "Vzinmox_core_ports.h"

namespace {

// cap_o is the read line's number: bit 9 async value, 8 up, 7 down; bit 5 sync value, 4 up,
// 3 down, 2 sync up, 1 sync down.
class CorePorts : public ::testing::Test {
 protected:
  CorePorts() {
    m_.rst_ni = 0;
    for (int i = 0; i < 3; ++i) edge();
    m_.rst_ni = 1;
    edge();
  }
  ~CorePorts() override { m_.final(); }
  void edge() {
    m_.clk_i = 1;
    m_.eval();
    m_.clk_i = 0;
    m_.eval();
  }
  // One design cycle with a strobe high.
  void pulse(uint8_t& strobe) {
    strobe = 1;
    edge();
    strobe = 0;
  }
  uint32_t capture() {
    pulse(m_.capture_i);
    return m_.cap_o;
  }
  Vzinmox_core_ports m_;
};

TEST_F(CorePorts, SetWinsOverClearAndTheAsyncInputIsSynchronised) {
  m_.sync_in_i = 1;  // the rise is sampled at the same edge as the clear
  pulse(m_.clear_i);
  EXPECT_EQ(capture() & 0x3Eu, 0x34u);  // value, up, sync up
  pulse(m_.clear_i);
  EXPECT_EQ(capture() & 0x3Eu, 0x20u);  // value only: the clear removed the latches
  m_.sync_in_i = 0;
  edge();
  EXPECT_EQ(capture() & 0x3Eu, 0x0Au);  // down and sync down

  // The async input passes the synchroniser.
  pulse(m_.async_in_i);                   // a pulse of one cycle
  EXPECT_EQ(capture() & 0x380u, 0x000u);  // still in the synchroniser
  edge();
  EXPECT_EQ(capture() & 0x380u, 0x300u);  // value 1 and up
  EXPECT_EQ(capture() & 0x380u, 0x180u);  // back to 0: up and down
}

}  // namespace
