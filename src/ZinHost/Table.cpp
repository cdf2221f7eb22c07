// Printing tables.
#include "ZinHost/Table.h"

#include <algorithm>

namespace ZinHost {

namespace {

void printLine(std::ostream& out, const std::vector<std::string>& cells,
               const std::vector<size_t>& widths) {
  std::string line;
  for (size_t i = 0; i < cells.size(); ++i) {
    if (i > 0) line += "  ";
    line += cells[i];
    if (i + 1 < cells.size()) line.append(widths[i] - std::min(widths[i], cells[i].size()), ' ');
  }
  line.erase(line.find_last_not_of(' ') + 1);
  out << line << "\n";
}

}  // namespace

void Table::print(std::ostream& out) const {
  std::vector<size_t> widths(headers_.size(), 0);
  auto measure = [&widths](const std::vector<std::string>& cells) {
    for (size_t i = 0; i < cells.size() && i < widths.size(); ++i) {
      widths[i] = std::max(widths[i], cells[i].size());
    }
  };
  measure(headers_);
  for (const auto& row : rows_) measure(row);
  printLine(out, headers_, widths);
  for (const auto& row : rows_) printLine(out, row, widths);
}

}  // namespace ZinHost
