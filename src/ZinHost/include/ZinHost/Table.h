// Plain-text tables with aligned columns.
#ifndef ZINHOST_TABLE_H
#define ZINHOST_TABLE_H

#include <ostream>
#include <string>
#include <vector>

namespace ZinHost {

class Table {
 public:
  explicit Table(std::vector<std::string> headers) : headers_(std::move(headers)) {}
  void addRow(std::vector<std::string> cells) { rows_.push_back(std::move(cells)); }
  /// Prints the header and the rows, columns separated by two blanks, trailing blanks dropped.
  void print(std::ostream& out) const;

 private:
  std::vector<std::string> headers_;
  std::vector<std::vector<std::string>> rows_;
};

}  // namespace ZinHost

#endif
