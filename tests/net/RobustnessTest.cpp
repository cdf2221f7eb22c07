// Untrusted input: clients that vanish mid-frame, stall, send oversized or malformed frames, or
// crowd the server. The server answers or closes, never crashes or hangs, and keeps serving.
#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <filesystem>
#include <fstream>
#include <random>
#include <thread>

#include "NetTestUtil.h"

namespace {

using namespace ZinNetTest;
using std::chrono::milliseconds;

// A flush-free read of the demo's full-layout core's inputs: 19 + 1 bytes.
const std::string kReadText = "00 1 0 03 1 00000098 0\n00 1 0 04 1 00000004 0";
constexpr uint32_t kReadBits = 160;

// A well-behaved client gets its answer: the server is still serving.
void expectServing(TestServer& server) {
  ZinNet::TcpTransport transport("127.0.0.1", server.port(), {1000, 2000});
  std::vector<unsigned char> data(kReadBits / 8);
  EXPECT_NO_THROW(transport.commandSequence(kReadText, data.data(), kReadBits));
}

// Each row greets with a version (0: not at all) and sends its frames in turn on one connection. A
// bad request is refused; a bad greeting or an unskippable length is answered by a closing frame.
void expectEachVersionAnswersOrRefusesEachFrame(TestServer& server) {
  const Bytes body = concat({u32(kReadBits), text(kReadText)});
  struct Exchange {
    Bytes request;
    uint8_t type;
    std::string text;  // "" for answers with data
  };
  const std::vector<std::pair<uint16_t, std::vector<Exchange>>> table = {
      {0,
       {{hello(3), kClosing, "protocol version 3 is not supported; this server speaks 1 and 2"}}},
      {0,
       {{hello(0), kClosing, "protocol version 0 is not supported; this server speaks 1 and 2"}}},
      {0, {{frame(kPing), kClosing, "expected a hello frame first, got 0x07 (ping)"}}},
      {0, {{concat({u32(64), Bytes(64, 1)}), kClosing, "not a ZinNet hello"}}},
      {0,
       {{concat({u32(65), Bytes(65, 1)}), kClosing,
         "frame of 65 bytes exceeds the limit of 64 bytes before the greeting is done"}}},
      {1,
       {{frame(kReadStatus, u32(1)), kRefused, "status read body too short: 4 bytes"},
        {frame(kSequence, concat({u32(0xFFFFFFFF), text(kReadText)})), kRefused,
         "command sequence asks for 536870912 bytes of read data (at most 1024)"},
        {frame(0x7F), kRefused, "unknown request type 0x7F (unknown)"},
        {frame(kPing), kRefused, "unknown request type 0x07 (ping)"},
        {frame(kSequenceAndFlush, body), kRefused,
         "unknown request type 0x06 (command sequence and flush)"},
        {frame(kSequence, body), kReadData, ""},
        {concat({u32(1u << 30), Bytes(64, 0xAB)}), kClosing,
         "frame of 1073741824 bytes exceeds the limit of 65536 bytes"}}},
      {2,
       {{frame(kPing), kPong, ""},
        {frame(kPing, {0}), kRefused, "ping body too long: 1 bytes"},
        {frame(kSequenceAndFlush, {0}), kRefused,
         "command sequence and flush body too short: 1 bytes"},
        {frame(kSequenceAndFlush, body), kReadData, ""},
        {frame(kSequence, body), kReadData, ""},
        {hello(2), kRefused, "hello sent twice"},
        {u32(0), kClosing, "frame of length 0"}}},
  };
  for (const auto& [version, exchanges] : table) {
    RawClient client(server.port(), version);
    for (const Exchange& exchange : exchanges) {
      const RawFrame reply = client.exchange(exchange.request);
      EXPECT_EQ(reply.type, exchange.type) << reply.text();
      const bool data = exchange.type == kReadData;
      EXPECT_EQ(data ? "" : reply.text(), exchange.text);
      EXPECT_EQ(reply.body.size(), data ? kReadBits / 8 : exchange.text.size());
    }
    EXPECT_TRUE(client.closedWithin(milliseconds(2000))) << "version " << version;
  }
}

// The fuzz corpus and seeded mutations of it (flipped, dropped and repeated bytes), each sent
// whole before the end of the stream: every frame sent back is well formed, and the server closes.
void expectTheFuzzCorpusAnsweredAndClosed(TestServer& server) {
  std::vector<std::filesystem::path> files;
  for (const auto& entry : std::filesystem::directory_iterator(ZIN_NET_CORPUS_DIR)) {
    if (entry.path().extension() == ".bin") files.push_back(entry.path());
  }
  std::sort(files.begin(), files.end());
  ASSERT_GE(files.size(), 10u);
  std::vector<std::pair<std::string, Bytes>> inputs;
  for (const auto& path : files) {
    std::ifstream in(path, std::ios::binary);
    inputs.emplace_back(path.filename().string(), Bytes(std::istreambuf_iterator<char>(in), {}));
  }
  std::mt19937 rng(20261206);
  for (int round = 0; round < 60; ++round) {
    Bytes bytes = inputs[rng() % files.size()].second;
    for (int e = 1 + static_cast<int>(rng() % 4); e > 0 && !bytes.empty(); --e) {
      const size_t at = rng() % bytes.size();
      const auto kind = rng() % 3;
      if (kind == 0) bytes[at] ^= static_cast<unsigned char>(1u << (rng() % 8));
      if (kind == 1) bytes.erase(bytes.begin() + static_cast<long>(at));
      if (kind == 2) bytes.insert(bytes.begin() + static_cast<long>(at), bytes[at]);
    }
    inputs.emplace_back("mutation " + std::to_string(round), bytes);
  }
  for (const auto& [name, bytes] : inputs) {
    RawClient client(server.port());
    client.send(bytes);
    client.shutdownSend();
    const auto end = std::chrono::steady_clock::now() + milliseconds(3000);
    while (const auto reply = client.readFrame(milliseconds(3000))) {
      EXPECT_GE(reply->type, 0x81) << name;
      if (std::chrono::steady_clock::now() > end) break;
    }
    EXPECT_TRUE(client.closedWithin(milliseconds(100))) << name << ": the server did not close";
  }
}

// Clients that vanish inside a frame or before their answer, stall, never greet or go idle are
// closed at their limits; then the frame table and the fuzz corpus; the server keeps serving.
TEST(Robustness, UntrustedBytesAreAnsweredRefusedOrClosedAtTheirLimits) {
  const ZinNet::ServerOptions quick{.maxFrameBytes = 1 << 16,
                                    .maxReadBytes = 1 << 10,
                                    .frameTimeoutMs = 300,
                                    .writeTimeoutMs = 300,
                                    .greetingTimeoutMs = 400,
                                    .idleTimeoutMs = 600};
  TestServer server(std::make_shared<ZinSim::Target>(), quick);
  const Bytes request = frame(kSequence, concat({u32(kReadBits), text(kReadText)}));
  for (size_t cut : {size_t{2}, size_t{4}, size_t{9}, request.size() - 1, request.size()}) {
    RawClient client(server.port(), 2);
    client.send(Bytes(request.begin(), request.begin() + static_cast<long>(cut)));
  }
  EXPECT_TRUE(server.waitUntilNoConnections(milliseconds(2000)));
  EXPECT_GE(server.server().stats().framesRefused, 4u);
  RawClient stalled(server.port(), 2);
  stalled.send({0, 0, 0, 40, kSequence, 0, 0});  // 7 of 44 bytes, then nothing
  expectServing(server);
  EXPECT_TRUE(stalled.closedWithin(milliseconds(3000)));
  RawClient silent(server.port());
  RawClient idle(server.port(), 2);
  EXPECT_FALSE(idle.closedWithin(milliseconds(300)));
  EXPECT_TRUE(idle.closedWithin(milliseconds(3000)));
  EXPECT_TRUE(silent.closedWithin(milliseconds(100)));
  EXPECT_TRUE(server.waitUntilNoConnections(milliseconds(2000)));  // the closes are logged
  for (const char* expected :
       {"a frame not done within 300 ms", "the greeting not done within 400 ms",
        "waiting for a frame not done within 600 ms"}) {
    EXPECT_THAT(server.log(), testing::Contains(HasSubstr(expected)));
  }
  expectEachVersionAnswersOrRefusesEachFrame(server);
  expectTheFuzzCorpusAnsweredAndClosed(server);
  expectServing(server);
  EXPECT_TRUE(server.waitUntilNoConnections(milliseconds(3000)));
}

// Default limits: 64 silent connections cannot lock others out (the oldest makes room, the rest go
// at the 5 s greeting limit); maximal sequences of two clients (4 MiB of commits, of full-width
// write and commit pairs) to four 65535-bit ports leave room for a third's status reads.
TEST(Robustness, NoClientCanLockOrStarveOthersOut) {
  ZinSim::TargetDescription big;
  big.cores.push_back(ZinSim::CoreDescription{});
  big.cores[0].asyncInputs = big.cores[0].syncInputs = 65535;
  big.cores[0].asyncOutputs = big.cores[0].syncOutputs = 65535;
  TestServer server(std::make_shared<ZinSim::Target>(big));
  ZinNet::TcpTransport other("127.0.0.1", server.port());
  const auto expectStatus = [&] {
    ZIN_CORE_INFO info{};
    std::vector<unsigned char> status(16);
    EXPECT_NO_THROW(other.readStatus({0, 0, 0}, info, status.data(), 16, 128));
    EXPECT_EQ(info.coreType, 9u);
  };
  std::vector<std::unique_ptr<RawClient>> crowd;
  for (int i = 0; i < 64; ++i) crowd.push_back(std::make_unique<RawClient>(server.port()));
  const auto connected = std::chrono::steady_clock::now();
  for (int i = 0; i < 300 && server.server().stats().connectionsOpen < 64; ++i) {
    std::this_thread::sleep_for(milliseconds(10));
  }
  expectStatus();
  EXPECT_TRUE(crowd[0]->closedWithin(milliseconds(1000)));
  const auto elapsed = std::chrono::steady_clock::now() - connected;
  EXPECT_FALSE(crowd[1]->closedWithin(
      std::chrono::duration_cast<milliseconds>(std::chrono::seconds(4) - elapsed)));
  EXPECT_TRUE(crowd[1]->closedWithin(milliseconds(4000)));
  EXPECT_TRUE(crowd[63]->closedWithin(milliseconds(1000)));

  const uint32_t maxText = ZinNet::ServerOptions{}.maxFrameBytes - 5;
  const std::string commit = "00 0 0 02 0 00000004 0";
  const std::string pair = "00 0 0 01 0 0012FFEE " + std::string(311292, '0') + "\n" + commit;
  std::atomic<bool> stop{false};
  std::vector<std::thread> hostile;
  for (const std::string* line : {&commit, &pair}) {
    std::string flood = *line;
    while (flood.size() + 1 + line->size() <= maxText) flood += "\n" + *line;
    hostile.emplace_back([&, request = frame(kSequence, concat({u32(0), text(flood)}))] {
      RawClient client(server.port(), 2);
      while (!stop) EXPECT_EQ(client.exchange(request, std::chrono::seconds(60)).type, kReadData);
    });
  }
  for (int i = 0; i < 5; ++i) {
    expectStatus();
    std::this_thread::sleep_for(milliseconds(50));
  }
  stop = true;
  for (std::thread& t : hostile) t.join();
}

}  // namespace
