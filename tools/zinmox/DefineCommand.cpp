// zinmox define REF NAME PORT BITS: names a port bit or a bus of port bits.
#include <iostream>

#include "Commands.h"
#include "CoreArgs.h"
#include "ZinHost/BitList.h"
#include "ZinHost/Signals.h"

namespace zinmox {

namespace {

struct DefineArgs {
  CoreArgs core;
  std::string name;
  std::string port;
  std::string bits;
};

using namespace ZinHost;

void define(Session& session, const DefineArgs& args) {
  SignalDefinition signal;
  signal.name = args.name;
  signal.port = parsePort(args.port);
  checkSignalName(signal.name, signal.port);
  const ZIN_CORE_REF ref = prepareCore(session, args.core);
  // Parsed against the port's width, so a list never grows beyond the port.
  signal.bits = parseBitList(args.bits, portWidth(session.coreInfo(ref), signal.port));
  session.defineSignal(ref, signal);
  std::cout << args.core.ref << ": " << signal.name << " = " << portName(signal.port)
            << (signal.bits.size() == 1 ? " bit " : " bits ") << formatBitList(signal.bits) << " ("
            << signal.bits.size() << " bit" << (signal.bits.size() == 1 ? "" : "s") << ")\n";
}

}  // namespace

void addDefineCommand(CLI::App& app, Session& session) {
  auto args = std::make_shared<DefineArgs>();
  CLI::App* command = app.add_subcommand(
      "define", "Name a port bit or a bus of port bits (value bit i is the i-th listed bit)");
  addRefArgument(*command, args->core);
  command
      ->add_option("NAME", args->name,
                   "signal name (case-insensitive; an output name without '.' or '=')")
      ->required();
  command->add_option("PORT", args->port, "async_out, sync_out, async_in or sync_in")->required();
  command->add_option("BITS", args->bits, "port bits: 3, 0-7, 7-0 or 0,2,4")->required();
  addSignalsOption(*command, args->core);
  command->footer(
      "Example: zinmox run - with the lines\n"
      "  define 0:1:0 leds async_out 0-7\n  write 0:1:0 leds=A5\n"
      "Definitions last for one session: one invocation, or all lines of a run script.");
  command->callback([&session, args] { define(session, *args); });
}

void addUndefineCommand(CLI::App& app, Session& session) {
  auto args = std::make_shared<DefineArgs>();
  CLI::App* command = app.add_subcommand("undefine", "Remove a signal name from a core");
  addRefArgument(*command, args->core);
  command->add_option("NAME", args->name, "signal name")->required();
  command->add_option("PORT", args->port, "async_out, sync_out, async_in or sync_in")->required();
  addSignalsOption(*command, args->core);
  command->callback([&session, args] {
    const ZinHost::Port port = ZinHost::parsePort(args->port);
    const ZIN_CORE_REF ref = prepareCore(session, args->core);
    session.undefineSignal(ref, args->name, port);
    std::cout << args->core.ref << ": " << args->name << " removed\n";
  });
}

}  // namespace zinmox
