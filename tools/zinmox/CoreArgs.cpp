// The core reference and the signals file of the core subcommands.
#include "CoreArgs.h"

#include "ZinHost/CoreRef.h"

namespace zinmox {

const char* const kSignalsHelp =
    "JSON file naming signals, e.g. {\"signals\": [{\"name\": \"leds\", \"port\": "
    "\"async_out\", \"bits\": \"0-7\"}]} (ports async_out, sync_out, async_in, sync_in)";

void addRefArgument(CLI::App& command, CoreArgs& args) {
  command.add_option("REF", args.ref, "core reference DEVICE:CHAIN:CORE, for example 0:1:0")
      ->required();
}

void addSignalsOption(CLI::App& command, CoreArgs& args) {
  command.add_option("--signals", args.signalsFile, kSignalsHelp)->type_name("FILE");
}

ZIN_CORE_REF prepareCore(Session& session, const CoreArgs& args) {
  const ZIN_CORE_REF ref = ZinHost::parseCoreRef(args.ref);
  session.useCore(ref);
  if (!args.signalsFile.empty()) session.loadSignals(ref, args.signalsFile);
  return ref;
}

}  // namespace zinmox
