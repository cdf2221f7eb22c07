// zinmox read REF [NAME ...]: values and activity of named inputs, as a table or as JSON.
#include <iostream>

#include "Commands.h"
#include "CoreArgs.h"
#include "InputValues.h"
#include "ZinHost/Report.h"

namespace zinmox {

namespace {

struct ReadArgs {
  CoreArgs core;
  std::vector<std::string> names;
  bool json = false;
};

}  // namespace

void addReadCommand(CLI::App& app, Session& session) {
  auto args = std::make_shared<ReadArgs>();
  CLI::App* command =
      app.add_subcommand("read", "Read named inputs: value and activity since the last read");
  addRefArgument(*command, args->core);
  command->add_option("NAME", args->names,
                      "inputs to show (default: every input, the whole ports async_in_data and "
                      "sync_in_data included)");
  addSignalsOption(*command, args->core);
  command->add_flag("--json", args->json, "machine-readable output");
  command->footer(
      "Values are hex, most significant digit first. Activity bits show rising and falling\n"
      "changes since the previous read; each read clears them.");
  command->callback([&session, args] {
    const ZIN_CORE_REF ref = prepareCore(session, args->core);
    const std::vector<InputValue> inputs = readInputValues(session, ref, args->names);
    ZinHost::printReadings(std::cout, ref, inputs, args->json);
  });
}

}  // namespace zinmox
