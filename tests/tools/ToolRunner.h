// Runs the built zinmox tool as a child process and collects its output and exit status.
#ifndef ZINMOX_TOOL_TESTS_TOOLRUNNER_H
#define ZINMOX_TOOL_TESTS_TOOLRUNNER_H

#include <string>
#include <vector>

namespace zinmox_test {

struct ToolResult {
  int status = -1;  // exit status; -1 when the process did not exit normally (a crash)
  int signal = 0;   // the signal that ended it, if any
  std::string out;  // standard output
  std::string err;  // standard error
};

/// Runs zinmox with `args`, feeding `input` to its standard input.
ToolResult runTool(const std::vector<std::string>& args, const std::string& input = "");

/// A file in a fresh temporary folder of the test, holding `text`; returns its path.
std::string writeTempFile(const std::string& name, const std::string& text);

}  // namespace zinmox_test

#endif
