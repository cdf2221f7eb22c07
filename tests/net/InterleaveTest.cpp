// Requests of concurrent clients are carried out one at a time and whole, in each client's order,
// whether the server runs them on its I/O thread or hands them to its request thread.
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
