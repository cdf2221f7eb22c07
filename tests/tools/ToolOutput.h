// Running the built zinmox tool in tests, and reading its tables and JSON back.
#ifndef ZINMOX_TOOL_TESTS_TOOLOUTPUT_H
#define ZINMOX_TOOL_TESTS_TOOLOUTPUT_H

#include <nlohmann/json.hpp>
#include <sstream>
#include <string>
#include <vector>

#include "support/ChildProcess.h"

namespace zinmox_test {

using ToolResult = ZinTest::ProcessResult;
using ZinTest::writeTempFile;

/// Runs zinmox with `args` to its end, feeding `input` to its standard input.
inline ToolResult runTool(const std::vector<std::string>& args, const std::string& input = "") {
  return ZinTest::runProcess(ZINMOX_TOOL_PATH, args, input);
}

/// The blank-separated fields of every line of `text` whose first field is `first`, in order.
inline std::vector<std::vector<std::string>> rowsStartingWith(const std::string& text,
                                                              const std::string& first) {
  std::vector<std::vector<std::string>> rows;
  std::istringstream lines(text);
  std::string line;
  while (std::getline(lines, line)) {
    std::istringstream fields(line);
    std::vector<std::string> row;
    std::string field;
    while (fields >> field) row.push_back(field);
    if (!row.empty() && row[0] == first) rows.push_back(row);
  }
  return rows;
}

/// The JSON documents in `text`: each starts at a line that is "{" and ends at a line "}".
inline std::vector<nlohmann::json> jsonDocuments(const std::string& text) {
  std::vector<nlohmann::json> documents;
  std::istringstream lines(text);
  std::string line, current;
  bool inside = false;
  while (std::getline(lines, line)) {
    if (line == "{") inside = true;
    if (inside) current += line + "\n";
    if (inside && line == "}") {
      documents.push_back(nlohmann::json::parse(current));
      current.clear();
      inside = false;
    }
  }
  return documents;
}

}  // namespace zinmox_test

#endif
