// zinmox read REF [NAME ...]: values and activity of named inputs, as a table or as JSON.
#include <iostream>
#include <nlohmann/json.hpp>

#include "Commands.h"
#include "CoreArgs.h"
#include "CoreRef.h"
#include "InputValues.h"
#include "Table.h"

namespace zinmox {

namespace {

struct ReadArgs {
  CoreArgs core;
  std::vector<std::string> names;
  bool json = false;
};

void printTable(const std::vector<InputValue>& inputs) {
  Table table({"name", "width", "value", "activity_up", "activity_down", "sync_activity_up",
               "sync_activity_down"});
  for (const InputValue& input : inputs) {
    table.addRow({input.name, std::to_string(input.width), input.value, input.activityUp,
                  input.activityDown, input.sync ? input.syncActivityUp : "-",
                  input.sync ? input.syncActivityDown : "-"});
  }
  table.print(std::cout);
}

void printJson(const ZIN_CORE_REF& ref, const std::vector<InputValue>& inputs) {
  nlohmann::json list = nlohmann::json::array();
  for (const InputValue& input : inputs) {
    nlohmann::json entry{{"name", input.name},
                         {"width", input.width},
                         {"value", input.value},
                         {"activity_up", input.activityUp},
                         {"activity_down", input.activityDown}};
    if (input.sync) {
      entry["sync_activity_up"] = input.syncActivityUp;
      entry["sync_activity_down"] = input.syncActivityDown;
    }
    list.push_back(entry);
  }
  std::cout << nlohmann::json{{"core", formatCoreRef(ref)}, {"signals", list}}.dump(2) << "\n";
}

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
    if (args->json) {
      printJson(ref, inputs);
    } else {
      printTable(inputs);
    }
  });
}

}  // namespace zinmox
