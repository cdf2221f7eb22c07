// Command sequences of any bytes handed to the simulated target (the demo design), with a read
// bit count taken from the input. The target either carries a sequence out or rejects it with
// its own "ZinSim: " error; anything else (another exception, a crash, a write past the read
// buffer) is a fault.
#include <cstddef>
#include <cstdint>
#include <exception>
#include <string>
#include <vector>

#include "FuzzInput.h"
#include "FuzzSession.h"
#include "ZinSim/Target.h"

using namespace ZinFuzz;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  FuzzInput in(data, size);
  static ZinSim::Target target;  // one target for all inputs: its state carries over, as on a board
  const uint32_t readBitCount = in.u16() % 4096;
  const std::string text = in.bytes(size > 2 ? size - 2 : 0);
  // Exactly the bytes the count asks for, so that the address sanitizer sees any write past them.
  std::vector<unsigned char> readData((readBitCount + 7) / 8);
  try {
    target.commandSequence(text, readData.empty() ? nullptr : readData.data(), readBitCount);
  } catch (const std::exception& error) {
    if (std::string(error.what()).rfind("ZinSim: ", 0) != 0) {
      fail(std::string("the target rejected a sequence with: ") + error.what());
    }
  } catch (...) {
    fail("the target threw something that is not a standard exception");
  }
  return 0;
}
