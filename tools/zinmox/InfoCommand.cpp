// zinmox info REF: the twelve fields of a MOX core's information.
#include <iostream>

#include "Commands.h"
#include "CoreArgs.h"
#include "ZinHost/CoreRef.h"
#include "ZinHost/Report.h"
#include "ZinMOX/ZinMOX.h"
#include "internal/ZinMOX_CoreInfoFields.h"

namespace zinmox {

namespace {

struct InfoArgs {
  CoreArgs core;
  bool json = false;
};

void showInfo(Session& session, const InfoArgs& args) {
  ZIN_CORE_REF ref = ZinHost::parseCoreRef(args.core.ref);
  ZinRT::ZinMOX_ValueMap values;
  uintptr_t word = reinterpret_cast<uintptr_t>(&values);
  session.check(ZinMOX_getCoreInfo(session.handle(), &ref, &word),
                "reading the information of core " + args.core.ref);
  ZINMOX_CORE_INFO info{};
  for (const ZinRT::ZinMOX_CoreInfoField& field : ZinRT::ZINMOX_CORE_INFO_FIELDS) {
    info.*field.member = static_cast<uint32_t>(std::stoul(values.at(field.key)));
  }
  ZinHost::printInfo(std::cout, ref, info, args.json);
}

}  // namespace

void addInfoCommand(CLI::App& app, Session& session) {
  auto args = std::make_shared<InfoArgs>();
  CLI::App* command =
      app.add_subcommand("info", "Show the twelve information fields of a MOX core");
  addRefArgument(*command, args->core);
  command->add_flag("--json", args->json, "machine-readable output");
  command->callback([&session, args] { showInfo(session, *args); });
}

}  // namespace zinmox
