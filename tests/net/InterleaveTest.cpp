// Requests of concurrent clients are carried out one at a time and whole, in each client's order.
#include <gtest/gtest.h>

#include <atomic>
#include <mutex>
#include <thread>

#include "NetTestUtil.h"
#include "ZinNet/TcpTransport.h"

namespace {

// Records every sequence and notices two calls inside it at once.
class RecordingTransport : public ZinRT::Zin_Transport {
 public:
  void readStatus(const ZIN_CORE_REF&, ZIN_CORE_INFO&, unsigned char*, uint32_t,
                  uint32_t) override {
    enter();
    leave();
  }
  void commandSequence(const std::string& text, unsigned char* data, uint32_t bits) override {
    enter();
    std::this_thread::sleep_for(std::chrono::microseconds(200));
    {
      std::lock_guard<std::mutex> lock(mutex_);
      texts.push_back(text);
    }
    // Answer with the text's last byte in every read byte, so clients can check their answer.
    for (uint32_t i = 0; i < (bits + 7) / 8; ++i) data[i] = static_cast<unsigned char>(text.back());
    leave();
  }
  void flush() override {
    enter();
    leave();
  }

  std::vector<std::string> texts;
  std::atomic<int> overlaps{0};

 private:
  void enter() {
    if (inside_.fetch_add(1) != 0) ++overlaps;
  }
  void leave() { --inside_; }
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
        // A multi-line sequence, long enough to be sent in several pieces.
        std::string text;
        for (int line = 0; line < 50; ++line) {
          text += "client " + std::to_string(c) + " sequence " + std::to_string(i) + " line " +
                  std::to_string(line) + std::string(100, 'x') + "\n";
        }
        text += static_cast<char>('A' + c);
        unsigned char answer[3] = {0, 0, 0};
        transport.commandSequence(text, answer, 24);
        if (answer[0] != 'A' + c || answer[2] != 'A' + c) ++wrongAnswers;
        if (i % 10 == 0) transport.flush();
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
    ASSERT_GE(c, 0);
    ASSERT_LT(c, kClients);
    const std::string head =
        "client " + std::to_string(c) + " sequence " + std::to_string(next[c]++) + " line ";
    EXPECT_EQ(text.rfind(head, 0), 0u) << text.substr(0, 40);
    EXPECT_EQ(text.size(), 50 * (head.size() + 100 + 1) + 10 * 1 + 40 * 2 + 1);  // line numbers
  }
  EXPECT_EQ(next, std::vector<int>(kClients, kSequences));
}

}  // namespace
