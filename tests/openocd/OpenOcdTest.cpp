// zinmox-rtlsim with OpenOCD attached on free loopback ports: the exported functions through the
// hub transport give the simulated target's results, and every fault is a clear error.
#include <gtest/gtest.h>
#include <netinet/in.h>
#include <signal.h>
#include <sys/socket.h>
#include <unistd.h>

#include <future>
#include <thread>

#include "ZinHub/BoardFile.h"
#include "ZinHub/OpenOcdTarget.h"
#include "ZinMOX/ZinMOX.h"
#include "ZinOpenOcd/ZinOpenOcd.h"
#include "ZinRT/ZinJtag.h"
#include "ZinSim/Target.h"
#include "support/ChildProcess.h"

namespace ZinRtlTest {
namespace {

using namespace ZinTest;
using ZinRT::ZinMOX_ValueMap;
constexpr int kStartMs = 10000;

// Starts zinmox-rtlsim on a free port; its port, or -1.
int startRtlsim(std::unique_ptr<ChildProcess>& child, const std::string& idleTimeout) {
  child = std::make_unique<ChildProcess>(
      ZINMOX_RTLSIM_PATH, std::vector<std::string>{"--port", "0", "--idle-timeout", idleTimeout});
  const std::string port = child->waitForMatch(std::regex("127\\.0\\.0\\.1:([0-9]+)"), kStartMs);
  return port.empty() ? -1 : std::stoi(port);
}

// The model and OpenOCD attached to it; either can be killed and restarted (same Tcl port).
class OpenOcdRig {
 public:
  OpenOcdRig() : tclPort_(freeLoopbackPort()) { restart(); }
  bool ok() const { return openocd_ != nullptr; }
  uint16_t tclPort() const { return static_cast<uint16_t>(tclPort_); }
  std::string target(const std::string& options = "") const {
    return "openocd://127.0.0.1:" + std::to_string(tclPort_) + options;
  }
  std::string log() const {
    return (rtlsim_ ? rtlsim_->output() : "") + (openocd_ ? openocd_->output() : "");
  }
  void kill(std::unique_ptr<ChildProcess>& child) {
    child->signal(SIGKILL);
    child->wait(kStartMs);
    child.reset();
  }
  bool restart() {
    if (!rtlsim_) {
      if (openocd_) kill(openocd_);  // OpenOCD does not find a new bit-bang server by itself
      rtlsimPort_ = startRtlsim(rtlsim_, "0");
      if (rtlsimPort_ < 0) return false;
    }
    if (openocd_) return true;
    openocd_ = std::make_unique<ChildProcess>(
        ZINMOX_OPENOCD_PATH,
        std::vector<std::string>{"-c", "set ZINMOX_RTLSIM_PORT " + std::to_string(rtlsimPort_),
                                 "-f", ZINMOX_OPENOCD_CFG, "-c",
                                 "bindto 127.0.0.1; tcl_port " + std::to_string(tclPort_) +
                                     "; telnet_port disabled; gdb_port disabled"});
    const int fd = openocd_->waitForOutput("tap/device found", kStartMs)
                       ? connectLoopback(tclPort_, kStartMs)
                       : -1;
    fd < 0 ? openocd_.reset() : void(close(fd));
    return fd >= 0;
  }
  std::unique_ptr<ChildProcess> rtlsim_, openocd_;

 private:
  int tclPort_, rtlsimPort_ = -1;
};

ZinHub::OpenOcdTarget parse(const std::string& text) {
  return *ZinHub::parseOpenOcdTarget(text);
}

template <class F>
std::string errorOf(F&& call) {
  try {
    call();
  } catch (const std::exception& e) {
    return e.what();
  }
  return "(no error)";
}
::testing::AssertionResult contains(const std::string& text, const std::string& part) {
  if (text.find(part) != std::string::npos) return ::testing::AssertionSuccess();
  return ::testing::AssertionFailure() << '"' << text << "\" lacks \"" << part << '"';
}

// The core type a status read reports.
uint32_t coreType(ZinRT::Zin_Transport& transport, ZIN_CORE_REF ref) {
  ZIN_CORE_INFO info{};
  unsigned char status[16] = {};
  transport.readStatus(ref, info, status, 16, 128);
  return info.coreType;
}

// One session and the messages of its last failed call.
struct Host {
  uint32_t handle = 0;
  std::string messages;
  explicit Host(uint32_t h) : handle(h) {
    ZinJtag_setMessageHandler(
        handle,
        [](void* self, uint32_t, uint32_t, const char* text) {
          static_cast<Host*>(self)->messages += std::string(text) + "\n";
        },
        this);
  }
  ~Host() { ZinJtag_closeSession(handle); }

  // The return code and the value map after a call of getCoreInfo, writeValues or readValues.
  std::string call(uint32_t (*function)(uint32_t, ZIN_CORE_REF*, uintptr_t*), ZIN_CORE_REF ref,
                   ZinMOX_ValueMap values = {}) {
    uintptr_t word = reinterpret_cast<uintptr_t>(&values);
    std::string out = "rc " + std::to_string(function(handle, &ref, &word));
    for (const auto& [key, value] : values) out += " " + key + "=" + value;
    return out;
  }
  std::string scan() {
    std::vector<ZIN_CORE_REF> refs;
    ZinJtag_session_withTransport(handle, [&](ZinRT::Zin_Transport& t) { t.listCores(refs); });
    std::string out;
    for (const auto& r : refs)
      out += std::to_string(r.userChainNumber) + ":" + std::to_string(r.coreIndex) + " ";
    return out;
  }
  std::string ports(ZIN_CORE_REF ref, uint8_t async) {
    const uint8_t mask = 0xFF;
    uint8_t in[3] = {}, s[5] = {};
    uint32_t rc = ZinMOX_setPortBits(handle, &ref, &async, &mask, 8, nullptr, nullptr, 0);
    rc |= ZinMOX_getPortBits(handle, &ref, &in[0], &in[1], &in[2], 8, &s[0], &s[1], &s[2], &s[3],
                             &s[4], 4);
    return "rc " + std::to_string(rc) + " " + std::to_string(in[0] | in[1] << 8 | in[2] << 16);
  }
};

// The library's calls on core 0:1:1 (8 async and 4 sync outputs looped back to the inputs),
// each giving a text that must be the same on both targets.
std::vector<std::string> exercise(Host& host) {
  std::vector<std::string> out{host.scan()};
  for (uint32_t core = 0; core < 4; ++core)
    out.push_back(host.call(ZinMOX_getCoreInfo, {0, 1, core}));
  ZIN_CORE_REF ref{0, 1, 1};
  out.push_back(std::to_string(ZinMOX_initCore(host.handle, &ref)));
  const uint32_t bits[] = {0, 1, 2, 3, 4, 5, 6, 7};
  ZinMOX_defineBus(host.handle, &ref, "out", ZINMOX_ASYNC_OUTPUT, bits, 8);
  ZinMOX_defineBus(host.handle, &ref, "in", ZINMOX_ASYNC_INPUT, bits, 8);
  ZinMOX_defineSignal(host.handle, &ref, "s", ZINMOX_SYNC_OUTPUT, 0);
  ZinMOX_defineSignal(host.handle, &ref, "sin", ZINMOX_SYNC_INPUT, 0);
  host.call(ZinMOX_writeValues, ref, {{"out", "00"}, {"s.pulsetrain", "0000"}});
  host.call(ZinMOX_readValues, ref);  // clears what earlier runs left in the latches
  const auto writeRead = [&](const char* name, const char* value) {
    out.push_back(host.call(ZinMOX_writeValues, ref, {{name, value}}));
    out.push_back(host.call(ZinMOX_readValues, ref));
  };
  for (const char* value : {"5A", "0F", "F0"}) writeRead("out", value);
  out.push_back(host.ports(ref, 0xC3));
  out.push_back(host.ports(ref, 0x3C));
  for (const char* train : {"FFFF", "0000"}) writeRead("s.pulsetrain", train);
  return out;
}

class OpenOcdTest : public ::testing::Test {
 protected:
  void SetUp() override { ASSERT_TRUE(rig_.ok()) << rig_.log(); }
  OpenOcdRig rig_;
};

TEST_F(OpenOcdTest, ExportedFunctionsGiveTheSimulatedTargetsResults) {
  Host rtl(ZinOpenOcd_openSession("127.0.0.1", rig_.tclPort(), nullptr, 0));
  ASSERT_NE(rtl.handle, 0U) << ZinOpenOcd_lastError();
  Host sim(ZinJtag_openSession(std::make_shared<ZinSim::Target>()));
  const std::vector<std::string> got = exercise(rtl);
  EXPECT_EQ(got, exercise(sim));
  EXPECT_EQ(got[0], "1:0 1:1 1:2 1:3 ");
  EXPECT_EQ(rtl.messages, sim.messages);
}

TEST_F(OpenOcdTest, BoardsThatDoNotMatchOpenOcdAreRefusedAtConnect) {
  const std::pair<const char*, const char*> cases[] = {
      // board, error (none: it connects)
      {R"({"devices":[{"preset":"rtl-model","ir_length":5,"chains":{"1":"0x8"}}]})",
       "has IR length 5, but OpenOCD at 127.0.0.1"},
      {R"({"devices":[{"preset":"rtl-model","idcode":"0x12345678"}]})",
       "expects IDCODE 0x12345678, but OpenOCD at 127.0.0.1"},
      {R"({"devices":[{"preset":"rtl-model","idcode":"0x0a5e0a5b","idcode_mask":"0x0fffffff"}]})",
       ""},
      {R"({"devices":[{"preset":"rtl-model","tap":"xc7.tap"}]})", "has no TAP named xc7.tap"},
      {R"({"devices":[{"tap":"zinmox.tap","chains":{"1":"0x18"}}]})",
       "devices[0].chains.1: at most 15"},
      {R"({"devices":[{"tap":"zin;exit","chains":{"1":8}}]})", "devices[0].tap: a TAP name"},
      {R"({"devices":[{"preset":"rtl-model","wait":4}]})", "devices[0].wait: unknown key"},
      {R"({"devices":[]})", "devices: expected a list of 1 to 256"},
      {"{", "not valid JSON"},
      {"xilinx-7series", "has no TAP named xc7.tap"},
  };
  for (const auto& [board, error] : cases) {
    const uint32_t handle = ZinOpenOcd_openSession("127.0.0.1", rig_.tclPort(), board, 2000);
    EXPECT_EQ(handle == 0, *error != '\0') << board;
    EXPECT_TRUE(contains(ZinOpenOcd_lastError(), error)) << board;
    if (handle != 0) ZinJtag_closeSession(handle);
  }
}

TEST_F(OpenOcdTest, EmptyChainHasNoCoreAndACorruptedScanFailsItsCheck) {
  auto transport = ZinHub::openOpenOcd(parse(rig_.target()));
  std::vector<ZIN_CORE_REF> refs;
  transport->listCores(refs);
  EXPECT_EQ(refs.size(), 4U);  // chains 2 to 4 select BYPASS: no hub, no cores
  EXPECT_EQ(coreType(*transport, {0, 2, 0}), 0U);
  std::vector<unsigned char> data(16);
  EXPECT_TRUE(contains(
      errorOf([&] { transport->commandSequence("00 2 0 03 1 00000048 0", data.data(), 128); }),
      "no core at 0:2:0"));

  // A TDO bit flipped on the way: the CRC catches it.
  struct Flipping : ZinHub::OpenOcdEngine {
    using OpenOcdEngine::OpenOcdEngine;
    std::vector<ZinHub::BitVector> execute() override {
      auto out = OpenOcdEngine::execute();
      out.back()[40] ^= 1;
      return out;
    }
  };
  ZinHub::HubTransport corrupted(
      std::make_shared<Flipping>("127.0.0.1", rig_.tclPort(), ZinHub::rtlModelBoard()));
  EXPECT_TRUE(contains(errorOf([&] { coreType(corrupted, {0, 1, 0}); }), "integrity failure"));
  EXPECT_TRUE(contains(
      errorOf([&] { corrupted.commandSequence("00 1 1 03 1 00000048 0", data.data(), 128); }),
      "CRC"));
}

TEST_F(OpenOcdTest, DeathMidCallFailsThatCallAndTheNextCallReconnects) {
  auto transport = ZinHub::openOpenOcd(parse(rig_.target("?timeout=5000")));
  constexpr int kLines = 1000;  // capture lines, so that a process can die while a sequence runs
  std::string text = "00 1 1 03 1 00000048 0";
  for (int i = 1; i < kLines; ++i) text += "\n00 1 1 03 1 00000048 0";
  std::vector<unsigned char> data(kLines * 9);
  for (const bool model : {false, true}) {
    // Sequences back to back until one fails: the kill lands in the middle of one.
    auto calls = std::async(std::launch::async, [&] {
      const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(20);
      std::string error = "(no error)";
      while (error == "(no error)" && std::chrono::steady_clock::now() < end)
        error = errorOf([&] { transport->commandSequence(text, data.data(), kLines * 72); });
      return error;
    });
    std::this_thread::sleep_for(std::chrono::milliseconds(300));
    rig_.kill(model ? rig_.rtlsim_ : rig_.openocd_);
    const std::string error = calls.get();
    EXPECT_TRUE(contains(error, "OpenOCD at 127.0.0.1:" + std::to_string(rig_.tclPort())));
    ASSERT_TRUE(rig_.restart()) << rig_.log();
    EXPECT_EQ(coreType(*transport, {0, 1, 1}), 9U)  // the next call reconnects
        << (model ? "after the model died" : "after OpenOCD died");
  }
}

TEST(OpenOcdFaults, NoOpenOcdOrASilentOneIsAClearErrorWithinTheTimeout) {
  const int port = freeLoopbackPort();
  EXPECT_EQ(ZinOpenOcd_openSession("127.0.0.1", static_cast<uint16_t>(port), nullptr, 500), 0U);
  EXPECT_TRUE(contains(ZinOpenOcd_lastError(),
                       "OpenOCD at 127.0.0.1:" + std::to_string(port) + ": cannot connect"));

  // A port that accepts connections and never answers.
  const int fd = socket(AF_INET, SOCK_STREAM, 0);
  sockaddr_in address{AF_INET, 0, {htonl(INADDR_LOOPBACK)}, {}};
  socklen_t length = sizeof address;
  ASSERT_EQ(bind(fd, reinterpret_cast<sockaddr*>(&address), length), 0);
  ASSERT_EQ(listen(fd, 4) | getsockname(fd, reinterpret_cast<sockaddr*>(&address), &length), 0);
  const std::string target =
      "openocd://127.0.0.1:" + std::to_string(ntohs(address.sin_port)) + "?timeout=300";
  EXPECT_TRUE(
      contains(errorOf([&] { ZinHub::openOpenOcd(parse(target)); }), "no answer within 300 ms"));
  close(fd);
}

// The model's bit-bang server: junk and clients that vanish or stay silent leave it working;
// SIGTERM stops it; --help and a bad option.
TEST(OpenOcdFaults, RtlsimSurvivesJunkAndVanishingClients) {
  std::unique_ptr<ChildProcess> rtlsim;
  const int port = startRtlsim(rtlsim, "1");
  ASSERT_GT(port, 0) << rtlsim->output();
  auto exchange = [](int fd, const std::string& data) {
    send(fd, data.data(), data.size(), MSG_NOSIGNAL);
    timeval wait{5, 0};
    setsockopt(fd, SOL_SOCKET, SO_RCVTIMEO, &wait, sizeof wait);
    char reply = 0;
    const std::string answer = recv(fd, &reply, 1, 0) == 1 ? std::string(1, reply) : "";
    close(fd);
    return answer;
  };
  std::string junk;
  for (size_t i = 0; i < 100000; ++i) junk += static_cast<char>(i * 131 % 251);
  std::erase(junk, 'Q');
  int fd = connectLoopback(port, kStartMs);
  send(fd, junk.data(), junk.size(), MSG_NOSIGNAL);
  close(fd);  // vanishes with replies unread
  // Resets released, Test-Logic-Reset, Run-Test/Idle, Select-DR, Capture-DR, Shift-DR, TCK
  // low: TDO shows bit 0 of the IDCODE (1).
  EXPECT_EQ(exchange(connectLoopback(port, kStartMs), "r2626262626042604040R"), "1");
  fd = connectLoopback(port, kStartMs);  // a silent client is dropped after the idle timeout
  EXPECT_EQ(exchange(connectLoopback(port, kStartMs), "R").size(), 1U);
  close(fd);
  rtlsim->signal(SIGTERM);
  EXPECT_EQ(rtlsim->wait(kStartMs), 0) << rtlsim->output();
  EXPECT_TRUE(contains(rtlsim->output(), "stopped (signal)"));
  EXPECT_EQ(ChildProcess(ZINMOX_RTLSIM_PATH, {"--help"}).wait(kStartMs), 0);
  EXPECT_EQ(ChildProcess(ZINMOX_RTLSIM_PATH, {"--clock-ratio", "3/0"}).wait(kStartMs), 2);
}

TEST(OpenOcdFaults, MalformedTargetTexts) {
  for (const char* text : {"openocd://", "openocd://host", "openocd://h:0", "openocd://h:70000",
                           "openocd://h:1?timeout=0", "openocd://h:1?speed=3", "openocd://a;b:1"}) {
    EXPECT_TRUE(
        contains(errorOf([&] { ZinHub::parseOpenOcdTarget(text); }), "malformed OpenOCD target"));
  }
  const ZinHub::OpenOcdTarget t = parse("openocd://[::1]:6666?board=ecp5&timeout=250");
  EXPECT_EQ(t.host, "::1");
  EXPECT_EQ(t.port, 6666);
  EXPECT_EQ(t.board, "ecp5");
  EXPECT_EQ(t.timeoutMs, 250U);
  EXPECT_FALSE(ZinHub::parseOpenOcdTarget("tcp://h:1"));
  EXPECT_EQ(ZinHub::loadBoard("ecp5").devices.at(0).chainInstructions.at(2), 0x38U);
}

}  // namespace
}  // namespace ZinRtlTest
