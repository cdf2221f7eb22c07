// Several clients' sessions on one served target; the life of a client connection (connect errors,
// timeouts, loss, reconnection, an older server); concurrent requests, which never interleave.
#include <gtest/gtest.h>

#include <atomic>
#include <future>
#include <mutex>
#include <thread>

#include "NetTestUtil.h"
#include "ZinMOX/ZinMOX.h"
#include "ZinNet/ZinNet.h"
#include "ZinRT/ZinJtag.h"

namespace {

using namespace ZinNetTest;
using ZinRT::ZinMOX_ValueMap;

ZIN_CORE_REF kFull{0, 1, 0};  // the demo design's full-layout core, inputs looped back

/// A session on a server, recording its messages (sent on the calling thread).
struct Client {
  explicit Client(uint16_t port) : handle(ZinNet_openSession("127.0.0.1", port, 2000)) {
    EXPECT_NE(handle, 0u) << ZinNet_lastError();
    const auto record = [](void* user, uint32_t, uint32_t, const char* text) {
      static_cast<std::vector<std::string>*>(user)->push_back(text);
    };
    if (handle != 0) ZinJtag_setMessageHandler(handle, record, &messages);
  }
  ~Client() {
    if (handle != 0) ZinJtag_closeSession(handle);
  }
  std::vector<std::string> takeMessages() { return std::exchange(messages, {}); }
  uint32_t write(const std::string& key, const std::string& value) {
    ZinMOX_ValueMap values{{key, value}};
    uintptr_t word = reinterpret_cast<uintptr_t>(&values);
    return ZinMOX_writeValues(handle, &kFull, &word);
  }
  ZinMOX_ValueMap read() {
    ZinMOX_ValueMap values;
    uintptr_t word = reinterpret_cast<uintptr_t>(&values);
    return ZinMOX_readValues(handle, &kFull, &word) == ZINMOX_SUCCESS ? values : ZinMOX_ValueMap{};
  }

  uint32_t handle;
  std::vector<std::string> messages;
};

// Clients share the target's state; a target failure arrives on the call that caused it, with the
// target's own text; a lost server fails the call, and the next call connects again.
TEST(SharedTarget, ClientsShareOneTargetAndItsFailures) {
  auto target = std::make_shared<ZinSim::Target>();
  auto server = std::make_unique<TestServer>(target);
  const uint16_t port = server->port();
  Client a(port);
  Client b(port);
  for (Client* c : {&a, &b}) ASSERT_EQ(ZinMOX_initCore(c->handle, &kFull), ZINMOX_SUCCESS);
  ASSERT_EQ(a.write("async_out_data", "A5C3"), ZINMOX_SUCCESS);
  EXPECT_EQ(target->asyncOutputLevels(kFull), "1100001110100101");
  EXPECT_EQ(b.read()["async_in_data"], "A5C3");
  ASSERT_EQ(b.write("async_out_data", "1234"), ZINMOX_SUCCESS);
  ZinMOX_ValueMap in = a.read();
  EXPECT_EQ(in["async_in_data"], "1234");
  // The activity latches belong to the target too: b's read cleared them, b's write set them.
  EXPECT_EQ(in["async_in_data.activity_up"], "1234");
  EXPECT_EQ(in["async_in_data.activity_down"], "A5C3");
  EXPECT_TRUE(b.takeMessages().empty());
  EXPECT_EQ(target->flushCount(), 2u);
  EXPECT_GE(server->server().stats().requestsServed, 6u);  // each write is one request
  // A target failure keeps the connection.
  target->failNextTransfer("ZinSim test: cable unplugged");
  EXPECT_EQ(a.write("async_out_data", "FFFF"), ZINMOX_FAILURE);
  EXPECT_EQ(a.takeMessages(), std::vector<std::string>{"ZinSim test: cable unplugged"});
  EXPECT_EQ(a.write("async_out_data", "0001"), ZINMOX_SUCCESS);
  EXPECT_EQ(server->server().stats().connectionsAccepted, 2u);
  auto transport = std::make_shared<ZinNet::TcpTransport>("127.0.0.1", port);
  std::vector<ZIN_CORE_REF> refs;
  ASSERT_TRUE(transport->listCores(refs));
  EXPECT_EQ(refs.size(), target->description().cores.size());
  EXPECT_THROW(transport->commandSequence("00 1 0 07 0 00000004 0", nullptr, 0),
               ZinNet::TargetError);
  EXPECT_EQ(transport->serverName(), "ZinNet target server");
  // Version 2 folds the flush into the write: a failed sequence skips it, a good one flushes.
  EXPECT_EQ(transport->protocolVersion(), 2u);
  EXPECT_NO_THROW(transport->ping());
  const uint64_t flushes = target->flushCount();
  target->failNextTransfer("ZinSim test: folded");
  EXPECT_EQ(errorOf<ZinNet::TargetError>(
                [&] { transport->commandSequenceThenFlush("00 1 0 02 0 00000004 0", nullptr, 0); }),
            "ZinSim test: folded");
  EXPECT_EQ(target->flushCount(), flushes);
  transport->commandSequenceThenFlush("00 1 0 02 0 00000004 0", nullptr, 0);
  EXPECT_EQ(target->flushCount(), flushes + 1);

  EXPECT_EQ(ZinNet_openSession(nullptr, port, 500), 0u);
  EXPECT_EQ(ZinNet_openSession("127.0.0.1", 0, 500), 0u);
  EXPECT_STREQ(ZinNet_lastError(), "ZinNet_openSession: port 0");
  server.reset();  // the server goes away: the call in progress fails, and so does an open
  EXPECT_EQ(ZinNet_openSession("127.0.0.1", port, 500), 0u);
  EXPECT_THAT(ZinNet_lastError(), HasSubstr("cannot connect to 127.0.0.1:"));
  EXPECT_EQ(a.write("async_out_data", "0F0F"), ZINMOX_FAILURE);
  EXPECT_THAT(a.takeMessages(),
              testing::ElementsAre(
                  HasSubstr("ZinNet: cannot connect to 127.0.0.1:" + std::to_string(port))));

  ZinNet::Server second(target, {.port = port, .log = [](const std::string&) {}});
  second.start();  // a server comes back on the same port
  EXPECT_EQ(a.write("async_out_data", "0F0F"), ZINMOX_SUCCESS);
  EXPECT_EQ(a.read()["async_in_data"], "0F0F");
  EXPECT_TRUE(a.takeMessages().empty());
}

// Records every sequence, takes its time with "slow", and notices two calls inside it at once.
class RecordingTransport : public ZinRT::Zin_Transport {
 public:
  void readStatus(const ZIN_CORE_REF&, ZIN_CORE_INFO&, unsigned char*, uint32_t,
                  uint32_t) override {}
  void commandSequence(const std::string& text, unsigned char* data, uint32_t bits) override {
    if (inside_.fetch_add(1) != 0) ++overlaps;
    std::this_thread::sleep_for(std::chrono::microseconds(text == "slow" ? 400000 : 200));
    std::lock_guard<std::mutex> lock(mutex_);
    texts.push_back(text);
    // Answer with the text's last byte in every read byte, so clients can check their answer.
    for (uint32_t i = 0; i < (bits + 7) / 8; ++i) data[i] = static_cast<unsigned char>(text.back());
    --inside_;
    ++done;
  }
  void flush() override {
    if (inside_ != 0) ++overlaps;
  }

  std::vector<std::string> texts;
  std::atomic<int> overlaps{0}, done{0};

 private:
  std::atomic<int> inside_{0};
  std::mutex mutex_;
};

// Limits are checked before sending; a request timeout or the server going away fails the call
// in progress with a clear text and closes the connection; the next call connects again.
TEST(SharedTarget, LimitsTimeoutsAndAServerGoingAway) {
  auto slow = std::make_shared<RecordingTransport>();
  auto server = std::make_unique<TestServer>(
      slow, ZinNet::ServerOptions{.maxFrameBytes = 64, .maxReadBytes = 8});
  const std::string at = "127.0.0.1:" + std::to_string(server->port());
  ZinNet::TcpTransport transport("127.0.0.1", server->port(), {1000, 100});
  std::vector<unsigned char> data(9);
  EXPECT_THROW(transport.commandSequence(std::string(60, 'x'), nullptr, 0), ZinNet::NetError);
  EXPECT_THROW(transport.commandSequence("x", data.data(), 65), ZinNet::NetError);
  transport.commandSequence("x", data.data(), 64);
  std::vector<ZIN_CORE_REF> refs;
  EXPECT_FALSE(transport.listCores(refs));  // the transport behind cannot list
  const auto failure = [&](ZinNet::TcpTransport& t) {
    const std::string error = errorOf([&] { t.commandSequence("slow", nullptr, 0); });
    EXPECT_FALSE(t.isConnected());
    return error;
  };
  EXPECT_EQ(failure(transport),
            "ZinNet: waiting for the answer to a command sequence took "
            "longer than 100 ms; the connection to " +
                at + " was closed");
  // The next call connects again; it runs once the slow one is done (one request at a time).
  ZinNet::TcpTransport patient("127.0.0.1", server->port(), {1000, 5000});
  patient.commandSequence("quick", nullptr, 0);
  transport.commandSequence("quick", nullptr, 0);
  EXPECT_EQ(slow->done, 4);
  EXPECT_EQ(server->server().stats().connectionsAccepted, 3u);
  // A request that waits for the request thread when the server stops is never answered.
  std::promise<void> holding;
  std::thread holder([&] {
    server->server().withTransport([&](ZinRT::Zin_Transport&) {
      holding.set_value();
      std::this_thread::sleep_for(std::chrono::milliseconds(300));
    });
  });
  holding.get_future().wait();
  std::thread stopper([&] {
    std::this_thread::sleep_for(std::chrono::milliseconds(100));
    server->server().stop();
  });
  EXPECT_THAT(failure(patient), HasSubstr(at + " lost while waiting for the answer to a command"));
  stopper.join();
  holder.join();
}

// Requests of concurrent clients are carried out one at a time and whole, in each client's order,
// whether the server runs them on its I/O thread or hands them to its request thread.
TEST(Interleave, ConcurrentClientsSequencesNeverInterleave) {
  auto recorder = std::make_shared<RecordingTransport>();
  TestServer server(recorder);
  constexpr int kClients = 6, kSequences = 40;
  // A multi-line sequence; every third one is over 64 KiB, for the request thread.
  const auto sequence = [](int c, int i) {
    std::string text;
    for (int line = 0; line < (i % 3 == 0 ? 600 : 50); ++line) {
      text += "client " + std::to_string(c) + " sequence " + std::to_string(i) + " line " +
              std::to_string(line) + std::string(100, 'x') + "\n";
    }
    return text + static_cast<char>('A' + c);
  };
  std::atomic<int> wrongAnswers{0};
  std::vector<std::thread> threads;
  for (int c = 0; c < kClients; ++c) {
    threads.emplace_back([&, c] {
      ZinNet::TcpTransport transport("127.0.0.1", server.port(), {2000, 5000});
      for (int i = 0; i < kSequences; ++i) {
        unsigned char answer[3] = {0, 0, 0};
        i % 2 == 0 ? transport.commandSequence(sequence(c, i), answer, 24)
                   : transport.commandSequenceThenFlush(sequence(c, i), answer, 24);
        if (answer[0] != 'A' + c || answer[2] != 'A' + c) ++wrongAnswers;
      }
    });
  }
  for (std::thread& t : threads) t.join();
  EXPECT_EQ(recorder->overlaps, 0);
  EXPECT_EQ(wrongAnswers, 0);
  std::vector<std::vector<std::string>> sent(kClients), got(kClients);
  for (int c = 0; c < kClients; ++c) {
    for (int i = 0; i < kSequences; ++i) sent[c].push_back(sequence(c, i));
  }
  for (const std::string& text : recorder->texts) got.at(text.back() - 'A').push_back(text);
  EXPECT_TRUE(got == sent);  // each text whole, and each client's sequences in the order sent
}

// A server of the oldest version, by hand: it refuses the newer hello as such a server does,
// welcomes the second one, and answers a command sequence and a flush.
TEST(SharedTarget, AClientFallsBackToAVersion1Server) {
  asio::io_context io;
  asio::ip::tcp::acceptor acceptor(io, {asio::ip::make_address("127.0.0.1"), 0});
  std::vector<uint8_t> types;  // of every frame the server received
  std::thread fake([&] {
    const auto next = [&](RawClient& client) {
      const RawFrame got = client.readFrame().value_or(RawFrame{});
      types.push_back(got.type);
      return got.body;
    };
    RawClient first(acceptor);
    next(first);
    first.send(frame(kClosing, text("protocol version 2 is not supported; this server speaks 1")));
    RawClient second(acceptor);
    EXPECT_EQ(next(second), concat({text("ZNET"), {0, 1}}));
    second.send(frame(kWelcome, concat({text("ZNET"), {0, 1}, u32(64), u32(8), text("old")})));
    for (uint8_t reply : {kReadData, uint8_t{0x84}}) {
      next(second);
      second.send(frame(reply));
    }
  });
  ZinNet::TcpTransport transport("127.0.0.1", acceptor.local_endpoint().port());
  EXPECT_THROW(transport.ping(), ZinNet::NetError);  // connects, but version 1 has no ping
  EXPECT_EQ(transport.protocolVersion(), 1u);
  EXPECT_EQ(transport.serverName(), "old");
  transport.commandSequenceThenFlush("x", nullptr, 0);
  fake.join();
  EXPECT_EQ(types, (std::vector<uint8_t>{0x01, 0x01, kSequence, kFlush}));
}

}  // namespace
