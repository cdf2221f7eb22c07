// Value-change dumps of input reads.
#include "Vcd.h"

#include <cctype>
#include <set>
#include <stdexcept>

namespace zinmox::dashboard {

namespace {

// The identifier of signal `index`: printable characters from '!' to '~', shortest first.
std::string identifier(size_t index) {
  std::string code;
  do {
    code += static_cast<char>('!' + index % 94);
    index /= 94;
  } while (index-- > 0);
  return code;
}

// The texts of an input in signal order: value, activity up and down, sync activity up and down.
std::vector<const std::string*> texts(const Reading& input) {
  std::vector<const std::string*> list{&input.value, &input.activityUp, &input.activityDown};
  if (input.sync) {
    list.push_back(&input.syncActivityUp);
    list.push_back(&input.syncActivityDown);
  }
  return list;
}

const char* const kSuffixes[] = {"", "_activity_up", "_activity_down", "_sync_activity_up",
                                 "_sync_activity_down"};

}  // namespace

std::string vcdName(const std::string& text) {
  std::string name;
  for (unsigned char c : text) name += std::isalnum(c) != 0 ? static_cast<char>(c) : '_';
  return name.empty() ? "_" : name;
}

std::string hexToBits(const std::string& hex, uint32_t width) {
  std::string bits(width, '0');
  size_t bit = 0;  // counted from the least significant end
  for (auto digit = hex.rbegin(); digit != hex.rend() && bit < width; ++digit) {
    const int c = std::tolower(static_cast<unsigned char>(*digit));
    const int nibble = std::isdigit(c) != 0 ? c - '0' : (c >= 'a' && c <= 'f') ? c - 'a' + 10 : -1;
    for (int k = 0; k < 4 && bit < width; ++k, ++bit) {
      bits[width - 1 - bit] = nibble < 0 ? 'x' : ((nibble >> k) & 1) != 0 ? '1' : '0';
    }
  }
  return bits;
}

VcdWriter::VcdWriter(std::ostream& out, const std::string& scope,
                     const std::vector<Reading>& inputs)
    : out_(out) {
  out_ << "$version zinmox $end\n$timescale 1 us $end\n$scope module " << vcdName(scope)
       << " $end\n";
  std::set<std::string> used;
  for (const Reading& input : inputs) {
    names_.push_back(input.name);
    for (size_t i = 0; i < texts(input).size(); ++i) {
      std::string name = vcdName(input.name + kSuffixes[i]);
      for (int n = 2; !used.insert(name).second; ++n) {
        name = vcdName(input.name + kSuffixes[i]) + "_" + std::to_string(n);
      }
      const uint32_t width = input.width == 0 ? 1 : input.width;
      signals_.push_back(Signal{identifier(signals_.size()), width, ""});
      out_ << "$var wire " << width << " " << signals_.back().code << " " << name << " $end\n";
    }
  }
  out_ << "$upscope $end\n$enddefinitions $end\n";
}

void VcdWriter::sample(uint64_t timeUs, const std::vector<Reading>& inputs) {
  if (inputs.size() != names_.size()) throw std::invalid_argument("the inputs changed");
  if (started_ && timeUs <= lastTime_) timeUs = lastTime_ + 1;
  std::string changes;
  size_t index = 0;
  for (size_t i = 0; i < inputs.size(); ++i) {
    if (inputs[i].name != names_[i]) throw std::invalid_argument("the inputs changed");
    for (const std::string* text : texts(inputs[i])) {
      Signal& signal = signals_.at(index++);
      std::string bits = hexToBits(*text, signal.width);
      if (started_ && bits == signal.last) continue;
      changes +=
          signal.width == 1 ? bits + signal.code + "\n" : "b" + bits + " " + signal.code + "\n";
      signal.last = std::move(bits);
    }
  }
  if (started_ && changes.empty()) return;
  out_ << "#" << timeUs << "\n" << (started_ ? changes : "$dumpvars\n" + changes + "$end\n");
  started_ = true;
  lastTime_ = timeUs;
}

}  // namespace zinmox::dashboard
