// Parsing, checking and printing bit lists.
#include "ZinHost/BitList.h"

#include <algorithm>
#include <cctype>

#include "ZinHost/TextError.h"

namespace ZinHost {

namespace {

constexpr size_t kFormattedChars = 60;
const char* const kForms = " (use forms like 0-7, 3 or 0,2,4)";

class ListBuilder {
 public:
  ListBuilder(std::string_view text, uint32_t maxBits)
      : text_(text), maxBits_(maxBits), seen_(kMaxBitNumber + 1, false) {}

  [[noreturn]] void fail(const std::string& why) const {
    throw TextError("bad bit list '" + quoteShort(text_) + "': " + why);
  }

  // Adds `count` bits from `from`, counting up or down, after checking the cap.
  void addRun(uint32_t from, uint32_t to) {
    const uint64_t count = (from > to ? from - to : to - from) + 1ull;
    if (bits_.size() + count > maxBits_) {
      fail("it names more than " + std::to_string(maxBits_) + " bit" + (maxBits_ == 1 ? "" : "s") +
           ", the width of the port");
    }
    for (uint32_t bit = from;; bit = from < to ? bit + 1 : bit - 1) {
      add(bit);
      if (bit == to) break;
    }
  }

  void add(uint32_t bit) {
    if (bit > kMaxBitNumber) {
      fail("bit " + std::to_string(bit) + " is above " + std::to_string(kMaxBitNumber));
    }
    if (seen_[bit]) fail("bit " + std::to_string(bit) + " is listed twice");
    seen_[bit] = true;
    bits_.push_back(bit);
  }

  std::vector<uint32_t> take() { return std::move(bits_); }

 private:
  std::string_view text_;
  uint32_t maxBits_;
  std::vector<bool> seen_;
  std::vector<uint32_t> bits_;
};

uint32_t parseBit(const ListBuilder& list, std::string_view field) {
  if (field.empty() || field.size() > 9 ||
      !std::all_of(field.begin(), field.end(), [](unsigned char c) { return std::isdigit(c); })) {
    list.fail("'" + quoteShort(field) + "' is not a bit number" + kForms);
  }
  uint32_t value = 0;
  for (char c : field) value = value * 10 + static_cast<uint32_t>(c - '0');
  return value;
}

void addItem(ListBuilder& list, std::string_view item) {
  const size_t dash = item.find('-');
  if (dash == std::string_view::npos) {
    const uint32_t bit = parseBit(list, item);
    list.addRun(bit, bit);
    return;
  }
  const uint32_t from = parseBit(list, item.substr(0, dash));
  const uint32_t to = parseBit(list, item.substr(dash + 1));
  if (std::max(from, to) > kMaxBitNumber) {
    list.fail("bit " + std::to_string(std::max(from, to)) + " is above " +
              std::to_string(kMaxBitNumber));
  }
  list.addRun(from, to);
}

}  // namespace

std::vector<uint32_t> parseBitList(std::string_view text, uint32_t maxBits) {
  ListBuilder list(text, maxBits);
  size_t start = 0;
  for (size_t i = 0; i <= text.size(); ++i) {
    if (i == text.size() || text[i] == ',') {
      addItem(list, text.substr(start, i - start));
      start = i + 1;
    }
  }
  return list.take();
}

void checkBitList(const std::vector<uint32_t>& bits, uint32_t maxBits) {
  const std::string text = formatBitList(bits);
  ListBuilder list(text, maxBits);
  if (bits.size() > maxBits) {
    list.fail("it names more than " + std::to_string(maxBits) + " bit" + (maxBits == 1 ? "" : "s") +
              ", the width of the port");
  }
  for (uint32_t bit : bits) list.add(bit);
}

std::string formatBitList(const std::vector<uint32_t>& bits) {
  std::string text;
  size_t i = 0;
  while (i < bits.size()) {
    if (text.size() > kFormattedChars) return text + ",...";
    size_t j = i;
    const int step = (i + 1 < bits.size() && bits[i + 1] + 1 == bits[i]) ? -1 : 1;
    while (j + 1 < bits.size() && static_cast<int64_t>(bits[j + 1]) - bits[j] == step) ++j;
    if (!text.empty()) text += ",";
    text += std::to_string(bits[i]);
    if (j > i) {
      text += '-';
      text += std::to_string(bits[j]);
    }
    i = j + 1;
  }
  return text;
}

}  // namespace ZinHost
