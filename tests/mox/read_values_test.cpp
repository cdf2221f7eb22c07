// Reading named inputs: every input signal into a value map under its suffixed keys, and
// repeated samples of named inputs into packed arrays.
#include <algorithm>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

#include "support/SessionFixture.h"
#include "support/WireFormat.h"

namespace {

using namespace ZinTest;
using ZinRT::ZinMOX_ValueMap;

// The hexadecimal text (ceil(w/4) digits, most significant first) of the bits that the port
// characters at `positions` carry: bit i of the value is port bit positions[i].
std::string hexOf(const std::string& port, const std::vector<uint32_t>& positions) {
  std::string bits;  // most significant first
  for (std::size_t i = positions.size(); i-- > 0;) bits.push_back(port[positions[i]]);
  return bitsToHex(bits);
}

std::vector<uint32_t> range(uint32_t n) {
  std::vector<uint32_t> positions;
  for (uint32_t i = 0; i < n; ++i) positions.push_back(i);
  return positions;
}

class ReadValues : public SessionFixture {
 protected:
  void defineBus(const char* name, uint32_t type, std::vector<uint32_t> bits) {
    ASSERT_EQ(
        ZinMOX_defineBus(handle, &ref, name, type, bits.data(), static_cast<uint32_t>(bits.size())),
        0u);
  }
  uint32_t read(ZinMOX_ValueMap& map) {
    uintptr_t word = mapWord(map);
    return ZinMOX_readValues(handle, &ref, &word);
  }
  // Adds the keys of one input signal to `expected`.
  static void addKeys(ZinMOX_ValueMap& expected, const std::string& name, bool sync,
                      const std::vector<uint32_t>& positions, const InputImage& image) {
    const std::string& value = sync ? image.syncValue : image.asyncValue;
    expected[name] = hexOf(value, positions);
    expected[name + ".value"] = hexOf(value, positions);
    expected[name + ".activity_up"] = hexOf(sync ? image.syncUp : image.asyncUp, positions);
    expected[name + ".activity_down"] = hexOf(sync ? image.syncDown : image.asyncDown, positions);
    if (sync) {
      expected[name + ".sync_activity_up"] = hexOf(image.syncSyncUp, positions);
      expected[name + ".sync_activity_down"] = hexOf(image.syncSyncDown, positions);
    }
  }
};

TEST_F(ReadValues, ReportsEveryInputUnderItsKeysAndKeepsOtherKeys) {
  initMoxCore(ref, 4, 3, 2, 0);
  const std::vector<uint32_t> a{2, 0}, s{1}, ctl{0, 2};
  defineBus("a", ZINMOX_ASYNC_INPUT, a);
  defineBus("s", ZINMOX_SYNC_INPUT, s);
  defineBus("Ctl", ZINMOX_SYNC_INPUT, ctl);
  std::mt19937 rng(31);
  InputImage image = InputImage::random(4, 3, rng);
  transport->clearLog();
  transport->queueReadData(readDataFor(image));

  ZinMOX_ValueMap map{{"unrelated", "keep"}, {"a.value", "stale"}, {"async_out_data", "7"}};
  ASSERT_EQ(read(map), 0u);
  expectNoMessages();
  ZinMOX_ValueMap expected{{"unrelated", "keep"}, {"async_out_data", "7"}};
  addKeys(expected, "a", false, a, image);
  addKeys(expected, "s", true, s, image);
  addKeys(expected, "Ctl", true, ctl, image);
  addKeys(expected, "async_in_data", false, range(4), image);
  addKeys(expected, "sync_in_data", true, range(3), image);
  EXPECT_EQ(map, expected);
  EXPECT_EQ(map.count("a.sync_activity_up"), 0u) << "asynchronous inputs have no sync activity";
  EXPECT_EQ(map["sync_in_data"], map["sync_in_data.value"]);
  auto sent = transport->transfers();
  ASSERT_EQ(sent.size(), 1u) << "one read for all signals";
  EXPECT_EQ(sent[0].text, readCommandText(linePrefix(ref), 4, 3));
}

TEST_F(ReadValues, ACoreWithNoNamedInputsStillReads) {
  initMoxCore(ref, 3, 0, 0, 0);
  ASSERT_EQ(ZinMOX_undefineName(handle, &ref, "async_in_data", ZINMOX_ASYNC_INPUT), 0u);
  ZinMOX_ValueMap map{{"x", "1"}};
  ASSERT_EQ(read(map), 0u);
  EXPECT_EQ(map, (ZinMOX_ValueMap{{"x", "1"}}));
  EXPECT_EQ(transport->transfers().size(), 1u);
}

TEST_F(ReadValues, AFailedReadLeavesTheMapAsItWas) {
  initMoxCore(ref, 3, 0, 0, 0);
  transport->failNextCommand(ZinTarget::ScriptedTransport::Failure::Runtime, "cable unplugged");
  ZinMOX_ValueMap map{{"x", "1"}};
  EXPECT_EQ(read(map), kFailure);
  expectOnlyError("cable unplugged");
  EXPECT_EQ(map, (ZinMOX_ValueMap{{"x", "1"}}));
}

TEST_F(ReadValues, ChecksTheMapArgument) {
  initMoxCore(ref, 3, 0, 0, 0);
  EXPECT_EQ(ZinMOX_readValues(handle, &ref, nullptr), kFailure);
  expectOnlyError("ZinMOX_readValues() arg. failed:inputHashMap!=0");
  uintptr_t nullWord = 0;
  EXPECT_EQ(ZinMOX_readValues(handle, &ref, &nullWord), kFailure);
  expectOnlyError("ZinMOX_readValues() arg. failed:*inputHashMap!=0");
  EXPECT_TRUE(transport->transfers().empty());
}

TEST_F(ReadValues, ReportedTextsWriteBackIntoTheSameBits) {
  initMoxCore(ref, 12, 0, 12, 0);
  std::mt19937 rng(32);
  for (int round = 0; round < 8; ++round) {
    InputImage image = InputImage::random(12, 0, rng);
    transport->clearLog();
    transport->queueReadData(readDataFor(image));
    ZinMOX_ValueMap in;
    ASSERT_EQ(read(in), 0u);
    ZinMOX_ValueMap out{{"async_out_data", in["async_in_data"]}};
    uintptr_t word = mapWord(out);
    ASSERT_EQ(ZinMOX_writeValues(handle, &ref, &word), 0u);
    auto sent = transport->transfers();
    ASSERT_EQ(sent.size(), 2u);
    WriteImage written = decodeWriteCommand(sent[1].text, linePrefix(ref), 12, 0);
    EXPECT_EQ(written.asyncValues, image.asyncValue) << in["async_in_data"];
  }
}

class ReadArrays : public ReadValues {
 protected:
  void SetUp() override {
    ReadValues::SetUp();
    core = initMoxCore(ref, 16, 14, 4, 0);
    ASSERT_NE(core, nullptr);
    defineBus("x12", ZINMOX_ASYNC_INPUT, x12);
    defineBus("y3", ZINMOX_SYNC_INPUT, y3);
    defineBus("out", ZINMOX_ASYNC_OUTPUT, {0});
    transport->clearLog();
  }

  // Expected sample block of a signal: the bits of one port string at the positions.
  static std::vector<uint8_t> blockOf(const std::string& port,
                                      const std::vector<uint32_t>& positions) {
    std::string bits;
    for (uint32_t p : positions) bits.push_back(port[p]);
    return packBits(bits);
  }

  ZinRT::ZinMOX_Core* core = nullptr;
  std::vector<uint32_t> x12{15, 14, 13, 12, 11, 10, 9, 8, 7, 6, 5, 4}, y3{13, 0, 7};
};

TEST_F(ReadArrays, ThreeSamplesLandOneBlockApart) {
  std::mt19937 rng(33);
  std::vector<InputImage> images;
  for (int k = 0; k < 3; ++k) {
    images.push_back(InputImage::random(16, 14, rng));
    transport->queueReadData(readDataFor(images.back()));
  }
  // x12: value, up, down (2 bytes per sample); y3: all five, but one sync-activity vector null.
  std::vector<std::vector<uint8_t>> x(3, std::vector<uint8_t>(6, 0)),
      y(5, std::vector<uint8_t>(3, 0));
  x[0][1] = 0xF0;  // spare bits of sample 0 that are already set stay set
  uint8_t* values[2] = {x[0].data(), y[0].data()};
  uint8_t* up[2] = {x[1].data(), y[1].data()};
  uint8_t* down[2] = {x[2].data(), y[2].data()};
  uint8_t* syncUp[2] = {nullptr, nullptr};
  uint8_t* syncDown[2] = {nullptr, y[4].data()};
  const uint32_t sizes[2] = {6, 3};
  core->readValues(handle, ref, {"x12", "Y3"}, values, up, down, syncUp, syncDown, sizes, 2, 3);
  EXPECT_EQ(transport->transfers().size(), 3u) << "one read per sample";

  for (int k = 0; k < 3; ++k) {
    SCOPED_TRACE(testing::Message() << "sample " << k);
    auto expectBlock = [&](const std::vector<uint8_t>& buffer, std::size_t width,
                           const std::vector<uint8_t>& expected, uint8_t lastByteMask) {
      for (std::size_t b = 0; b < width; ++b) {
        uint8_t mask = b + 1 == width ? lastByteMask : 0xFF;
        EXPECT_EQ(buffer[k * width + b] & mask, expected[b]) << "byte " << b;
      }
    };
    expectBlock(x[0], 2, blockOf(images[k].asyncValue, x12), 0x0F);
    expectBlock(x[1], 2, blockOf(images[k].asyncUp, x12), 0x0F);
    expectBlock(x[2], 2, blockOf(images[k].asyncDown, x12), 0x0F);
    expectBlock(y[0], 1, blockOf(images[k].syncValue, y3), 0x07);
    expectBlock(y[1], 1, blockOf(images[k].syncUp, y3), 0x07);
    expectBlock(y[2], 1, blockOf(images[k].syncDown, y3), 0x07);
    expectBlock(y[4], 1, blockOf(images[k].syncSyncDown, y3), 0x07);
  }
  EXPECT_EQ(x[0][1] & 0xF0, 0xF0);
  EXPECT_EQ(y[3], std::vector<uint8_t>(3, 0));
}

TEST_F(ReadArrays, AMissingVectorArrayIsSkipped) {
  std::mt19937 rng(34);
  InputImage image = InputImage::random(16, 14, rng);
  transport->queueReadData(readDataFor(image));
  std::vector<uint8_t> value(2, 0), down(2, 0);
  uint8_t* values[1] = {value.data()};
  uint8_t* downs[1] = {down.data()};
  const uint32_t sizes[1] = {2};
  core->readValues(handle, ref, {"x12"}, values, nullptr, downs, nullptr, nullptr, sizes, 1, 1);
  EXPECT_EQ(value, blockOf(image.asyncValue, x12));
  EXPECT_EQ(down, blockOf(image.asyncDown, x12));
}

TEST_F(ReadArrays, ChecksSizesAndNamesBeforeReading) {
  std::vector<uint8_t> buffer(6, 0xEE);
  uint8_t* values[2] = {buffer.data(), buffer.data()};
  uint32_t sizes[2] = {5, 6};
  auto failureOf = [&](std::vector<std::string> names, uint32_t count, uint32_t samples) {
    try {
      core->readValues(handle, ref, names, values, nullptr, nullptr, nullptr, nullptr, sizes, count,
                       samples);
    } catch (const std::logic_error& error) {
      return std::string(error.what());
    }
    ADD_FAILURE() << "no std::logic_error";
    return std::string();
  };
  EXPECT_EQ(failureOf({"x12"}, 1, 3),
            "The size of the value is not large enough for the signal: x12");
  EXPECT_EQ(failureOf({"out", "x12"}, 2, 3), "Could not find a signal with the name: out");
  EXPECT_EQ(failureOf({"x12", "nope"}, 2, 0), "Could not find a signal with the name: nope")
      << "the checks run even for 0 samples";
  sizes[0] = 6;
  EXPECT_EQ(failureOf({"x12", "nope"}, 2, 3), "Could not find a signal with the name: nope");
  EXPECT_TRUE(transport->transfers().empty());

  // Zero samples: nothing is read and nothing written.
  core->readValues(handle, ref, {"x12"}, values, nullptr, nullptr, nullptr, nullptr, sizes, 1, 0);
  EXPECT_TRUE(transport->transfers().empty());
  EXPECT_EQ(buffer, std::vector<uint8_t>(6, 0xEE));

  // Six bytes are enough for three samples of twelve bits.
  std::fill(buffer.begin(), buffer.end(), 0);
  core->readValues(handle, ref, {"x12"}, values, nullptr, nullptr, nullptr, nullptr, sizes, 1, 3);
  EXPECT_EQ(transport->transfers().size(), 3u);

  // A missing size array or too few names are refused.
  transport->clearLog();
  EXPECT_THROW(core->readValues(handle, ref, {"x12"}, values, nullptr, nullptr, nullptr, nullptr,
                                nullptr, 1, 1),
               std::logic_error);
  EXPECT_THROW(core->readValues(handle, ref, {"x12"}, values, nullptr, nullptr, nullptr, nullptr,
                                sizes, 2, 1),
               std::logic_error);
  EXPECT_TRUE(transport->transfers().empty());
}

}  // namespace
