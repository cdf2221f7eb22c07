// The two ways a subcommand fails: a usage error (exit status 2) and a failure (exit status 1).
#ifndef ZINMOX_TOOL_ERRORS_H
#define ZINMOX_TOOL_ERRORS_H

#include <stdexcept>
#include <string>

namespace zinmox {

/// The command line or a script line asks for something malformed: a missing argument, a
/// conflict between options. Reported with a short hint; exit status 2. (Malformed references,
/// values, bit lists and names raise ZinHost::TextError, which is reported the same way.)
class UsageError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

/// The work could not be done: the session reported a failure, a file could not be used. An
/// empty text means that the reason has already been printed (the session's messages). Exit
/// status 1.
class Failure : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
  Failure() : std::runtime_error("") {}
};

/// Ends the current command with an exit status whose reason has already been printed (a
/// failed script line).
struct ExitRequest {
  int status;
};

inline constexpr int kExitFailure = 1;
inline constexpr int kExitUsage = 2;

}  // namespace zinmox

#endif
