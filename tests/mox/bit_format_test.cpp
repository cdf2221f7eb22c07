// The library's bit and hex format module: the piecewise hex writer against a table and against
// the framework's conversion for every width and padding, the read bit text, the digit table, and
// that a port image the writer cannot render is a reported fault, never silently recomputed.
#include <gtest/gtest.h>

#include <memory>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

#include "ZinRT/Zin_ByteBuffer.h"
#include "ZinRT/Zin_NumberUtil.h"
#include "format/ZinMOX_BitFormat.h"
#include "internal/ZinMOX_Command.h"
#include "support/SessionFixture.h"

namespace {

using ZinRT::mox::HexTextWriter;

struct Piece {
  bool steps;  // added as one sixteen-character step string
  std::string bits;
};

// Writes the pieces after a prefix; "rejected" when the writer refuses a piece or is not done.
std::string written(const std::vector<Piece>& pieces) {
  size_t bitCount = 0;
  for (const Piece& p : pieces) bitCount += p.bits.size();
  std::string text = "prefix ";
  HexTextWriter writer(text, bitCount);
  for (const Piece& p : pieces) {
    if (!(p.steps ? writer.addSteps(p.bits.c_str()) : writer.add(p.bits))) return "rejected";
  }
  return writer.done() ? text : "rejected";
}

}  // namespace

TEST(BitFormat, HexWriterGivesTheTextOfTheWholeBitText) {
  const std::string train = "1111000011110000";
  const struct {
    std::vector<Piece> pieces;
    const char* text;
  } rows[] = {
      {{}, "prefix "},
      {{{false, "1"}}, "prefix 1"},
      {{{false, "101"}, {false, "1"}}, "prefix B"},
      {{{false, "1111"}, {true, "0000000000000001"}}, "prefix F0001"},
      {{{false, "110"}, {true, "1010101010101010"}, {false, "01"}}, "prefix 1AAAA9"},
      {{{false, "10000000011"}, {true, train}, {true, train}, {false, "0"}}, "prefix 807E1E1E1E0"},
  };
  for (const auto& row : rows) EXPECT_EQ(written(row.pieces), row.text);

  // Every width up to 80 bits split at random, so that each padding meets words and steps.
  std::mt19937 rng(7);
  std::string reference;
  for (size_t width = 0; width <= 80; ++width) {
    std::string all;
    std::vector<Piece> pieces;
    while (all.size() < width) {
      const bool steps = width - all.size() >= 16 && rng() % 3 == 0;
      const size_t n = steps ? 16 : 1 + rng() % (width - all.size());
      std::string bits(n, '0');
      for (char& c : bits) c = (rng() & 1u) != 0 ? '1' : '0';
      pieces.push_back({steps, bits});
      all += bits;
    }
    EXPECT_EQ(written(pieces), "prefix " + ZinRT::Zin_NumberUtil::binStr2HexStr(all, reference))
        << width;
  }
}

TEST(BitFormat, HexWriterRefusesWhatDoesNotFitItsCount) {
  EXPECT_EQ(written({{false, "10x1"}}), "rejected");
  EXPECT_EQ(written({{false, "1111111111112111"}}), "rejected");
  EXPECT_EQ(written({{true, "000000000000000x"}}), "rejected");

  // More bits than announced: refused before a digit lands outside the room.
  std::string text;
  HexTextWriter over(text, 3);
  EXPECT_TRUE(over.add("101"));
  EXPECT_FALSE(over.add("1111"));
  EXPECT_FALSE(over.addSteps("0000000000000000"));
  EXPECT_EQ(text.size(), 1u);
  EXPECT_TRUE(over.add("1"));  // a bit that completes no digit writes nothing...
  EXPECT_FALSE(over.done());   // ...but leaves the text unfinished
  // Fewer bits than announced: the text is not done.
  HexTextWriter under(text, 9);
  EXPECT_TRUE(under.add("10110011"));
  EXPECT_FALSE(under.done());
}

TEST(BitFormat, DigitValues) {
  for (int c = 0; c < 256; ++c) {
    ASSERT_EQ(ZinRT::mox::hexDigitValue(static_cast<char>(c)),
              ZinRT::Zin_NumberUtil::hexDigitValue(static_cast<char>(c)))
        << c;
    std::string digits(40, 'F');  // the character in a block of sixteen, in a word and alone
    for (const int at : {c % 16, 32 + c % 8, 39}) {
      std::string text = digits;
      text[static_cast<size_t>(at)] = static_cast<char>(c);
      ASSERT_EQ(ZinRT::mox::allHexDigits(text.data(), text.size()),
                ZinRT::mox::hexDigitValue(static_cast<char>(c)) >= 0)
          << c << " at " << at;
    }
  }
  // The hex text of a packed vector is the framework's, at every width across digits and bytes.
  const unsigned char vector[] = {0xA5, 0x0F, 0x81, 0x7E, 0xC3, 0x3C, 0x96, 0x69, 0xFF};
  const ZinRT::Zin_ByteBuffer buffer(vector, sizeof vector);
  std::string text;
  for (uint32_t n = 0; n <= 8 * sizeof vector; ++n) {
    std::unique_ptr<ZinRT::Zin_ByteBuffer> expected(buffer.bin2HexString(0, n));
    ZinRT::mox::packedHexText(vector, n, text);
    ASSERT_EQ(text, expected->ptr()) << n;
  }
}

TEST(BitFormat, AnImageTheWriterCannotRenderIsAFault) {
  ZINMOX_CORE_INFO info{};
  info.async_output_count = 5;
  info.sync_output_count = 2;
  const ZIN_CORE_REF ref{1, 2, 0};
  std::string text;
  const char* fault =
      "ZinMOX_Command::buildCommandText(): the port image does not give 44 bits of output data";

  ZinRT::ZinMOX_Command badCharacter;
  badCharacter.initFromCoreInfo(info);
  badCharacter.setAsyncOutValueChar(3, 'x');
  EXPECT_EQ(ZinTest::logicErrorOf([&] { badCharacter.buildCommandText(ref, 1, text, nullptr); }),
            fault);

  ZinRT::ZinMOX_Command shortTrain;
  shortTrain.initFromCoreInfo(info);
  shortTrain.setPulseTrain(1, "0101");
  EXPECT_THROW(shortTrain.buildCommandText(ref, 1, text, nullptr), std::logic_error);
}
