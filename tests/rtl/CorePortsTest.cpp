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
    edge();
    edge();
    edge();
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
  uint32_t capture() {
    m_.capture_i = 1;
    edge();
    m_.capture_i = 0;
    return m_.cap_o;
  }
  Vzinmox_core_ports m_;
};

TEST_F(CorePorts, SetWinsOverClearAndClearClears) {
  m_.sync_in_i = 1;  // the rise is sampled at the same edge as the clear
  m_.clear_i = 1;
  edge();
  m_.clear_i = 0;
  EXPECT_EQ(capture() & 0x3Eu, 0x34u);  // value, up, sync up
  m_.clear_i = 1;
  edge();
  m_.clear_i = 0;
  EXPECT_EQ(capture() & 0x3Eu, 0x20u);  // value only: the clear removed the latches
  m_.sync_in_i = 0;
  edge();
  EXPECT_EQ(capture() & 0x3Eu, 0x0Au);  // down and sync down
}

TEST_F(CorePorts, AsyncInputPassesTheSynchroniser) {
  m_.async_in_i = 1;  // a pulse of one cycle
  edge();
  m_.async_in_i = 0;
  EXPECT_EQ(capture() & 0x380u, 0x000u);  // still in the synchroniser
  edge();
  EXPECT_EQ(capture() & 0x380u, 0x300u);  // value 1 and up
  EXPECT_EQ(capture() & 0x380u, 0x180u);  // back to 0: up and down
}

}  // namespace
