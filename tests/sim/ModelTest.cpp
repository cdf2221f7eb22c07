// The simulated MOX core driven through the transport seam alone.
#include <gtest/gtest.h>

#include <thread>

#include "SimTestUtil.h"

namespace {

using ZinSim::InputPort;
using ZinSim::InputSource;
using ZinSim::OutputPort;
using ZinSimTest::moxCore;
using ZinSimTest::readInputs;
using ZinSimTest::writeText;
using ZinTest::WriteImage;

const ZIN_CORE_REF kRef{1, 2, 0};
const std::string kPrefix = "01 2 0 ";

class ModelTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ZinSim::CoreDescription other;
    other.ref = {1, 2, 5};
    other.type = 3;
    target = ZinSimTest::targetWith({moxCore(kRef, 4, 3, 4, 2), other});
  }

  void write(const WriteImage& image) {
    target->commandSequence(writeText(kPrefix, image), nullptr, 0);
  }
  ZinTest::InputImage read() { return readInputs(*target, kPrefix, 4, 3); }

  std::shared_ptr<ZinSim::Target> target;
};

// Every field of a read image in one text, for comparing two images at once.
std::string allFields(const ZinTest::InputImage& in) {
  return in.asyncValue + in.asyncUp + in.asyncDown + in.syncValue + in.syncUp + in.syncDown +
         in.syncSyncUp + in.syncSyncDown;
}

// The message of the runtime error that `call` throws, or "(nothing thrown)".
template <class Call>
std::string errorText(Call&& call) {
  try {
    call();
  } catch (const std::runtime_error& e) {
    return e.what();
  }
  return "(nothing thrown)";
}

WriteImage asyncImage(const std::string& values, const std::string& update) {
  WriteImage image = WriteImage::zeros(4, 2);
  image.asyncValues = values;
  image.asyncUpdate = update;
  return image;
}

TEST_F(ModelTest, CommitAppliesOnlyMarkedBitsAndAsyncInputsFollowAtOnce) {
  write(asyncImage("1111", "0110"));
  EXPECT_EQ(target->asyncOutputLevels(kRef), "0110");
  EXPECT_EQ(target->asyncInputLevels(kRef), "0110");
  write(asyncImage("0000", "0100"));
  EXPECT_EQ(target->asyncOutputLevels(kRef), "0010");
  const ZinTest::InputImage in = read(), cleared = read();  // cleared at the edge after a read
  EXPECT_EQ(in.asyncValue + " " + in.asyncUp + " " + in.asyncDown, "0010 0110 0100");
  EXPECT_EQ(cleared.asyncUp + cleared.asyncDown, "00000000");
}

TEST_F(ModelTest, MalformedLinesAreRejectedWithNothingApplied) {
  const std::string good = writeText(kPrefix, asyncImage("1111", "1111"));
  const std::string goodWrite = good.substr(0, good.find('\n'));
  const std::string commit = kPrefix + "02 0 00000004 0";
  struct Case {
    std::string secondLine, expected;
  };
  const std::vector<Case> cases = {
      {"01 2 0 02 0 00000004", "expected 7 fields"},
      {"01 2 0 02 0 00000004 0 ", "expected 7 fields"},
      {"1 2 0 02 0 00000004 0 0", "expected 7 fields"},
      {"1 2 0 02 0 00000004 0", "device field \"1\""},
      {"01 22 0 02 0 00000004 0", "user chain field"},
      {"01 2 x 02 0 00000004 0", "core field"},
      {"01 2 1 02 0 00000004 0", "no core at device 01 chain 2 core 1"},
      {"01 2 5 02 0 00000004 0", "device 01 chain 2 core 5 is not a MOX core (type 3)"},
      {"01 2 0 05 0 00000004 0", "unknown command code \"05\""},
      {"01 2 0 02 1 00000004 0", "read flag \"1\" for code 02 (expected 0)"},
      {"01 2 0 03 0 00000032 0", "read flag \"0\" for code 03 (expected 1)"},
      {"01 2 0 04 1 0004 0", "bit length \"0004\" is not 8 hexadecimal digits"},
      {"01 2 0 02 0 00000005 0",
       "bit length 00000005 does not match the core: code 02 needs 00000004"},
      {"01 2 0 03 1 00000033 0", "code 03 needs 00000032"},
      {"01 2 0 01 0 0000002A 0", "code 01 needs 0000002B"},
      {"01 2 0 01 0 0000002B 0XX00000000", "data is not hexadecimal (character 2)"},
      {"01 2 0 01 0 0000002B 40000000000", "data does not fit in 42 bits"},
      {"01 2 0 01 0 0000002B 0", "data has 1 digits; bit length 0000002B needs 11"},
      {"01 2 0 01 0 0000002B 000000000000", "data has 12 digits"},
      {"01 2 0 02 0 00000004 1", "data must be 0 for code 02"},
      {"01 2 0 04 1 00000004 00000001", "data must be 0 for code 04"},
      {"", "expected 7 fields separated by single blanks, found 1"},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.secondLine);
    const std::string e = errorText([&] {
      target->commandSequence(goodWrite + "\n" + c.secondLine + "\n" + commit, nullptr, 0);
    });
    EXPECT_EQ(e.rfind("ZinSim: command line 2: ", 0), 0u) << e;
    EXPECT_NE(e.find(c.expected), std::string::npos) << e;
    EXPECT_EQ(target->asyncOutputLevels(kRef), "0000") << "the good lines took effect";
    EXPECT_EQ(target->cycle(kRef), 0u) << "time passed for a rejected sequence";
  }
  // A trailing newline is an empty last line; lower-case hexadecimal is fine.
  EXPECT_THROW(target->commandSequence(good + "\n", nullptr, 0), std::runtime_error);
  std::string lower = good;
  for (char& c : lower) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  target->commandSequence(lower, nullptr, 0);
  EXPECT_EQ(target->asyncOutputLevels(kRef), "1111");
}

TEST_F(ModelTest, ReadsNeedRoomForTheirDataAndFailuresCanBeInjected) {
  std::vector<unsigned char> small(6, 0);
  const std::string readText = ZinTest::readCommandText(kPrefix, 4, 3);
  EXPECT_THROW(target->commandSequence(readText, small.data(), 48), std::runtime_error);
  EXPECT_THROW(target->commandSequence(readText, nullptr, 0), std::runtime_error);
  write(asyncImage("1000", "1000"));
  target->failNextTransfer("cable unplugged");
  EXPECT_EQ(errorText([&] { write(asyncImage("0100", "1100")); }), "cable unplugged");
  EXPECT_EQ(target->asyncOutputLevels(kRef), "1000");
  write(asyncImage("0100", "1100"));
  EXPECT_EQ(target->asyncOutputLevels(kRef), "0100");
  EXPECT_EQ(target->commandLog().size(), 5u);
  target->setCommandLogLimit(2);
  EXPECT_EQ(target->commandLog().size(), 2u);
  EXPECT_EQ(target->commandLog().back(), writeText(kPrefix, asyncImage("0100", "1100")));
}

TEST_F(ModelTest, PulseTrainPlaysSixteenStepsAfterTheCommitAndHoldsTheLast) {
  const std::string train = "0110100011101101";  // step t = character t
  WriteImage image = WriteImage::zeros(4, 2);
  image.steps[1] = train;
  image.syncUpdate = "01";
  target->setCyclesPerSequence(0);
  write(image);
  EXPECT_EQ(target->syncOutputLevels(kRef), "00") << "the commit cycle keeps the old level";
  for (size_t t = 0; t < 20; ++t) {
    target->advance(1);
    const char expected = train[std::min<size_t>(t, 15)];
    ASSERT_EQ(target->syncOutputLevels(kRef)[1], expected) << "cycle " << t;
    ASSERT_EQ(target->syncInputLevels(kRef)[1], expected) << "the loopback samples each cycle";
  }
  // Written again with its update character 0, the held level stays.
  image.syncUpdate = "00";
  image.steps[1] = std::string(16, '0');
  write(image);
  target->advance(3);
  EXPECT_EQ(target->syncOutputLevels(kRef), "01");
}

TEST_F(ModelTest, SyncInputsSampleOnTheClockAndLatchSampleChanges) {
  target->setCyclesPerSequence(0);
  target->setInputSource(kRef, InputPort::Sync, 2, InputSource::loopback(OutputPort::Async, 3));
  // Sync input 2 as value, activity up and down, sync activity up and down.
  auto input2 = [&] {
    const ZinTest::InputImage in = read();
    return std::string{in.syncValue[2], in.syncUp[2], in.syncDown[2], in.syncSyncUp[2],
                       in.syncSyncDown[2]};
  };
  write(asyncImage("0001", "0001"));
  EXPECT_EQ(input2(), "01000") << "a level change is seen at once, sampled at a clock edge";
  // A pulse within one cycle: level activity, but no sample ever changes.
  write(asyncImage("0000", "0001"));
  target->advance(1);
  EXPECT_EQ(input2(), "00100");
  // A pulse over a clock edge is sampled: sync activity in both directions.
  write(asyncImage("0001", "0001"));
  target->advance(1);
  write(asyncImage("0000", "0001"));
  target->advance(1);
  EXPECT_EQ(input2(), "01111");
}

TEST_F(ModelTest, ConstantCounterAndSquareSources) {
  target->setCyclesPerSequence(0);
  target->setInputSource(kRef, InputPort::Async, 0, InputSource::constant(true));
  target->setInputSource(kRef, InputPort::Async, 1, InputSource::counter(1));
  target->setInputSource(kRef, InputPort::Async, 2, InputSource::square(6, 2));
  EXPECT_EQ(read().asyncUp.substr(0, 1), "1") << "rewiring to 1 is a rising change";
  std::string counterBit, square;
  for (int t = 1; t <= 12; ++t) {
    target->advance(1);
    const std::string levels = target->asyncInputLevels(kRef);
    EXPECT_EQ(levels[0], '1');
    counterBit += levels[1];
    square += levels[2];
  }
  EXPECT_EQ(counterBit, "011001100110");  // bit 1 of the cycles 1 to 12
  EXPECT_EQ(square, "111000111000");      // low while (t + 2) mod 6 < 3
  EXPECT_THROW(target->setInputSource(kRef, InputPort::Async, 4, InputSource::constant(true)),
               std::invalid_argument);
  EXPECT_THROW(
      target->setInputSource(kRef, InputPort::Sync, 0, InputSource::loopback(OutputPort::Sync, 2)),
      std::invalid_argument);
  EXPECT_THROW(target->setInputSource(kRef, InputPort::Async, 0, InputSource::square(1)),
               std::invalid_argument);
  EXPECT_THROW(target->cycle(ZIN_CORE_REF{1, 2, 5}), std::invalid_argument);
}

TEST_F(ModelTest, LongAdvancesMatchCycleByCycleStepping) {
  auto twin = ZinSimTest::targetWith({moxCore(kRef, 4, 3, 4, 2)});
  WriteImage image = WriteImage::zeros(4, 2);
  image.steps[0] = "1010000000000001";
  image.syncUpdate = "11";
  for (auto* t : {target.get(), twin.get()}) {
    t->setCyclesPerSequence(0);
    t->setInputSource(kRef, InputPort::Async, 0, InputSource::counter(4));
    t->setInputSource(kRef, InputPort::Async, 1, InputSource::square(1000, 999));
    t->setInputSource(kRef, InputPort::Sync, 2, InputSource::counter(9));
    t->commandSequence(writeText(kPrefix, image), nullptr, 0);
  }
  for (uint64_t span : {5u, 40u, 700u, 3000u}) {
    SCOPED_TRACE(span);
    target->advance(span);
    for (uint64_t i = 0; i < span; ++i) twin->advance(1);
    EXPECT_EQ(allFields(read()), allFields(readInputs(*twin, kPrefix, 4, 3)));
  }
  EXPECT_EQ(target->cycle(kRef), twin->cycle(kRef));
  EXPECT_EQ(target->syncOutputLevels(kRef), "10");
}

TEST_F(ModelTest, AChangeAtTheClearingEdgeStaysLatched) {
  // Counter bit 0 toggles at every edge: the edge that carries out the read's clear also sets
  // the latch again, so every read sees activity.
  target->setInputSource(kRef, InputPort::Async, 0, InputSource::counter(0));
  // Counter bit 1 toggles at every second edge.
  target->setInputSource(kRef, InputPort::Async, 1, InputSource::counter(1));
  read();  // at cycle 0; its clear happens at edge 1
  std::string bit0, bit1;
  for (int i = 0; i < 4; ++i) {  // reads at cycles 1 to 4 see the changes of edges 1 to 4
    const ZinTest::InputImage in = read();
    bit0 += in.asyncUp[0] == '1' || in.asyncDown[0] == '1' ? '1' : '0';
    bit1 += in.asyncUp[1] == '1' || in.asyncDown[1] == '1' ? '1' : '0';
  }
  EXPECT_EQ(bit0, "1111");
  EXPECT_EQ(bit1, "0101");  // changes at edges 2 and 4; where nothing changes the clear clears
}

TEST_F(ModelTest, AReadThatLetsNoTimePassClearsEveryLatchAsItsSequenceEnds) {
  target->setCyclesPerSequence(0);
  target->setInputSource(kRef, InputPort::Sync, 0, InputSource::loopback(OutputPort::Async, 0));
  write(asyncImage("1000", "1000"));  // a rise and a fall, each sampled by a clock edge
  target->advance(1);
  write(asyncImage("0000", "1000"));
  target->advance(1);
  const ZinTest::InputImage set = read(), cleared = read();
  using I = ZinTest::InputImage;
  for (auto latch :
       {&I::asyncUp, &I::asyncDown, &I::syncUp, &I::syncDown, &I::syncSyncUp, &I::syncSyncDown}) {
    EXPECT_EQ((set.*latch)[0], '1');
    EXPECT_EQ((cleared.*latch).find('1'), std::string::npos) << cleared.*latch;
  }
}

TEST_F(ModelTest, StatusAndCoreList) {
  // The widths at bits 60, 76, 92 and 108 of the full layout, and no bit beyond the asked ones.
  for (uint32_t bits : {128u, 94u}) {
    ZIN_CORE_INFO info{};
    std::vector<unsigned char> status(16, 0), expected(16, 0);
    target->readStatus(kRef, info, status.data(), 16, bits);
    EXPECT_EQ(std::tuple(info.coreType, info.coreMajorVersion), std::tuple(9u, 10u));
    ZinTest::setStatusBits(expected, 60, 16, 4);
    ZinTest::setStatusBits(expected, 76, 16, 3);
    ZinTest::setStatusBits(expected, 92, bits == 128 ? 16 : 2, bits == 128 ? 4 : 0);
    if (bits == 128) ZinTest::setStatusBits(expected, 108, 16, 2);
    EXPECT_EQ(status, expected) << bits << " bits";
  }
  ZIN_CORE_INFO none{};
  std::vector<unsigned char> zeros(16, 0);
  target->readStatus(ZIN_CORE_REF{1, 2, 9}, none, zeros.data(), 16, 128);
  EXPECT_EQ(none.coreType, 0u);
  EXPECT_EQ(zeros, std::vector<unsigned char>(16, 0));
  std::vector<ZIN_CORE_REF> refs;
  EXPECT_TRUE(target->listCores(refs));
  ASSERT_EQ(refs.size(), 2u);
  EXPECT_EQ(refs[1].coreIndex, 5u);
  target->failNextStatusRead(std::make_exception_ptr(std::logic_error("no cable")));
  EXPECT_THROW(target->readStatus(kRef, none, zeros.data(), 16, 128), std::logic_error);
}

TEST(ModelLargeCore, WholePortsOfTheLargestWidthRoundTrip) {
  constexpr uint32_t kWidth = 65535;
  const ZIN_CORE_REF ref{0, 0, 0};
  auto target = ZinSimTest::targetWith({moxCore(ref, kWidth, kWidth, kWidth, kWidth)});
  target->setCyclesPerSequence(20);
  std::mt19937 rng(7);
  WriteImage image = WriteImage::zeros(kWidth, kWidth);
  for (uint32_t i = 0; i < kWidth; ++i) {
    image.asyncValues[i] = "01"[rng() & 1];
    image.steps[i] = std::string(16, "01"[rng() & 1]);
  }
  image.asyncUpdate.assign(kWidth, '1');
  image.syncUpdate.assign(kWidth, '1');
  target->commandSequence(writeText("00 0 0 ", image), nullptr, 0);
  const ZinTest::InputImage in = readInputs(*target, "00 0 0 ", kWidth, kWidth);
  std::string held(kWidth, '0');
  for (uint32_t i = 0; i < kWidth; ++i) held[i] = image.steps[i][15];
  EXPECT_TRUE(in.asyncValue == image.asyncValues && in.asyncUp == image.asyncValues);
  EXPECT_TRUE(in.syncValue == held && in.syncSyncUp == held);
}

// A 01 line costs 131072, a 02 line after it 131071, a repeated 02 line 1: 256 pairs and 256
// repeats are exactly the work limit, one more line is beyond it.
TEST(ModelLargeCore, SequenceWorkAndTheCommandLogAreBounded) {
  auto target = ZinSimTest::targetWith({moxCore({0, 0, 0}, 65535, 0, 65535, 0)});
  const std::string pair =
      "00 0 0 01 0 0001FFFF 3" + std::string(32767, 'F') + "\n" + "00 0 0 02 0 00000004 0\n";
  std::string text;
  for (int i = 0; i < 256; ++i) text += pair;
  for (int i = 0; i < 256; ++i) text += "00 0 0 02 0 00000004 0\n";
  text.pop_back();
  target->commandSequence(text, nullptr, 0);
  EXPECT_EQ(target->asyncOutputLevels({0, 0, 0}), std::string(65535, '1'));
  EXPECT_EQ(
      errorText([&] { target->commandSequence(text + "\n00 0 0 02 0 00000004 0", nullptr, 0); }),
      "ZinSim: command line 769: the sequence exceeds the work limit of 67108864 bit "
      "operations");
  // The log keeps at most 8 MiB of text, and the beginning of a longer text.
  const size_t half = ZinSim::Target::kCommandLogBytes / 2;
  for (char c : {'a', 'b', 'c'}) {
    EXPECT_THROW(target->commandSequence(std::string(half, c), nullptr, 0), std::runtime_error);
  }
  const std::vector<std::string> log = target->commandLog();
  ASSERT_EQ(log.size(), 2u);
  EXPECT_EQ(log[0], std::string(half, 'b'));
  EXPECT_THROW(target->commandSequence(std::string(2 * half + 1, 'd'), nullptr, 0),
               std::runtime_error);
  EXPECT_EQ(target->commandLog(), std::vector<std::string>{std::string(2 * half, 'd')});
}

TEST(ModelThreads, OneTargetServesSeveralThreads) {
  std::vector<ZinSim::CoreDescription> cores;
  for (uint32_t c = 0; c < 4; ++c) cores.push_back(moxCore(ZIN_CORE_REF{0, 0, c}, 8, 8, 8, 8));
  auto target = ZinSimTest::targetWith(cores);
  std::vector<std::thread> threads;
  for (uint32_t c = 0; c < 4; ++c) {
    threads.emplace_back([&, c] {
      const std::string prefix = "00 0 " + std::to_string(c) + " ";
      for (int i = 0; i < 100; ++i) {
        WriteImage image = WriteImage::zeros(8, 8);
        image.asyncValues = std::string(8, "01"[i & 1]);
        image.asyncUpdate.assign(8, '1');
        target->commandSequence(writeText(prefix, image), nullptr, 0);
        const uint32_t r = ZinTest::readBitCount(8, 8);
        std::vector<unsigned char> data(r / 8);
        target->commandSequence(ZinTest::readCommandText(prefix, 8, 8), data.data(), r);
        target->advance(1);
      }
    });
  }
  for (std::thread& t : threads) t.join();
  for (uint32_t c = 0; c < 4; ++c)
    EXPECT_EQ(target->asyncOutputLevels(ZIN_CORE_REF{0, 0, c}), "11111111");
}

}  // namespace
