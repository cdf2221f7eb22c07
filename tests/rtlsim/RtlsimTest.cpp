// zinmox-rtlsim as a process: OpenOCD attaches over remote bit-bang, reads the IDCODE and scans a
// hub status request through its Tcl server; junk and vanishing clients leave the server working.
#include <gtest/gtest.h>
#include <poll.h>
#include <signal.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <memory>
#include <regex>
#include <sstream>
#include <string>

#include "ZinHub/HubCodec.h"
#include "support/ChildProcess.h"

namespace ZinRtlTest {
using namespace ZinTest;
namespace {

constexpr int kStartMs = 10000;

// Starts zinmox-rtlsim on a free port and returns the port it printed.
int startRtlsim(std::unique_ptr<ChildProcess>& child, std::vector<std::string> args = {}) {
  args.insert(args.begin(), {"--port", "0"});
  child = std::make_unique<ChildProcess>(ZINMOX_RTLSIM_PATH, args);
  if (!child->waitForOutput("\n", kStartMs)) return -1;
  std::smatch match;
  const std::string& out = child->output();
  return std::regex_search(out, match, std::regex("127\\.0\\.0\\.1:([0-9]+)"))
             ? std::stoi(match[1].str())
             : -1;
}

// Sends `data`, then reads until `done` holds for the answer, the peer closes, or 5 s pass.
template <class Done>
std::string talk(int fd, const std::string& data, Done done) {
  std::string answer;
  if (send(fd, data.data(), data.size(), MSG_NOSIGNAL) != static_cast<ssize_t>(data.size())) {
    return answer;
  }
  char buffer[512];
  pollfd readable{fd, POLLIN, 0};
  while (!done(answer) && poll(&readable, 1, 5000) > 0) {
    const ssize_t n = recv(fd, buffer, sizeof buffer, 0);
    if (n <= 0) break;
    answer.append(buffer, static_cast<size_t>(n));
  }
  return answer;
}

std::string exchange(int fd, const std::string& data, size_t replies) {
  return talk(fd, data, [replies](const std::string& a) { return a.size() >= replies; });
}

// One command through OpenOCD's Tcl server: the text, then byte 0x1a; the reply ends with 0x1a.
std::string tcl(int fd, const std::string& command) {
  std::string answer = talk(fd, command + '\x1a',
                            [](const std::string& a) { return !a.empty() && a.back() == '\x1a'; });
  if (!answer.empty()) answer.pop_back();
  return answer;
}

// drscan's hex fields as one bit vector in shift order.
ZinHub::BitVector scanBits(const std::string& fields, const std::vector<unsigned>& widths) {
  ZinHub::BitVector bits;
  std::istringstream in(fields);
  for (unsigned width : widths) {
    std::string hex;
    in >> hex;
    for (unsigned i = 0; i < width; ++i) {
      const size_t digit = i / 4;
      const unsigned value =
          digit < hex.size() ? std::stoul(std::string(1, hex[hex.size() - 1 - digit]), nullptr, 16)
                             : 0;
      bits.push_back(static_cast<uint8_t>((value >> (i % 4)) & 1U));
    }
  }
  return bits;
}

TEST(Rtlsim, OpenOcdReadsIdcodeAndCoreStatus) {
  std::unique_ptr<ChildProcess> rtlsim;
  const int port = startRtlsim(rtlsim);
  ASSERT_GT(port, 0) << rtlsim->output();
  const int tclPort = freeLoopbackPort();
  ChildProcess openocd(
      ZINMOX_OPENOCD_PATH,
      {"-c", "set ZINMOX_RTLSIM_PORT " + std::to_string(port), "-f", ZINMOX_OPENOCD_CFG, "-c",
       "gdb_port disabled", "-c", "telnet_port disabled", "-c",
       "tcl_port " + std::to_string(tclPort), "-c", "bindto 127.0.0.1", "-c", "init"});
  ASSERT_TRUE(openocd.waitForOutput("tap/device found: 0x1a5e0a5b", kStartMs)) << openocd.output();
  const int fd = connectLoopback(tclPort, kStartMs);
  ASSERT_GE(fd, 0) << openocd.output();

  tcl(fd, "irscan zinmox.tap 0x1");
  EXPECT_EQ(tcl(fd, "drscan zinmox.tap 32 0"), "1a5e0a5b");
  tcl(fd, "irscan zinmox.tap 0x8");
  // Core-status request of core 0: op 5, core 0, key 0xA5; 128 record bits, 16 CRC bits.
  const std::string reply = tcl(fd, "drscan zinmox.tap 16 0xA505 128 0 16 0");
  const ZinHub::BitVector tdo = scanBits(reply, {16, 128, 16});
  ASSERT_TRUE(ZinHub::parseCaptureWord(tdo).hub) << reply;
  const ZinHub::StatusRecord record = ZinHub::parseStatusReply(tdo, "core at 0:1:0");  // CRC
  EXPECT_EQ(record.info.manufacturerId, 0xA5U);
  EXPECT_EQ(record.info.coreType, 9U);
  EXPECT_EQ(record.info.coreMajorVersion, 10U);
  EXPECT_EQ(record.info.coreMinorVersion, 2U);

  tcl(fd, "shutdown");
  close(fd);
  EXPECT_EQ(openocd.wait(kStartMs), 0) << openocd.output();
  EXPECT_EQ(rtlsim->wait(kStartMs), 0);  // OpenOCD's quit ends the server
  EXPECT_NE(rtlsim->output().find("stopped (client quit)"), std::string::npos);
}

TEST(Rtlsim, SurvivesJunkAndVanishingClientsAndStopsOnSignal) {
  std::unique_ptr<ChildProcess> rtlsim;
  const int port = startRtlsim(rtlsim, {"--idle-timeout", "1"});
  ASSERT_GT(port, 0) << rtlsim->output();

  int fd = connectLoopback(port, kStartMs);
  ASSERT_GE(fd, 0);
  std::string junk(100000, '\0');
  for (size_t i = 0; i < junk.size(); ++i) junk[i] = static_cast<char>(i * 131 % 251);
  junk.erase(std::remove(junk.begin(), junk.end(), 'Q'), junk.end());
  send(fd, junk.data(), junk.size(), MSG_NOSIGNAL);
  close(fd);  // vanishes with replies unread

  fd = connectLoopback(port, kStartMs);
  ASSERT_GE(fd, 0);
  // Resets released (junk may have asserted them), Test-Logic-Reset, Run-Test/Idle, Select-DR,
  // Capture-DR, Shift-DR, TCK low: TDO shows bit 0 of the IDCODE (1).
  const std::string walk = "r2626262626042604040R";
  EXPECT_EQ(exchange(fd, walk, 1), "1");
  close(fd);

  fd = connectLoopback(port, kStartMs);  // a silent client is dropped after the idle timeout
  ASSERT_GE(fd, 0);
  EXPECT_EQ(exchange(fd, "", 1), "");
  const int next = connectLoopback(port, kStartMs);
  EXPECT_EQ(exchange(next, "R", 1).size(), 1U);
  close(next);
  close(fd);

  rtlsim->signal(SIGTERM);
  EXPECT_EQ(rtlsim->wait(kStartMs), 0) << rtlsim->output();
  EXPECT_NE(rtlsim->output().find("stopped (signal)"), std::string::npos);
}

TEST(Rtlsim, HelpAndBadOptions) {
  ChildProcess help(ZINMOX_RTLSIM_PATH, {"--help"});
  EXPECT_EQ(help.wait(kStartMs), 0);
  EXPECT_NE(help.output().find("--port"), std::string::npos);
  ChildProcess bad(ZINMOX_RTLSIM_PATH, {"--clock-ratio", "3/0"});
  EXPECT_EQ(bad.wait(kStartMs), 2);
}

}  // namespace
}  // namespace ZinRtlTest
