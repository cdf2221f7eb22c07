// zinmox demo: a short guided tour on the built-in simulated demo design.
#include <iostream>

#include "Commands.h"
#include "Errors.h"
#include "RunCommand.h"

namespace zinmox {

namespace {

struct DemoStep {
  const char* explanation;
  std::vector<const char*> lines;
};

const std::vector<DemoStep>& tour() {
  static const std::vector<DemoStep> steps{
      {"Which cores answer on the chain? Three MOX cores of different versions and one core\n"
       "of another type.",
       {"scan"}},
      {"Core 0:1:0 is a MOX core with the full status layout. Its twelve information fields:",
       {"info 0:1:0"}},
      {"Give names to port bits. The demo design loops each output back to the input of the same\n"
       "number, so name both sides: an 8-bit bus on asynchronous outputs 0-7 and its loopback,\n"
       "one synchronous output bit and its loopback, and synchronous inputs 8-11, which show a\n"
       "free-running counter.",
       {"define 0:1:0 leds async_out 0-7", "define 0:1:0 leds_in async_in 0-7",
        "define 0:1:0 strobe sync_out 0", "define 0:1:0 strobe_in sync_in 0",
        "define 0:1:0 count sync_in 8-11"}},
      {"Write a value to leds and a pulse train to strobe, in one transfer. A train has 16 steps\n"
       "of two digits each for a 1-bit signal, step 0 rightmost: 0001 is high in step 0 only.",
       {"write 0:1:0 leds=A5 strobe.pulsetrain=0001"}},
      {"Read the loopback: leds_in shows A5 with rising activity on exactly those bits, and\n"
       "strobe_in samples step 0 of the train (high, a rising edge).",
       {"read 0:1:0 leds_in strobe_in count"}},
      {"Read again: the train has moved on to step 1, so strobe_in fell; leds_in is steady and\n"
       "shows no new activity; the counter keeps counting.",
       {"read 0:1:0 leds_in strobe_in count"}},
      {"Watch a few reads: * marks a change since the previous read, ^ rising and v falling\n"
       "activity.",
       {"watch 0:1:0 count --interval 100 --count 4"}},
  };
  return steps;
}

void runTour(const std::string& target) {
  Session session(target);
  std::cout << "zinmox demo: a tour of the " << (target.empty() ? "simulated" : "RTL")
            << " demo design (device 0, user chain 1).\n"
               "Each step shows the command, then what it prints.\n";
  int number = 1;
  for (const DemoStep& step : tour()) {
    std::cout << "\n" << number++ << ". " << step.explanation << "\n";
    for (const char* line : step.lines) {
      const int status = runScriptLine(session, line, true);
      if (status != 0) throw ExitRequest{status};
    }
  }
  std::cout << "\nThe same lines work in a script: zinmox run SCRIPT keeps one session for all of\n"
               "them. Try 'zinmox read 0:1:0 --json' or 'zinmox --help' next.\n";
}

}  // namespace

void addDemoCommand(CLI::App& app, Session& session) {
  CLI::App* command = app.add_subcommand("demo",
                                         "A short guided tour on the built-in simulated demo "
                                         "design (or the RTL model behind OpenOCD)");
  command->callback([&session] {
    if (session.inScript()) throw UsageError("demo cannot be used inside a script");
    // The RTL model behind OpenOCD is the same demo design, so the tour runs there too.
    const std::string& target = session.targetText();
    if (!target.empty() && target.rfind("openocd://", 0) != 0) {
      throw UsageError(
          "demo runs on the built-in demo design or on the RTL model behind OpenOCD "
          "(--target openocd://HOST:PORT); leave out --target");
    }
    runTour(target);
  });
}

}  // namespace zinmox
