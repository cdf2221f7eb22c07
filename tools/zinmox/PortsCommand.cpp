// zinmox ports REF read | write: whole-port vectors in hex.
#include <iostream>
#include <nlohmann/json.hpp>
#include <optional>

#include "Commands.h"
#include "CoreArgs.h"
#include "Errors.h"
#include "ZinHost/CoreRef.h"
#include "ZinHost/Table.h"
#include "ZinHost/ValueText.h"
#include "ZinMOX/ZinMOX.h"

namespace zinmox {

namespace {

using ZinHost::formatCoreRef;
using ZinHost::hexToPacked;
using ZinHost::packedToHex;
using ZinHost::Table;

// The digits of a hex option, after the clients' "0x" rule.
std::string cleanHex(const std::string& text, const std::string& what) {
  return ZinHost::hexDigits(text, what);
}

constexpr uint32_t kSteps = 16;

struct PortsArgs {
  CoreArgs core;
  bool json = false;
  std::optional<std::string> async, asyncMask, sync, syncTrain, syncMask;
};

struct PortVectors {
  const char* name;
  uint32_t width;
  std::vector<std::vector<uint8_t>> vectors;  // value, up, down[, sync up, sync down]
};

void readPorts(Session& session, const PortsArgs& args) {
  ZIN_CORE_REF ref = prepareCore(session, args.core);
  const ZINMOX_CORE_INFO info = session.coreInfo(ref);
  PortVectors async{"async_in", info.async_input_count, {}};
  PortVectors sync{"sync_in", info.sync_input_count, {}};
  async.vectors.assign(3, std::vector<uint8_t>((async.width + 7) / 8 + 1, 0));
  sync.vectors.assign(5, std::vector<uint8_t>((sync.width + 7) / 8 + 1, 0));
  auto& a = async.vectors;
  auto& s = sync.vectors;
  session.check(ZinMOX_getPortBits(session.handle(), &ref, a[0].data(), a[1].data(), a[2].data(),
                                   async.width, s[0].data(), s[1].data(), s[2].data(), s[3].data(),
                                   s[4].data(), sync.width),
                "reading the input ports of " + args.core.ref);
  static const char* const kKeys[] = {"value", "activity_up", "activity_down", "sync_activity_up",
                                      "sync_activity_down"};
  nlohmann::json json{{"core", formatCoreRef(ref)}};
  Table table({"port", "width", "value", "activity_up", "activity_down", "sync_activity_up",
               "sync_activity_down"});
  for (const PortVectors* port : {&async, &sync}) {
    if (port->width == 0) continue;
    std::vector<std::string> row{port->name, std::to_string(port->width)};
    nlohmann::json entry{{"width", port->width}};
    for (size_t i = 0; i < port->vectors.size(); ++i) {
      row.push_back(packedToHex(port->vectors[i], port->width));
      entry[kKeys[i]] = row.back();
    }
    row.resize(7, "-");
    table.addRow(row);
    json[port->name] = entry;
  }
  if (args.json) {
    std::cout << json.dump(2) << "\n";
  } else {
    table.print(std::cout);
  }
}

std::vector<uint8_t> maskOrAll(const std::optional<std::string>& mask, uint32_t width,
                               const std::string& what) {
  if (!mask) return std::vector<uint8_t>((width + 7) / 8, 0xFF);
  return hexToPacked(cleanHex(*mask, what), width, what);
}

std::vector<uint8_t> syncSteps(const PortsArgs& args, uint32_t width) {
  const uint32_t bytes = (width + 7) / 8;
  std::vector<uint8_t> steps;
  if (args.sync) {
    const std::vector<uint8_t> level = hexToPacked(cleanHex(*args.sync, "--sync"), width, "--sync");
    for (uint32_t t = 0; t < kSteps; ++t) steps.insert(steps.end(), level.begin(), level.end());
    return steps;
  }
  steps =
      hexToPacked(cleanHex(*args.syncTrain, "--sync-train"), kSteps * bytes * 8, "--sync-train");
  for (uint32_t t = 0; t < kSteps; ++t) {
    for (uint32_t bit = width; bit < bytes * 8; ++bit) {
      if ((steps[t * bytes + bit / 8] >> (bit % 8)) & 1u) {
        throw UsageError("step " + std::to_string(t) + " of --sync-train does not fit in " +
                         std::to_string(width) + " bits (each step is a block of " +
                         std::to_string(2 * bytes) + " digits, step 0 rightmost)");
      }
    }
  }
  return steps;
}

void requirePort(uint32_t width, const char* what) {
  if (width == 0) throw UsageError(std::string("the core has no ") + what);
}

void writePorts(Session& session, const PortsArgs& args) {
  if (!args.async && !args.sync && !args.syncTrain) {
    throw UsageError("nothing to write: give --async, --sync or --sync-train");
  }
  if (args.asyncMask && !args.async) throw UsageError("--async-mask needs --async");
  if (args.syncMask && !args.sync && !args.syncTrain) {
    throw UsageError("--sync-mask needs --sync or --sync-train");
  }
  ZIN_CORE_REF ref = prepareCore(session, args.core);
  const ZINMOX_CORE_INFO info = session.coreInfo(ref);
  std::vector<uint8_t> asyncData, asyncMask, syncData, syncMask;
  uint32_t asyncCount = 0;
  uint32_t syncCount = 0;
  if (args.async) {
    requirePort(asyncCount = info.async_output_count, "asynchronous outputs");
    asyncData = hexToPacked(cleanHex(*args.async, "--async"), asyncCount, "--async");
    asyncMask = maskOrAll(args.asyncMask, asyncCount, "--async-mask");
  }
  if (args.sync || args.syncTrain) {
    requirePort(syncCount = info.sync_output_count, "synchronous outputs");
    syncData = syncSteps(args, syncCount);
    syncMask = maskOrAll(args.syncMask, syncCount, "--sync-mask");
  }
  session.check(ZinMOX_setPortBits(session.handle(), &ref, asyncData.data(), asyncMask.data(),
                                   asyncCount, syncData.data(), syncMask.data(), syncCount),
                "writing the output ports of " + args.core.ref);
  std::cout << args.core.ref << ": wrote" << (asyncCount ? " async_out" : "")
            << (syncCount ? " sync_out" : "") << "\n";
}

}  // namespace

void addPortsCommand(CLI::App& app, Session& session) {
  auto args = std::make_shared<PortsArgs>();
  CLI::App* ports = app.add_subcommand("ports", "Read or write whole ports as hex vectors");
  addRefArgument(*ports, args->core);
  ports->require_subcommand(0, 1);
  ports->callback([ports] {
    if (ports->get_subcommands().empty()) {
      throw UsageError("give read or write after the core reference: zinmox ports REF read");
    }
  });
  ports->footer(
      "Examples: zinmox ports 0:1:0 read\n"
      "          zinmox ports 0:1:0 write --async 00A5 --sync-mask 01 --sync 01");

  CLI::App* read = ports->add_subcommand("read", "Read both input ports with their activity");
  read->add_flag("--json", args->json, "machine-readable output");
  read->callback([&session, args] { readPorts(session, *args); });

  CLI::App* write = ports->add_subcommand(
      "write", "Write output ports; hex values are zero-extended and must fit the port");
  write->add_option("--async", args->async, "asynchronous output levels")->type_name("HEX");
  write->add_option("--async-mask", args->asyncMask, "async bits to update (default: all)")
      ->type_name("HEX");
  auto* sync = write->add_option("--sync", args->sync, "synchronous output level for all 16 steps")
                   ->type_name("HEX");
  write
      ->add_option("--sync-train", args->syncTrain,
                   "16 steps, each a block of 2*ceil(width/8) digits, step 0 rightmost")
      ->type_name("HEX")
      ->excludes(sync);
  write->add_option("--sync-mask", args->syncMask, "sync bits to update (default: all)")
      ->type_name("HEX");
  write->callback([&session, args] { writePorts(session, *args); });
}

}  // namespace zinmox
