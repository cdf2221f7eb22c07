// Whole-port writes and reads: the count and pointer checks of the exported calls, the packing of
// values, masks and step vectors, and which input vectors a read fills.
#include <random>
#include <string>
#include <vector>

#include "support/SessionFixture.h"
#include "support/WireFormat.h"

namespace {

using namespace ZinTest;

// A_in 10, S_in 3, A_out 12, S_out 10: two bytes per vector on three of the ports.
constexpr uint32_t kAsyncIn = 10, kSyncIn = 3, kAsyncOut = 12, kSyncOut = 10;

const char* const kAsyncOutCount =
    "ZinMOX_setPortBits() arg. failed:(asyncOutDataBitCount == "
    "core->getCorePhysicalSignalCount(Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_OUTPUT)) || "
    "(asyncOutDataBitCount == 0)";
const char* const kSyncOutCount =
    "ZinMOX_setPortBits() arg. failed:(syncOutDataBitCount == "
    "core->getCorePhysicalSignalCount(Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_OUTPUT)) || "
    "(syncOutDataBitCount == 0)";
const char* const kAsyncInCount =
    "ZinMOX_getPortBits() arg. failed:(asyncInDataBitCount == "
    "core->getCorePhysicalSignalCount(Zin_SignalBase::SIGNAL_TYPE_MOX_ASYNC_INPUT)) || "
    "(asyncInDataBitCount == 0)";
const char* const kSyncInCount =
    "ZinMOX_getPortBits() arg. failed:(syncInDataBitCount == "
    "core->getCorePhysicalSignalCount(Zin_SignalBase::SIGNAL_TYPE_MOX_SYNC_INPUT)) || "
    "(syncInDataBitCount == 0)";

class PortBits : public SessionFixture {
 protected:
  void SetUp() override {
    SessionFixture::SetUp();
    initMoxCore(ref, kAsyncIn, kSyncIn, kAsyncOut, kSyncOut);
  }

  uint32_t set(const uint8_t* asyncData, const uint8_t* asyncMask, uint32_t asyncCount,
               const uint8_t* syncData, const uint8_t* syncMask, uint32_t syncCount) {
    return ZinMOX_setPortBits(handle, &ref, asyncData, asyncMask, asyncCount, syncData, syncMask,
                              syncCount);
  }

  // The image carried by the last write.
  WriteImage lastWrite() {
    auto sent = transport->transfers();
    if (sent.empty()) {
      ADD_FAILURE() << "nothing was sent";
      return WriteImage::zeros(kAsyncOut, kSyncOut);
    }
    return decodeWriteCommand(sent.back().text, linePrefix(ref), kAsyncOut, kSyncOut);
  }

  // Eight receiving vectors, filled with a sentinel.
  struct Destinations {
    std::vector<std::vector<uint8_t>> async{3, std::vector<uint8_t>(2, 0xEE)};
    std::vector<std::vector<uint8_t>> sync{5, std::vector<uint8_t>(1, 0xEE)};
    uint8_t* a(int i) { return async[i].data(); }
    uint8_t* s(int i) { return sync[i].data(); }
  };

  uint32_t get(Destinations& d, uint32_t asyncCount, uint32_t syncCount, bool skipAsyncUp = false) {
    return ZinMOX_getPortBits(handle, &ref, d.a(0), skipAsyncUp ? nullptr : d.a(1), d.a(2),
                              asyncCount, d.s(0), d.s(1), d.s(2), d.s(3), d.s(4), syncCount);
  }
};

TEST_F(PortBits, CountChecksRunInOrderAndSendNothing) {
  std::vector<uint8_t> any(64, 0);
  const uint8_t* p = any.data();
  EXPECT_EQ(set(p, p, kAsyncOut - 1, p, p, kSyncOut), kFailure);
  expectOnlyError(kAsyncOutCount);
  EXPECT_EQ(set(p, p, kAsyncOut + 1, p, p, 999), kFailure);
  expectOnlyError(kAsyncOutCount);
  EXPECT_EQ(set(p, p, kAsyncOut, p, p, kSyncOut - 1), kFailure);
  expectOnlyError(kSyncOutCount);
  EXPECT_EQ(set(p, p, 0, p, p, kSyncOut + 1), kFailure);
  expectOnlyError(kSyncOutCount);
  EXPECT_TRUE(transport->transfers().empty());

  Destinations d;
  EXPECT_EQ(get(d, kAsyncIn - 1, kSyncIn), kFailure);
  expectOnlyError(kAsyncInCount);
  EXPECT_EQ(get(d, kAsyncIn + 1, 999), kFailure);
  expectOnlyError(kAsyncInCount);
  EXPECT_EQ(get(d, kAsyncIn, kSyncIn + 1), kFailure);
  expectOnlyError(kSyncInCount);
  EXPECT_EQ(get(d, 0, kSyncIn - 1), kFailure);
  expectOnlyError(kSyncInCount);
  EXPECT_TRUE(transport->transfers().empty());
  EXPECT_EQ(d.async[0][0], 0xEE);
}

TEST_F(PortBits, NullVectorsOfAWrittenPortAreRefusedBeforeAnythingIsStaged) {
  const std::vector<uint8_t> first = packValue(0x0A5, 2), ones(32, 0xFF);
  ASSERT_EQ(set(first.data(), ones.data(), kAsyncOut, nullptr, nullptr, 0), 0u);
  const std::vector<uint8_t> other = packValue(0xF00, 2);
  const uint8_t* o = other.data();
  const uint8_t* m = ones.data();
  EXPECT_EQ(set(nullptr, m, kAsyncOut, m, m, kSyncOut), kFailure);
  expectOnlyError("ZinMOX_setPortBits() arg. failed:asyncOutData!=0");
  EXPECT_EQ(set(o, nullptr, kAsyncOut, m, m, kSyncOut), kFailure);
  expectOnlyError("ZinMOX_setPortBits() arg. failed:asyncOutUpdateMask!=0");
  EXPECT_EQ(set(o, m, kAsyncOut, nullptr, m, kSyncOut), kFailure);
  expectOnlyError("ZinMOX_setPortBits() arg. failed:syncOutData!=0");
  EXPECT_EQ(set(o, m, kAsyncOut, m, nullptr, kSyncOut), kFailure);
  expectOnlyError("ZinMOX_setPortBits() arg. failed:syncOutUpdateMask!=0");
  // Both count checks come before the pointer checks.
  EXPECT_EQ(set(nullptr, nullptr, kAsyncOut, m, m, kSyncOut + 1), kFailure);
  expectOnlyError(kSyncOutCount);
  EXPECT_EQ(transport->transfers().size(), 1u) << "failed calls send nothing";

  // Null vectors of a port left out of the write are fine; the failed calls staged nothing.
  ASSERT_EQ(set(nullptr, nullptr, 0, nullptr, nullptr, 0), 0u);
  WriteImage image = lastWrite();
  EXPECT_EQ(image.asyncValues, unpackBits(first.data(), kAsyncOut));
  EXPECT_EQ(image.asyncUpdate, std::string(kAsyncOut, '0'));
  EXPECT_EQ(image.syncUpdate, std::string(kSyncOut, '0'));
  for (const std::string& steps : image.steps) EXPECT_EQ(steps, std::string(16, '0'));
  expectNoMessages();
}

TEST_F(PortBits, PacksValuesMasksAndStepVectors) {
  // Spare bits above each port's width are set and must be ignored.
  const std::vector<uint8_t> asyncData = packValue(0xF000 | 0x9C5, 2);
  const std::vector<uint8_t> asyncMask = packValue(0xF000 | 0x30F, 2);
  std::vector<uint8_t> steps;
  std::vector<uint32_t> stepValues;
  for (uint32_t t = 0; t < 16; ++t) {
    stepValues.push_back((t * 97 + 13) & 0x3FF);
    std::vector<uint8_t> bytes = packValue(stepValues.back() | 0xFC00, 2);
    steps.insert(steps.end(), bytes.begin(), bytes.end());
  }
  const std::vector<uint8_t> syncMask = packValue(0xFC00 | 0x201, 2);
  ASSERT_EQ(
      set(asyncData.data(), asyncMask.data(), kAsyncOut, steps.data(), syncMask.data(), kSyncOut),
      0u);
  EXPECT_EQ(transport->flushCount(), 1u);
  WriteImage image = lastWrite();
  EXPECT_EQ(image.asyncValues, unpackBits(asyncData.data(), kAsyncOut));
  EXPECT_EQ(image.asyncUpdate, unpackBits(asyncMask.data(), kAsyncOut));
  EXPECT_EQ(image.syncUpdate, "1000000001");
  ASSERT_EQ(image.steps.size(), kSyncOut);
  for (uint32_t bit = 0; bit < kSyncOut; ++bit) {
    std::string expected;
    for (uint32_t t = 0; t < 16; ++t) expected.push_back(((stepValues[t] >> bit) & 1) ? '1' : '0');
    EXPECT_EQ(image.steps[bit], expected) << "synchronous output bit " << bit;
  }

  // Only the synchronous port: asynchronous values stay, their marks are cleared.
  std::vector<uint8_t> constantHigh(32, 0xFF);
  ASSERT_EQ(set(nullptr, nullptr, 0, constantHigh.data(), syncMask.data(), kSyncOut), 0u);
  WriteImage second = lastWrite();
  EXPECT_EQ(second.asyncValues, image.asyncValues);
  EXPECT_EQ(second.asyncUpdate, std::string(kAsyncOut, '0'));
  for (const std::string& s : second.steps) EXPECT_EQ(s, std::string(16, '1'));
}

TEST_F(PortBits, ReadFillsTheVectorsAskedFor) {
  std::mt19937 rng(21);
  auto bitsOf = [](const std::vector<uint8_t>& v, uint32_t n) { return unpackBits(v.data(), n); };
  auto sentinel = [](const std::vector<uint8_t>& v) {
    for (uint8_t b : v) {
      if (b != 0xEE) return false;
    }
    return true;
  };

  // Everything asked for.
  InputImage image = InputImage::random(kAsyncIn, kSyncIn, rng);
  transport->queueReadData(readDataFor(image));
  Destinations all;
  ASSERT_EQ(get(all, kAsyncIn, kSyncIn), 0u);
  EXPECT_EQ(bitsOf(all.async[0], kAsyncIn), image.asyncValue);
  EXPECT_EQ(bitsOf(all.async[1], kAsyncIn), image.asyncUp);
  EXPECT_EQ(bitsOf(all.async[2], kAsyncIn), image.asyncDown);
  EXPECT_EQ(bitsOf(all.sync[0], kSyncIn), image.syncValue);
  EXPECT_EQ(bitsOf(all.sync[1], kSyncIn), image.syncUp);
  EXPECT_EQ(bitsOf(all.sync[2], kSyncIn), image.syncDown);
  EXPECT_EQ(bitsOf(all.sync[3], kSyncIn), image.syncSyncUp);
  EXPECT_EQ(bitsOf(all.sync[4], kSyncIn), image.syncSyncDown);

  // A null destination is skipped, the others are filled.
  image = InputImage::random(kAsyncIn, kSyncIn, rng);
  transport->queueReadData(readDataFor(image));
  Destinations skipUp;
  ASSERT_EQ(get(skipUp, kAsyncIn, kSyncIn, true), 0u);
  EXPECT_TRUE(sentinel(skipUp.async[1]));
  EXPECT_EQ(bitsOf(skipUp.async[0], kAsyncIn), image.asyncValue);
  EXPECT_EQ(bitsOf(skipUp.async[2], kAsyncIn), image.asyncDown);
  EXPECT_EQ(bitsOf(skipUp.sync[4], kSyncIn), image.syncSyncDown);

  // A count of 0 fills none of that port's vectors, but the read still happens.
  image = InputImage::random(kAsyncIn, kSyncIn, rng);
  transport->queueReadData(readDataFor(image));
  Destinations syncOnly;
  ASSERT_EQ(get(syncOnly, 0, kSyncIn), 0u);
  for (const auto& v : syncOnly.async) EXPECT_TRUE(sentinel(v));
  EXPECT_EQ(bitsOf(syncOnly.sync[0], kSyncIn), image.syncValue);
  EXPECT_EQ(bitsOf(syncOnly.sync[3], kSyncIn), image.syncSyncUp);

  const std::size_t readsBefore = transport->transfers().size();
  Destinations none;
  ASSERT_EQ(get(none, 0, 0), 0u);
  EXPECT_EQ(transport->transfers().size(), readsBefore + 1);
  for (const auto& v : none.async) EXPECT_TRUE(sentinel(v));
  for (const auto& v : none.sync) EXPECT_TRUE(sentinel(v));
  EXPECT_EQ(transport->flushCount(), 0u);
  expectNoMessages();
}

}  // namespace

namespace {

class LargePorts : public ZinTest::SessionFixture {};

TEST_F(LargePorts, WidestPortsRoundTripBitExactly) {
  using namespace ZinTest;
  constexpr uint32_t asyncIn = 65535, syncIn = 1001, asyncOut = 65535, syncOut = 4099;
  initMoxCore(ref, asyncIn, syncIn, asyncOut, syncOut);
  std::mt19937 rng(41);
  std::uniform_int_distribution<int> byte(0, 255);
  auto randomBytes = [&](std::size_t n) {
    std::vector<uint8_t> v(n);
    for (uint8_t& b : v) b = static_cast<uint8_t>(byte(rng));
    return v;
  };
  const std::size_t syncBytes = (syncOut + 7) / 8;
  const std::vector<uint8_t> asyncData = randomBytes((asyncOut + 7) / 8),
                             asyncMask = randomBytes((asyncOut + 7) / 8),
                             steps = randomBytes(16 * syncBytes), syncMask = randomBytes(syncBytes);
  ASSERT_EQ(ZinMOX_setPortBits(handle, &ref, asyncData.data(), asyncMask.data(), asyncOut,
                               steps.data(), syncMask.data(), syncOut),
            0u);
  auto sent = transport->transfers();
  ASSERT_EQ(sent.size(), 1u);
  WriteImage image = decodeWriteCommand(sent[0].text, linePrefix(ref), asyncOut, syncOut);
  EXPECT_EQ(image.asyncValues, unpackBits(asyncData.data(), asyncOut));
  EXPECT_EQ(image.asyncUpdate, unpackBits(asyncMask.data(), asyncOut));
  EXPECT_EQ(image.syncUpdate, unpackBits(syncMask.data(), syncOut));
  std::vector<std::string> stepStrings(16);
  for (uint32_t t = 0; t < 16; ++t) stepStrings[t] = unpackBits(&steps[t * syncBytes], syncOut);
  for (uint32_t i = 0; i < syncOut; i += 97) {
    std::string expected;
    for (uint32_t t = 0; t < 16; ++t) expected.push_back(stepStrings[t][i]);
    EXPECT_EQ(image.steps[i], expected) << "synchronous output bit " << i;
  }

  InputImage input = InputImage::random(asyncIn, syncIn, rng);
  transport->queueReadData(readDataFor(input));
  std::vector<std::vector<uint8_t>> async(3, std::vector<uint8_t>((asyncIn + 7) / 8));
  std::vector<std::vector<uint8_t>> sync(5, std::vector<uint8_t>((syncIn + 7) / 8));
  ASSERT_EQ(ZinMOX_getPortBits(handle, &ref, async[0].data(), async[1].data(), async[2].data(),
                               asyncIn, sync[0].data(), sync[1].data(), sync[2].data(),
                               sync[3].data(), sync[4].data(), syncIn),
            0u);
  EXPECT_EQ(unpackBits(async[0].data(), asyncIn), input.asyncValue);
  EXPECT_EQ(unpackBits(async[2].data(), asyncIn), input.asyncDown);
  EXPECT_EQ(unpackBits(sync[1].data(), syncIn), input.syncUp);
  EXPECT_EQ(unpackBits(sync[4].data(), syncIn), input.syncSyncDown);
  expectNoMessages();
}

}  // namespace
