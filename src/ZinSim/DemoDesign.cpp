// The built-in demo design: one core of each status layout and a core of another type.
#include "ZinSim/Description.h"

namespace ZinSim {

const std::string& demoDescriptionJson() {
  static const std::string text = R"json({
  "name": "ZinSim demo design",
  "devices": [
    {
      "index": 0,
      "chains": [
        {
          "number": 1,
          "cores": [
            {
              "index": 0,
              "name": "full-layout MOX core: loopback wiring, a 4-bit counter on sync inputs 8 to 11",
              "manufacturer_id": 165,
              "type": 9,
              "major_version": 10,
              "minor_version": 2,
              "revision": 1,
              "qx_version": {"major": 1, "minor": 4, "alpha": 0},
              "async_outputs": 16,
              "sync_outputs": 8,
              "async_inputs": 16,
              "sync_inputs": 12,
              "clock": {"cycles_per_sequence": 1},
              "wiring": [
                {"input": "async", "first": 0, "count": 16,
                 "source": {"kind": "loopback", "output": "async", "bit": 0}},
                {"input": "sync", "first": 0, "count": 8,
                 "source": {"kind": "loopback", "output": "sync", "bit": 0}},
                {"input": "sync", "first": 8, "count": 4, "source": {"kind": "counter", "bit": 0}}
              ]
            },
            {
              "index": 1,
              "name": "middle-layout MOX core with default loopback wiring",
              "manufacturer_id": 165,
              "type": 9,
              "major_version": 6,
              "minor_version": 5,
              "revision": 3,
              "async_outputs": 8,
              "sync_outputs": 4,
              "async_inputs": 8,
              "sync_inputs": 4
            },
            {
              "index": 2,
              "name": "early-layout MOX core with a square wave on async input 3",
              "manufacturer_id": 165,
              "type": 9,
              "major_version": 5,
              "minor_version": 1,
              "revision": 0,
              "async_outputs": 4,
              "sync_outputs": 2,
              "async_inputs": 4,
              "sync_inputs": 2,
              "wiring": [
                {"input": "async", "first": 3, "count": 1,
                 "source": {"kind": "square", "period": 8}}
              ]
            },
            {
              "index": 3,
              "name": "a core of another type (not a MOX core)",
              "manufacturer_id": 165,
              "type": 3,
              "major_version": 2,
              "minor_version": 1,
              "revision": 0,
              "status": "00C0FFEE"
            }
          ]
        }
      ]
    }
  ]
})json";
  return text;
}

TargetDescription demoDescription() {
  return parseDescription(demoDescriptionJson());
}

}  // namespace ZinSim
