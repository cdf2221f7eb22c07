// Sessions of several clients on one served target, through the exported ZinMOX functions; the
// life of a client connection (connect errors, timeouts, loss, reconnection, an older server);
// and concurrent clients' requests, which never interleave.
#include <gtest/gtest.h>

#include <atomic>
#include <future>
#include <mutex>
#include <thread>

#include "NetTestUtil.h"
#include "ZinMOX/ZinMOX.h"
#include "ZinNet/TcpTransport.h"
#include "ZinNet/ZinNet.h"
#include "ZinRT/ZinJtag.h"

namespace {

using ZinNetTest::TestServer;
using ZinRT::ZinMOX_ValueMap;

ZIN_CORE_REF kFull{0, 1, 0};  // the demo design's full-layout core, inputs looped back

/// A session on a server, recording its messages.
class Client {
 public:
  Client(uint16_t port, uint32_t timeoutMs = 2000) {
    handle = ZinNet_openSession("127.0.0.1", port, timeoutMs);
    EXPECT_NE(handle, 0u) << ZinNet_lastError();
    if (handle != 0) ZinJtag_setMessageHandler(handle, &Client::onMessage, this);
  }
  ~Client() {
    if (handle != 0) ZinJtag_closeSession(handle);
  }
  static void onMessage(void* user, uint32_t, uint32_t, const char* text) {
    auto* self = static_cast<Client*>(user);
    std::lock_guard<std::mutex> lock(self->mutex);
    self->messages.push_back(text);
  }
  std::vector<std::string> takeMessages() {
    std::lock_guard<std::mutex> lock(mutex);
    return std::exchange(messages, {});
  }
  uint32_t write(const std::string& key, const std::string& value) {
    ZinMOX_ValueMap values{{key, value}};
    uintptr_t word = reinterpret_cast<uintptr_t>(&values);
    return ZinMOX_writeValues(handle, &kFull, &word);
  }
  ZinMOX_ValueMap readAll() {
    ZinMOX_ValueMap values;
    uintptr_t word = reinterpret_cast<uintptr_t>(&values);
    if (ZinMOX_readValues(handle, &kFull, &word) != ZINMOX_SUCCESS) return {};
    return values;
  }
  std::string read(const std::string& key) { return readAll()[key]; }

  uint32_t handle = 0;
  std::mutex mutex;
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
  ASSERT_EQ(ZinMOX_initCore(a.handle, &kFull), ZINMOX_SUCCESS);
  ASSERT_EQ(ZinMOX_initCore(b.handle, &kFull), ZINMOX_SUCCESS);

  ASSERT_EQ(a.write("async_out_data", "A5C3"), ZINMOX_SUCCESS);
  EXPECT_EQ(target->asyncOutputLevels(kFull), "1100001110100101");
  EXPECT_EQ(b.read("async_in_data"), "A5C3");
  ASSERT_EQ(b.write("async_out_data", "1234"), ZINMOX_SUCCESS);
  ZinMOX_ValueMap in = a.readAll();
  EXPECT_EQ(in["async_in_data"], "1234");
  // The activity latches belong to the target too: b's read cleared them, b's write set them.
  EXPECT_EQ(in["async_in_data.activity_up"], "1234");
  EXPECT_EQ(in["async_in_data.activity_down"], "A5C3");
  EXPECT_TRUE(a.takeMessages().empty());
  EXPECT_TRUE(b.takeMessages().empty());

  // The status read, the core list and the flushes went over the wire too.
  EXPECT_EQ(target->flushCount(), 2u);
  EXPECT_GE(server->server().stats().requestsServed, 6u);  // each write is one request
  EXPECT_EQ(server->server().stats().connectionsOpen, 2u);

  // A target failure of a write arrives with the target's own text and keeps the connection.
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
  try {
    transport->commandSequenceThenFlush("00 1 0 02 0 00000004 0", nullptr, 0);
    ADD_FAILURE() << "no failure";
  } catch (const ZinNet::TargetError& e) {
    EXPECT_STREQ(e.what(), "ZinSim test: folded");
  }
  EXPECT_EQ(target->flushCount(), flushes);
  transport->commandSequenceThenFlush("00 1 0 02 0 00000004 0", nullptr, 0);
  EXPECT_EQ(target->flushCount(), flushes + 1);

  EXPECT_EQ(ZinNet_openSession(nullptr, port, 500), 0u);
  EXPECT_EQ(ZinNet_openSession("127.0.0.1", 0, 500), 0u);
  EXPECT_STREQ(ZinNet_lastError(), "ZinNet_openSession: port 0");

  server.reset();  // the server goes away: the call in progress fails, and so does an open
  EXPECT_EQ(ZinNet_openSession("127.0.0.1", port, 500), 0u);
  EXPECT_NE(std::string(ZinNet_lastError()).find("cannot connect to 127.0.0.1:"), std::string::npos)
      << ZinNet_lastError();
  EXPECT_EQ(a.write("async_out_data", "0F0F"), ZINMOX_FAILURE);
  const std::vector<std::string> messages = a.takeMessages();
  ASSERT_EQ(messages.size(), 1u);
  EXPECT_NE(messages[0].find("ZinNet: cannot connect to 127.0.0.1:" + std::to_string(port)),
            std::string::npos)
      << messages[0];

  ZinNet::ServerOptions options;
  options.port = port;  // a server comes back on the same port
  options.log = [](const std::string&) {};
  ZinNet::Server second(target, options);
  second.start();
  EXPECT_EQ(a.write("async_out_data", "0F0F"), ZINMOX_SUCCESS);
  EXPECT_EQ(a.read("async_in_data"), "0F0F");
  EXPECT_TRUE(a.takeMessages().empty());
}

// A transport that takes its time with command sequences.
class SlowTransport : public ZinRT::Zin_Transport {
 public:
  void readStatus(const ZIN_CORE_REF&, ZIN_CORE_INFO&, unsigned char*, uint32_t,
                  uint32_t) override {}
  void commandSequence(const std::string& text, unsigned char*, uint32_t) override {
    if (text == "slow") std::this_thread::sleep_for(std::chrono::milliseconds(400));
    ++done;
  }
  void flush() override {}
  std::atomic<int> done{0};
};

// Limits are checked before sending; a request timeout or the server going away fails the call
// in progress with a clear text and closes the connection; the next call connects again.
TEST(SharedTarget, LimitsTimeoutsAndAServerGoingAway) {
  ZinNet::ServerOptions options;
  options.maxFrameBytes = 64;
  options.maxReadBytes = 8;
  auto slow = std::make_shared<SlowTransport>();
  auto server = std::make_unique<TestServer>(slow, options);
  const std::string at = "127.0.0.1:" + std::to_string(server->port());
  ZinNet::TcpTransport transport("127.0.0.1", server->port(), {1000, 100});
  std::vector<unsigned char> data(9);
  EXPECT_THROW(transport.commandSequence(std::string(60, 'x'), nullptr, 0), ZinNet::NetError);
  EXPECT_THROW(transport.commandSequence("x", data.data(), 65), ZinNet::NetError);
  transport.commandSequence("x", data.data(), 64);
  std::vector<ZIN_CORE_REF> refs;
  EXPECT_FALSE(transport.listCores(refs));  // the transport behind cannot list
  const auto failure = [&](ZinNet::TcpTransport& t) -> std::string {
    try {
      t.commandSequence("slow", nullptr, 0);
    } catch (const ZinNet::NetError& e) {
      EXPECT_FALSE(t.isConnected());
      return e.what();
    }
    return "no failure";
  };
  EXPECT_EQ(failure(transport),
            "ZinNet: waiting for the answer to a command sequence took "
            "longer than 100 ms; the connection to " +
                at + " was closed");
  // The next call connects again; it runs once the slow one is done (one request at a time).
  ZinNet::TcpTransport patient("127.0.0.1", server->port(), {1000, 5000});
  patient.commandSequence("quick", nullptr, 0);
  transport.commandSequence("quick", nullptr, 0);
  EXPECT_TRUE(transport.isConnected());
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
  const std::string lost = failure(patient);
  EXPECT_NE(lost.find(at + " lost while waiting for the answer to a command sequence"),
            std::string::npos)
      << lost;
  stopper.join();
  holder.join();
}

// Requests of concurrent clients are carried out one at a time and whole, in each client's order,
// whether the server runs them on its I/O thread or hands them to its request thread.
// Records every sequence and notices two calls inside it at once.
class RecordingTransport : public ZinRT::Zin_Transport {
 public:
  void readStatus(const ZIN_CORE_REF&, ZIN_CORE_INFO&, unsigned char*, uint32_t,
                  uint32_t) override {}
  void commandSequence(const std::string& text, unsigned char* data, uint32_t bits) override {
    if (inside_.fetch_add(1) != 0) ++overlaps;
    std::this_thread::sleep_for(std::chrono::microseconds(200));
    {
      std::lock_guard<std::mutex> lock(mutex_);
      texts.push_back(text);
    }
    // Answer with the text's last byte in every read byte, so clients can check their answer.
    for (uint32_t i = 0; i < (bits + 7) / 8; ++i) data[i] = static_cast<unsigned char>(text.back());
    --inside_;
  }
  void flush() override {
    if (inside_ != 0) ++overlaps;
  }

  std::vector<std::string> texts;
  std::atomic<int> overlaps{0};

 private:
  std::atomic<int> inside_{0};
  std::mutex mutex_;
};

TEST(Interleave, ConcurrentClientsSequencesNeverInterleave) {
  auto recorder = std::make_shared<RecordingTransport>();
  ZinNetTest::TestServer server(recorder);
  constexpr int kClients = 6;
  constexpr int kSequences = 40;
  std::atomic<int> wrongAnswers{0};
  std::vector<std::thread> threads;
  for (int c = 0; c < kClients; ++c) {
    threads.emplace_back([&, c] {
      ZinNet::TcpTransport transport("127.0.0.1", server.port(), {2000, 5000});
      for (int i = 0; i < kSequences; ++i) {
        // A multi-line sequence; every third one is over 64 KiB, for the request thread.
        std::string text;
        const int lines = i % 3 == 0 ? 600 : 50;
        for (int line = 0; line < lines; ++line) {
          text += "client " + std::to_string(c) + " sequence " + std::to_string(i) + " line " +
                  std::to_string(line) + std::string(100, 'x') + "\n";
        }
        text += static_cast<char>('A' + c);
        unsigned char answer[3] = {0, 0, 0};
        if (i % 2 == 0) {
          transport.commandSequence(text, answer, 24);
        } else {
          transport.commandSequenceThenFlush(text, answer, 24);
        }
        if (answer[0] != 'A' + c || answer[2] != 'A' + c) ++wrongAnswers;
      }
    });
  }
  for (std::thread& t : threads) t.join();

  EXPECT_EQ(recorder->overlaps, 0);
  EXPECT_EQ(wrongAnswers, 0);
  ASSERT_EQ(recorder->texts.size(), size_t{kClients * kSequences});
  // Each text arrived whole, and each client's sequences in the order sent.
  std::vector<int> next(kClients, 0);
  for (const std::string& text : recorder->texts) {
    const int c = text.back() - 'A';
    ASSERT_TRUE(c >= 0 && c < kClients);
    const int i = next[c]++;
    const std::string head = "client " + std::to_string(c) + " sequence " + std::to_string(i);
    EXPECT_EQ(text.rfind(head + " line 0", 0), 0u) << text.substr(0, 40);
    const std::string last = (i % 3 == 0 ? " line 599" : " line 49") + std::string(100, 'x');
    EXPECT_EQ(text.substr(text.size() - last.size() - 2, last.size()), last);
  }
  EXPECT_EQ(next, std::vector<int>(kClients, kSequences));
}

}  // namespace

// A server of the oldest version, by hand: it refuses the newer hello as such a server does,
// welcomes the second one, and answers a command sequence and a flush.
TEST(SharedTarget, AClientFallsBackToAVersion1Server) {
  using namespace ZinNetTest;
  asio::io_context io;
  asio::ip::tcp::acceptor acceptor(io, {asio::ip::make_address("127.0.0.1"), 0});
  std::vector<uint8_t> types;  // of every frame the server received
  std::thread fake([&] {
    auto next = [&](asio::ip::tcp::socket& socket) {
      unsigned char prefix[4];
      asio::read(socket, asio::buffer(prefix));
      Bytes body((prefix[2] << 8) | prefix[3]);
      asio::read(socket, asio::buffer(body));
      types.push_back(body[0]);
      return body;
    };
    asio::ip::tcp::socket first = acceptor.accept();
    next(first);
    asio::write(
        first, asio::buffer(frame(kClosing, text("protocol version 2 is not supported; this server "
                                                 "speaks 1"))));
    asio::ip::tcp::socket second = acceptor.accept();
    const Bytes hello = next(second);
    asio::write(second, asio::buffer(frame(
                            0x81, concat({text("ZNET"), {0, 1}, u32(64), u32(8), text("old")}))));
    for (uint8_t reply : {kReadData, uint8_t{0x84}}) {
      next(second);
      asio::write(second, asio::buffer(frame(reply)));
    }
    EXPECT_EQ(hello, concat({{0x01}, text("ZNET"), {0, 1}}));
  });
  ZinNet::TcpTransport transport("127.0.0.1", acceptor.local_endpoint().port());
  EXPECT_THROW(transport.ping(), ZinNet::NetError);  // connects, but version 1 has no ping
  EXPECT_EQ(transport.protocolVersion(), 1u);
  EXPECT_EQ(transport.serverName(), "old");
  transport.commandSequenceThenFlush("x", nullptr, 0);
  fake.join();
  EXPECT_EQ(types, (std::vector<uint8_t>{0x01, 0x01, kSequence, 0x04}));
}
