// The zinmox module: scripting and test benches for MOX cores.
#include <pybind11/pybind11.h>

#include "Core.h"
#include "Errors.h"
#include "Ports.h"
#include "Session.h"
#include "SimTarget.h"
#include "Values.h"
#include "ZinMOX/ZinMOX_Version.h"

PYBIND11_MODULE(zinmox, module) {
  module.doc() =
      "Sessions on MOX debug cores: named signals, pulse trains, activity and whole ports, over "
      "the library's exported functions, plus the simulated target for test benches.\n\n"
      "    with zinmox.Session() as session:          # the simulated demo design\n"
      "        core = session.core(\"0:1:0\").init()\n"
      "        core.define(\"ctl\", \"async_out\", [0, 1, 2, 3, 4, 5])\n"
      "        core.write(ctl=0x3F)\n"
      "        print(core.read()[\"async_in_data\"].value)\n\n"
      "Failures raise zinmox.Error; other session messages go to the logger \"zinmox\".";
  module.attr("__version__") = ZINMOX_VERSION_STRING;
  zinmox::bindErrors(module);
  zinmox::bindValues(module);
  zinmox::bindPorts(module);
  zinmox::bindSimTarget(module);
  zinmox::bindCore(module);
  zinmox::bindSession(module);
}
