// Exit statuses and error output.
#include "Dispatch.h"

#include <iostream>

#include "Errors.h"
#include "ZinHost/SignalsFile.h"
#include "ZinHost/Target.h"
#include "ZinHost/TextError.h"

namespace zinmox {

namespace {

// "zinmox ports read": the subcommands that were chosen on the line.
std::string commandPath(const CLI::App& app) {
  std::string path = "zinmox";
  const CLI::App* current = &app;
  while (current != nullptr) {
    const auto chosen = current->get_subcommands();
    current = chosen.empty() ? nullptr : chosen.front();
    if (current != nullptr) path += " " + current->get_name();
  }
  return path;
}

int usageError(const CLI::App& app, const std::string& text) {
  std::cout.flush();
  std::cerr << "zinmox: " << text << "\nRun '" << commandPath(app) << " --help' for usage.\n";
  return kExitUsage;
}

int failure(const std::string& text) {
  std::cout.flush();
  if (!text.empty()) std::cerr << "zinmox: error: " << text << "\n";
  return kExitFailure;
}

}  // namespace

int execute(CLI::App& app, const std::function<void()>& parse) {
  try {
    parse();
    std::cout.flush();
    return 0;
  } catch (const CLI::ExtrasError& error) {
    if (app.get_subcommands().empty() && !app.remaining().empty()) {
      return usageError(app, "unknown subcommand '" + app.remaining().front() + "'");
    }
    return usageError(app, error.what());
  } catch (const CLI::ParseError& error) {
    if (error.get_exit_code() == 0) return app.exit(error);
    return usageError(app, error.what());
  } catch (const UsageError& error) {
    return usageError(app, error.what());
  } catch (const ZinHost::TextError& error) {
    return usageError(app, error.what());
  } catch (const ZinHost::TargetError& error) {
    if (error.kind() == ZinHost::TargetError::Kind::Malformed) return usageError(app, error.what());
    return failure(error.what());
  } catch (const Failure& error) {
    return failure(error.what());
  } catch (const ExitRequest& request) {
    return request.status;
  } catch (const std::exception& error) {
    return failure(error.what());
  }
}

}  // namespace zinmox
