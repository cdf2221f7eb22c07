// zinmox write REF NAME=HEX ...: drives named outputs, NAME.pulsetrain=HEX for a 16-step train.
#include <iostream>
#include <set>

#include "Commands.h"
#include "CoreArgs.h"
#include "Errors.h"
#include "ZinHost/Signals.h"
#include "ZinHost/ValueText.h"
#include "ZinMOX/ZinMOX.h"

namespace zinmox {

namespace {

struct WriteArgs {
  CoreArgs core;
  std::vector<std::string> assignments;
};

const char* const kPulseTrain = "pulsetrain";

// Checks one NAME=HEX or NAME.pulsetrain=HEX and adds it to the value map.
void addAssignment(const std::string& text, ZinRT::ZinMOX_ValueMap& values,
                   std::set<std::string>& seen) {
  const auto equals = text.find('=');
  if (equals == std::string::npos || equals == 0) {
    throw UsageError("'" + text + "' is not NAME=HEX (for example leds=A5 or strobe.pulsetrain=1)");
  }
  const std::string key = text.substr(0, equals);
  const auto dot = key.find('.');
  const std::string name = key.substr(0, dot);
  if (name.empty()) throw UsageError("'" + text + "' has no signal name before the dot");
  if (dot != std::string::npos && key.substr(dot + 1) != kPulseTrain) {
    throw UsageError("unknown suffix in '" + key + "': only NAME.pulsetrain is written");
  }
  const std::string hex = ZinHost::hexDigits(text.substr(equals + 1), "the value of " + key);
  if (!seen.insert(ZinHost::lowerCase(name)).second) {
    throw UsageError(name + " is given more than once");
  }
  values[key] = hex;
}

void write(Session& session, const WriteArgs& args) {
  ZinRT::ZinMOX_ValueMap values;
  std::set<std::string> seen;
  for (const std::string& assignment : args.assignments) addAssignment(assignment, values, seen);
  ZIN_CORE_REF ref = prepareCore(session, args.core);
  uintptr_t word = reinterpret_cast<uintptr_t>(&values);
  session.check(ZinMOX_writeValues(session.handle(), &ref, &word), "writing to " + args.core.ref);
  std::cout << args.core.ref << ": wrote";
  for (const std::string& assignment : args.assignments) std::cout << " " << assignment;
  std::cout << "\n";
}

}  // namespace

void addWriteCommand(CLI::App& app, Session& session) {
  auto args = std::make_shared<WriteArgs>();
  CLI::App* command = app.add_subcommand("write", "Drive named outputs in one transfer");
  addRefArgument(*command, args->core);
  command
      ->add_option("NAME=HEX", args->assignments,
                   "output and hex value; NAME.pulsetrain=HEX gives a synchronous output 16 "
                   "steps, step 0 in the rightmost block of 2*ceil(width/8) digits")
      ->required();
  addSignalsOption(*command, args->core);
  command->footer(
      "Names: those of --signals FILE or earlier define lines, and the whole ports async_out_data "
      "and sync_out_data.\nValues are hex, most significant digit first; a shorter text is "
      "sign-extended, a longer one keeps its last digits.\n"
      "Example: zinmox write 0:1:0 async_out_data=00A5 sync_out_data.pulsetrain=0100");
  command->callback([&session, args] { write(session, *args); });
}

}  // namespace zinmox
