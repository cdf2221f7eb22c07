// The dashboard in this process, on a simulated target served over TCP so that the test can see
// every transfer in the target's command log.
#include <gtest/gtest.h>
#include <httplib.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <memory>
#include <thread>

#include "Session.h"
#include "ZinNet/Server.h"
#include "ZinSim/Target.h"
#include "dashboard/Api.h"
#include "dashboard/HostLink.h"
#include "dashboard/Server.h"

namespace {

using namespace std::chrono_literals;
namespace dash = zinmox::dashboard;

// Input reads in the log: sequences with a code-03 line ("DD C K 03 1 LLLLLLLL DATA").
size_t readsIn(const std::vector<std::string>& log) {
  return static_cast<size_t>(std::count_if(log.begin(), log.end(), [](const std::string& text) {
    return text.find(" 03 1 ") != std::string::npos;
  }));
}

// A page following the event stream on its own connection until it is told to stop.
class Follower {
 public:
  explicit Follower(uint16_t port)
      : thread_([this, port] {
          httplib::Client client("127.0.0.1", port);
          client.set_read_timeout(5, 0);
          client.Get("/api/events", [this](const char* data, size_t size) {
            if (std::string(data, size).rfind("data:", 0) == 0) ++events_;
            return !stop_;
          });
        }) {}
  ~Follower() {
    stop_ = true;
    thread_.join();
  }
  int events() const { return events_; }

 private:
  std::atomic<int> events_{0};
  std::atomic<bool> stop_{false};
  std::thread thread_;
};

class DashboardServerTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ZinNet::ServerOptions options;
    options.log = [](const std::string&) {};
    net_ = std::make_unique<ZinNet::Server>(target_, options);
    net_->start();
    session_ = std::make_unique<zinmox::Session>("tcp://" + net_->address());
    host_ = std::make_unique<dash::HostLink>(*session_);
    server_ = std::make_unique<dash::Server>(*host_, "127.0.0.1", 0);
    server_->start();
  }

  static bool waitFor(const std::function<bool()>& condition) {
    for (auto end = std::chrono::steady_clock::now() + 10s; std::chrono::steady_clock::now() < end;
         std::this_thread::sleep_for(10ms)) {
      if (condition()) return true;
    }
    return condition();
  }

  // Destroyed in reverse: the dashboard first, the target server last.
  std::shared_ptr<ZinSim::Target> target_ = std::make_shared<ZinSim::Target>();
  std::unique_ptr<ZinNet::Server> net_;
  std::unique_ptr<zinmox::Session> session_;
  std::unique_ptr<dash::HostLink> host_;
  std::unique_ptr<dash::Server> server_;
};

TEST_F(DashboardServerTest, EveryOpenPageSharesOneReadPerInterval) {
  server_->hub().configure("0:1:0", 20.0, false);
  std::vector<std::unique_ptr<Follower>> pages;
  for (size_t i = 0; i < dash::kMaxLiveViews; ++i) {
    pages.push_back(std::make_unique<Follower>(server_->port()));
  }
  ASSERT_TRUE(waitFor([&] {
    return std::all_of(pages.begin(), pages.end(), [](auto& p) { return p->events() > 0; });
  }));
  // One page more than the limit is turned away; the others go on.
  httplib::Client extra("127.0.0.1", server_->port());
  const auto refused = extra.Get("/api/events");
  ASSERT_TRUE(refused);
  EXPECT_EQ(refused->status, 503);

  target_->clearCommandLog();
  const auto start = std::chrono::steady_clock::now();
  std::vector<int> before;
  for (auto& page : pages) before.push_back(page->events());
  // The reads go on and reach every page (waited for, not timed, so a loaded machine or a
  // sanitizer only makes it slower), and however long that takes there is never more than one
  // read per 50 ms.
  ASSERT_TRUE(waitFor([&] {
    for (size_t i = 0; i < pages.size(); ++i) {
      if (pages[i]->events() - before[i] < 8) return false;
    }
    return readsIn(target_->commandLog()) >= 10;
  }));
  const size_t reads = readsIn(target_->commandLog());
  const double seconds =
      std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
  EXPECT_LE(reads, static_cast<size_t>(seconds * 20) + 1);
}

}  // namespace
