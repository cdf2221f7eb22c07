// zinmox watch REF [NAME ...] --interval MS [--count N]: repeated reads, one line per read, that
// mark changes and activity as they happen. Stops after N reads or on Ctrl-C.
#include <algorithm>
#include <chrono>
#include <fstream>
#include <iomanip>
#include <iostream>
#include <memory>

#include "Commands.h"
#include "CoreArgs.h"
#include "Errors.h"
#include "InputValues.h"
#include "Interrupt.h"
#include "dashboard/Vcd.h"

namespace zinmox {

namespace {

struct WatchArgs {
  CoreArgs core;
  std::vector<std::string> names;
  uint32_t intervalMs = 500;
  uint64_t count = 0;
  std::string vcdFile;
};

std::vector<dashboard::Reading> toReadings(const std::vector<InputValue>& inputs) {
  std::vector<dashboard::Reading> readings;
  for (const InputValue& in : inputs) {
    readings.push_back({in.name, in.width, in.sync, in.value, in.activityUp, in.activityDown,
                        in.syncActivityUp, in.syncActivityDown});
  }
  return readings;
}

// The value-change dump of --vcd FILE: opened before the first read, one sample per read.
class VcdFile {
 public:
  VcdFile(const std::string& path, const std::string& core) : path_(path), core_(core) {
    if (path.empty()) return;
    out_.open(path, std::ios::out | std::ios::trunc);
    if (!out_) throw Failure("cannot write the waveform file " + path);
  }
  void sample(std::chrono::microseconds time, const std::vector<InputValue>& inputs) {
    if (!out_.is_open()) return;
    const std::vector<dashboard::Reading> readings = toReadings(inputs);
    if (!writer_) writer_ = std::make_unique<dashboard::VcdWriter>(out_, "core_" + core_, readings);
    writer_->sample(static_cast<uint64_t>(time.count()), readings);
    out_.flush();
    if (!out_) throw Failure("writing the waveform file " + path_ + " failed");
  }

 private:
  std::string path_, core_;
  std::ofstream out_;
  std::unique_ptr<dashboard::VcdWriter> writer_;
};

bool anySet(const std::string& a, const std::string& b) {
  return a.find_first_not_of('0') != std::string::npos ||
         b.find_first_not_of('0') != std::string::npos;
}

// The value followed by its marks: * changed since the previous read, ^ rose, v fell.
std::string cell(const InputValue& input, const InputValue* previous) {
  std::string marks;
  if (previous != nullptr && previous->value != input.value) marks += '*';
  if (anySet(input.activityUp, input.syncActivityUp)) marks += '^';
  if (anySet(input.activityDown, input.syncActivityDown)) marks += 'v';
  return marks.empty() ? input.value : input.value + " " + marks;
}

void printRow(const std::vector<std::string>& cells, const std::vector<size_t>& widths) {
  std::string line;
  for (size_t i = 0; i < cells.size(); ++i) {
    std::string text = cells[i];
    if (i + 1 < cells.size()) text.resize(std::max(widths[i], text.size()), ' ');
    line += (i == 0 ? "" : "  ") + text;
  }
  std::cout << line << std::endl;
}

void watch(Session& session, const WatchArgs& args) {
  const ZIN_CORE_REF ref = prepareCore(session, args.core);
  VcdFile vcd(args.vcdFile, args.core.ref);
  InterruptGuard guard;
  const auto start = std::chrono::steady_clock::now();
  std::vector<InputValue> previous;
  std::vector<size_t> widths;
  uint64_t reads = 0;
  std::cout << "watching " << args.core.ref << " every " << args.intervalMs
            << " ms; * changed, ^ rose, v fell since the previous read"
            << (args.count == 0 ? "; Ctrl-C stops" : "") << std::endl;
  while (!guard.interrupted() && (args.count == 0 || reads < args.count)) {
    if (reads > 0 && guard.sleepFor(std::chrono::milliseconds(args.intervalMs))) break;
    const std::vector<InputValue> inputs = readInputValues(session, ref, args.names);
    const auto sinceStart = std::chrono::duration_cast<std::chrono::microseconds>(
        std::chrono::steady_clock::now() - start);
    const auto elapsed = std::chrono::duration_cast<std::chrono::milliseconds>(sinceStart);
    vcd.sample(sinceStart, inputs);
    std::vector<std::string> cells{std::to_string(++reads), std::to_string(elapsed.count())};
    for (size_t i = 0; i < inputs.size(); ++i) {
      cells.push_back(cell(inputs[i], previous.empty() ? nullptr : &previous[i]));
    }
    if (reads == 1) {
      std::vector<std::string> header{"read", "ms"};
      widths = {4, 6};
      for (const InputValue& input : inputs) {
        header.push_back(input.name);
        widths.push_back(std::max(input.name.size(), input.value.size() + 4));
      }
      printRow(header, widths);
    }
    printRow(cells, widths);
    previous = inputs;
  }
  if (guard.interrupted()) std::cout << "stopped after " << reads << " reads" << std::endl;
}

}  // namespace

void addWatchCommand(CLI::App& app, Session& session) {
  auto args = std::make_shared<WatchArgs>();
  CLI::App* command = app.add_subcommand(
      "watch", "Read named inputs repeatedly, one line per read, marking changes and activity");
  addRefArgument(*command, args->core);
  command->add_option("NAME", args->names, "inputs to watch (default: every input)");
  // Unsigned options would take "-1" as a huge number, so negative texts are refused first.
  const CLI::Validator notNegative(
      [](std::string& text) {
        return text.find('-') == std::string::npos ? std::string() : "must not be negative";
      },
      "", "not negative");
  command->add_option("--interval", args->intervalMs, "milliseconds between reads")
      ->type_name("MS")
      ->check(notNegative)
      ->capture_default_str();
  command->add_option("--count", args->count, "stop after N reads (default: until Ctrl-C)")
      ->type_name("N")
      ->check(notNegative);
  command
      ->add_option("--vcd", args->vcdFile,
                   "also write the reads to FILE as a value-change dump: each input and its "
                   "activity flags as signals, time in microseconds")
      ->type_name("FILE");
  addSignalsOption(*command, args->core);
  command->footer(
      "Marks after a value: * changed since the previous read, ^ rising activity, "
      "v falling activity.");
  command->callback([&session, args] { watch(session, *args); });
}

}  // namespace zinmox
