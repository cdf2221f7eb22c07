// zinmox run SCRIPT|-: subcommands one per line, all in one session.
#include "RunCommand.h"

#include <fstream>
#include <iostream>

#include "Commands.h"
#include "Dispatch.h"
#include "Errors.h"

namespace zinmox {

namespace {

struct RunArgs {
  std::string script;
  bool echo = false;
};

bool isBlankOrComment(const std::string& line) {
  const auto first = line.find_first_not_of(" \t");
  return first == std::string::npos || line[first] == '#';
}

void runStream(Session& session, std::istream& in, const std::string& origin, bool echo) {
  std::string line;
  for (uint64_t number = 1; std::getline(in, line); ++number) {
    if (!line.empty() && line.back() == '\r') line.pop_back();
    if (isBlankOrComment(line)) continue;
    const int status = runScriptLine(session, line, echo);
    if (status != 0) {
      std::cerr << "zinmox: " << origin << " stopped at line " << number << ": " << line << "\n";
      throw ExitRequest{status};
    }
  }
  if (in.bad()) throw Failure("reading " + origin + " failed");
}

void run(Session& session, const RunArgs& args) {
  if (session.inScript()) throw UsageError("run cannot be used inside a script");
  if (args.script == "-") {
    runStream(session, std::cin, "standard input", args.echo);
    return;
  }
  std::ifstream file(args.script);
  if (!file) throw Failure("cannot read the script " + args.script);
  runStream(session, file, "script " + args.script, args.echo);
}

}  // namespace

int runScriptLine(Session& session, const std::string& line, bool echo) {
  if (echo) std::cout << "$ zinmox " << line << std::endl;
  const std::unique_ptr<CLI::App> app = buildApp(session, true);
  const bool wasInScript = session.inScript();
  session.setInScript(true);
  const int status = execute(*app, [&app, &line] { app->parse(line, false); });
  session.setInScript(wasInScript);
  return status;
}

void addRunCommand(CLI::App& app, Session& session) {
  auto args = std::make_shared<RunArgs>();
  CLI::App* command =
      app.add_subcommand("run", "Run subcommands from a script, one per line, in one session");
  command->add_option("SCRIPT", args->script, "script file, or - for standard input")->required();
  command->add_flag("--echo", args->echo, "print each line before running it");
  command->footer(
      "Definitions, initialised cores and the simulated target's state persist from line to\n"
      "line; blank lines and lines starting with # are skipped; the first failing line stops\n"
      "the script with its exit status. Example script:\n"
      "  define 0:1:0 leds async_out 0-7\n"
      "  define 0:1:0 leds_in async_in 0-7\n"
      "  write 0:1:0 leds=A5\n"
      "  read 0:1:0 leds_in");
  command->callback([&session, args] { run(session, *args); });
}

}  // namespace zinmox
