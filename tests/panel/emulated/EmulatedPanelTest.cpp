// SPDX-License-Identifier: Apache-2.0
// The library and the reference host in an emulated panel, with a simulated device at the other end
// of the panel's UART. LOKA_PANEL_IMAGE names the folder with kernel and file system; the disk is
// there as well, or where LOKA_PANEL_DISK says.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "tests/panel/HostChecks.h"
#include "tests/panel/HostSession.h"
#include "tests/panel/emulated/EmulatedPanel.h"

namespace {

constexpr const char* kPort = "/dev/ttyS0";
constexpr const char* kFramed = "--rx-prefix 02 --rx-suffix 03";
constexpr const char* kOutput = "/tmp/run.out";

std::string ImageFolder() {
  const char* folder = std::getenv("LOKA_PANEL_IMAGE");
  return folder != nullptr ? folder : "";
}
std::string Disk() {
  const char* disk = std::getenv("LOKA_PANEL_DISK");
  return disk != nullptr ? disk : ImageFolder() + "/disk";
}

// How the minimal host is started with the library of an ABI.
struct Abi {
  const char* name;
  const char* host;
};
constexpr Abi kArmhf = {"armhf", "minimal_host /opt/libLOKA.so"};
constexpr Abi kArmel = {
    "armel", "env LD_LIBRARY_PATH=/armel/lib /armel/opt/minimal_host /armel/opt/libLOKA.so"};

std::string Quoted(const std::string& text) { return "'" + text + "'"; }

// The minimal host in the panel, its port the UART.
class PanelSession final : public HostSession {
 public:
  PanelSession(EmulatedPanel& panel, const Abi& abi) : panel_(panel), abi_(abi) {
    panel_.Run("rm -f /tmp/to-host /tmp/from-host; mkfifo /tmp/to-host /tmp/from-host");
  }

  std::string Start(const std::string& configuration) override {
    return panel_
        .Run(std::string(abi_.host) + " " + kPort + " 0 " + Quoted(configuration) +
             " </tmp/to-host >/tmp/from-host 2>&1 & pid=$!; "
             "exec 3>/tmp/to-host 4</tmp/from-host; IFS= read -r r <&4; echo \"$r\"")
        .output;
  }
  int End() override {
    return panel_.Run("exec 3>&-; wait $pid; s=$?; exec 4<&-; (exit $s)").status;
  }
  std::string Ask(const std::string& command) override {
    return panel_
        .Run("printf '%s\\n' " + Quoted(command) +
             " >&3; r=; until [ \"$r\" = true ] || [ \"$r\" = false ]; do "
             "IFS= read -r r <&4 || break; printf '%s\\n' \"$r\"; done")
        .output;
  }
  void SendOnLine(const std::string& bytes) override { panel_.SendOnLine(bytes); }
  std::string TakeFromLine(std::size_t count) override { return panel_.TakeFromLine(count); }
  std::string LineSettings() override {
    return panel_.Run("line_settings " + std::string(kPort)).output;
  }

 private:
  EmulatedPanel& panel_;
  const Abi abi_;
};

// One panel for all cases; each starts and ends its own host in it.
class EmulatedPanelTest : public ::testing::Test {
 protected:
  static void SetUpTestSuite() { SwitchOn(); }
  static void TearDownTestSuite() { panel_.reset(); }
  static void SwitchOn() {
    panel_.reset();
    panel_ = std::make_unique<EmulatedPanel>(ImageFolder(), Disk());
    Done("export LOKA_RUNTIME_DIR=/run/loka; mkdir -m 700 /run/loka");
  }
  void TearDown() override { StopHost(); }

  // A command that must succeed; its output.
  static std::string Done(const std::string& command) {
    const EmulatedPanel::Reply reply = panel_->Run(command);
    EXPECT_EQ(reply.status, 0) << command << "\n" << reply.output;
    return reply.output;
  }
  static bool Holds(const std::string& command) { return panel_->Run(command).status == 0; }

  // Starts `loka run` with these options and waits until others can attach.
  void StartHost(const std::string& options) {
    StopHost();
    Done("loka run " + std::string(kPort) + " --ack never " + options + " >" + kOutput +
         " 2>&1 & pid=$!");
    const EmulatedPanel::Reply started = panel_->Run(
        "until [ -S /run/loka/com1.sock ]; do kill -0 $pid || break; usleep 20000; done; "
        "[ -S /run/loka/com1.sock ]");
    if (started.status != 0) throw std::runtime_error(Done("cat " + std::string(kOutput)));
    isRunning_ = true;
  }
  void StopHost() {
    if (!isRunning_) return;
    isRunning_ = false;
    Done("kill -TERM $pid; wait $pid; rm -f /run/loka/com1.sock");
  }

  static std::string Read(const std::string& tag) { return Done("loka read -q " + Quoted(tag)); }
  static std::string Available() { return Read("0?tokens_available?unsignedInt"); }
  static std::string Token() { return Read("0?rx_token?string-100"); }
  static void Write(const std::string& tag, const std::string& value) {
    Done("loka write -q " + Quoted(tag) + " " + Quoted(value));
  }
  static void Acknowledge() { Write("0?token_ack?boolean", "1"); }
  static bool WaitForTokens(int count) {
    return Holds("n=0; until [ \"$(loka read -q '0?tokens_available?unsignedInt')\" = " +
                 std::to_string(count) + " ] || [ $n = 40 ]; do n=$((n+1)); done; [ $n != 40 ]");
  }
  static std::string KernelSettings() { return Done("line_settings " + std::string(kPort)); }

  // Starts a program that prints tokens into /tmp/out, and waits for the line that says it runs.
  static void StartPrinting(const std::string& command, const std::string& errors,
                            const std::string& file, const std::string& said) {
    Done(command + " >/tmp/out 2>" + errors + " & pid=$!");
    Done("until grep -q '" + said + "' " + file +
         "; do kill -0 $pid || { cat /tmp/out; break; }; usleep 50000; done; grep -q '" + said +
         "' " + file);
  }
  // The minimal host, which ends after this many tokens. Its first line is "started".
  static void StartMinimalHost(int tokens, const std::string& settings, const Abi& abi = kArmhf) {
    StartPrinting(std::string(abi.host) + " " + kPort + " " + std::to_string(tokens) +
                      " 'CfgVer=1 model=1 port=com1 mode=RS-232 " + settings + "'",
                  "&1", "/tmp/out", "started");
  }
  // The reference host, likewise; what it says to people goes to /tmp/said.
  static void StartSub(int tokens, const std::string& options) {
    StartPrinting("loka sub " + std::string(kPort) + " --no-store -b 115200 -p none -C " +
                      std::to_string(tokens) + " " + options,
                  "/tmp/said", "/tmp/said", "rx none");
  }
  static void WaitForOutput(std::size_t bytes) {
    Done("until [ $(wc -c </tmp/out) -ge " + std::to_string(bytes) +
         " ]; do kill -0 $pid || break; usleep 100000; done");
  }

  static std::string Stream(int tokens, std::size_t printedBefore);

  static std::unique_ptr<EmulatedPanel> panel_;
  bool isRunning_ = false;
};

std::unique_ptr<EmulatedPanel> EmulatedPanelTest::panel_;

TEST_F(EmulatedPanelTest, ItIsOne) {
  const std::string uart = Done("grep -m 1 tx: /proc/tty/driver/serial");
  EXPECT_NE(uart.find("16550A"), std::string::npos) << uart;
  EXPECT_EQ(Done("uname -m"), "armv7l");
  std::printf("user space after            %lld ms (%s)\n", panel_->StartMs(),
              Done("uname -r").c_str());
}

// The demonstration's eleven steps, the device at the end of a real line.
TEST_F(EmulatedPanelTest, DemonstrationOfReceiving) {
  StartHost(std::string("--no-store ") + kFramed);
  panel_->SendOnLine(
      "\x02"
      "AB\x03");
  EXPECT_TRUE(WaitForTokens(1));
  EXPECT_EQ(Read("0?rx_token_len?unsignedInt"), "2");
  EXPECT_EQ(Token(), "AB");
  Acknowledge();
  EXPECT_EQ(Available(), "0");
  // Silence drops a beginning.
  panel_->SendOnLine(
      "\x02"
      "A");
  Done("sleep 2");
  panel_->SendOnLine(
      "B\x03\x02"
      "C\x03");
  EXPECT_TRUE(WaitForTokens(1));
  EXPECT_EQ(Token(), "C");

  StartHost("--no-store --rx-prefix 02");
  panel_->SendOnLine(
      "\x02"
      "AB\x02"
      "CD");
  EXPECT_TRUE(WaitForTokens(2));
  EXPECT_EQ(Token(), "AB");
  Acknowledge();
  EXPECT_EQ(Token(), "CD");

  StartHost("--no-store --rx-suffix 0D0A");
  panel_->SendOnLine("12.5 kg\r\n");
  EXPECT_TRUE(WaitForTokens(1));
  EXPECT_EQ(Token(), "12.5 kg");

  StartHost("--no-store --gap 300");
  panel_->SendOnLine("HELLO");
  EXPECT_TRUE(WaitForTokens(1));
  panel_->SendOnLine("WORLD");
  EXPECT_TRUE(WaitForTokens(2));
  EXPECT_EQ(Token(), "HELLO");
  Acknowledge();
  EXPECT_EQ(Token(), "WORLD");
}

TEST_F(EmulatedPanelTest, DemonstrationOfHexTokensQueueAndSending) {
  StartHost(std::string("--no-store --hex --queue 3 ") + kFramed);
  panel_->SendOnLine(std::string("\x02\x00\x1B\xFF\x03", 5));
  EXPECT_TRUE(WaitForTokens(1));
  EXPECT_EQ(Token(), "001BFF");
  panel_->SendOnLine(
      "\x02"
      "A\x03\x02"
      "B\x03\x02"
      "C\x03\x02"
      "D\x03");
  Done("sleep 1");
  EXPECT_EQ(Available(), "3");
  for (const char* token : {"42", "43", "44"}) {
    EXPECT_EQ(Token(), token);
    Acknowledge();
  }
  EXPECT_EQ(Available(), "0");

  StartHost("--no-store --tx-prefix 02 --tx-suffix 0D0A");
  Write("0?tx_token?string-10", "CD");
  EXPECT_EQ(panel_->TakeFromLine(5),
            "\x02"
            "CD\r\n");
}

TEST_F(EmulatedPanelTest, DemonstrationOfOverrides) {
  const std::string options = std::string("--store /tmp/demo.db ") + kFramed;
  StartHost(options);
  Write("0?SP_RxSuffix?string-20", "3B");
  EXPECT_EQ(Read("0?SP_RxSuffix?string-20"), "3B");
  panel_->SendOnLine(
      "\x02"
      "A;B\x03");
  EXPECT_TRUE(WaitForTokens(1));
  EXPECT_EQ(Token(), "A;B");
  Write("0?SP_Done?boolean", "1");
  EXPECT_EQ(Available(), "0");
  Done("sleep 1");  // a receive pass that began before keeps its framing
  panel_->SendOnLine(
      "\x02"
      "C\x03;");
  EXPECT_TRUE(WaitForTokens(1));
  EXPECT_EQ(Done("loka read -q -x '0?rx_token?string-100'"), "43 03");
  StartHost(options);
  EXPECT_EQ(Read("0?SP_RxSuffix?string-20"), "3B");
  panel_->SendOnLine(
      "\x02"
      "D\x03;");
  EXPECT_TRUE(WaitForTokens(1));
  EXPECT_EQ(Done("loka read -q -x '0?rx_token?string-100'"), "44 03");
}

struct LineCase {
  int rate;
  const char* parity;
  int bits;
  int stop;
  const char* kernel;
};

// Every rate, data bits, stop bits and parity of the configuration, as the kernel has them, and a
// token over the line with each.
TEST_F(EmulatedPanelTest, ConfiguredLineSettings) {
  const std::vector<LineCase> cases = {
      {150, "none", 8, 1, "150 8N1"},       {300, "even", 8, 1, "300 8E1"},
      {600, "odd", 8, 1, "600 8O1"},        {1200, "mark", 8, 1, "1200 8M1"},
      {2400, "none", 7, 2, "2400 7N2"},     {4800, "even", 7, 1, "4800 7E1"},
      {9600, "odd", 7, 2, "9600 7O2"},      {19200, "mark", 7, 2, "19200 7M2"},
      {38400, "even", 8, 2, "38400 8E2"},   {57600, "odd", 8, 2, "57600 8O2"},
      {115200, "none", 8, 2, "115200 8N2"},
  };
  for (const LineCase& line : cases) {
    std::ostringstream options;
    options << "--no-store --rx-suffix 03 --tx-suffix 03 -b " << line.rate << " -p " << line.parity
            << " -d " << line.bits << " -s " << line.stop;
    StartHost(options.str());
    EXPECT_EQ(KernelSettings(), line.kernel);
    panel_->SendOnLine(std::string(line.kernel) + "\x03");
    EXPECT_TRUE(WaitForTokens(1)) << line.kernel;
    EXPECT_EQ(Token(), line.kernel);
    Write("0?tx_token?string-20", line.kernel);
    const std::string sent = std::string(line.kernel) + "\x03";
    EXPECT_EQ(panel_->TakeFromLine(sent.size()), sent);
  }
}

// The same at run time, with the parity that only run time has.
TEST_F(EmulatedPanelTest, LineSettingsAtRunTime) {
  StartHost("--no-store --rx-suffix 03 -p none");
  const std::vector<LineCase> cases = {
      {150, "4", 7, 2, "150 7S2"},       {300, "3", 8, 1, "300 8M1"},
      {600, "2", 7, 1, "600 7O1"},       {1200, "1", 8, 2, "1200 8E2"},
      {2400, "0", 8, 1, "2400 8N1"},     {4800, "4", 8, 1, "4800 8S1"},
      {9600, "3", 7, 1, "9600 7M1"},     {19200, "2", 8, 1, "19200 8O1"},
      {38400, "1", 7, 2, "38400 7E2"},   {57600, "0", 7, 2, "57600 7N2"},
      {115200, "0", 8, 1, "115200 8N1"},
  };
  for (const LineCase& line : cases) {
    std::ostringstream tags;
    tags << "loka write -q '0?SP_Baud?unsignedInt' " << line.rate
         << " && loka write -q '0?SP_Par?unsignedByte' " << line.parity
         << " && loka write -q '0?SP_Bits?unsignedByte' " << line.bits
         << " && loka write -q '0?SP_Stop?unsignedByte' " << line.stop
         << " && loka write -q '0?SP_Done?boolean' 1";
    Done(tags.str());
    EXPECT_EQ(KernelSettings(), line.kernel);
  }
}

TEST_F(EmulatedPanelTest, DisconnectAndConnect) {
  const std::string opened = "ls -l /proc/$pid/fd | grep -c " + std::string(kPort) + "; true";
  StartHost("--no-store --rx-suffix 03");
  EXPECT_NE(Done(opened), "0");
  Write("0?connect?boolean", "0");
  EXPECT_EQ(Done(opened), "0");
  EXPECT_EQ(Read("0?connect?boolean"), "0");
  Write("0?connect?boolean", "1");
  EXPECT_NE(Done(opened), "0");
  EXPECT_EQ(Read("0?connect?boolean"), "1");
  panel_->SendOnLine("AGAIN\x03");
  EXPECT_TRUE(WaitForTokens(1));
  EXPECT_EQ(Token(), "AGAIN");
}

// A token of four letters, which count.
std::string CountingToken(int number) {
  std::string token;
  for (const int divisor : {17576, 676, 26, 1}) {
    token += static_cast<char>('a' + number / divisor % 26);
  }
  return token + "\n";
}

// The device sends at the line's rate, as long as the panel is not further behind than its kernel
// and the driver's queue can keep: an emulator is slower than the line, and that is no loss of the
// panel's. The hosts have a gap of seconds, so that a busy machine makes no silence. Gives what was
// sent.
std::string EmulatedPanelTest::Stream(int tokens, std::size_t printedBefore) {
  constexpr int kPieceTokens = 2500;
  constexpr int kPiecesAhead = 3;
  constexpr int kRate = 115200;
  std::string sent;
  for (int i = 0; i < tokens;) {
    std::string piece;
    for (const int end = std::min(i + kPieceTokens, tokens); i < end; ++i) {
      piece += CountingToken(i);
    }
    panel_->SendAtRate(piece, kRate);
    sent += piece;
    const std::size_t ahead = piece.size() * kPiecesAhead;
    if (sent.size() > ahead) WaitForOutput(printedBefore + sent.size() - ahead);
  }
  WaitForOutput(printedBefore + sent.size());
  Done("wait $pid");
  return sent;
}

TEST_F(EmulatedPanelTest, AStreamOf100000TokensWithoutLoss) {
  StartSub(100000, "--rx-suffix 0A --gap 3000 --queue 10000");
  const std::string sent = Stream(100000, 0);
  EXPECT_EQ(Done("wc -l </tmp/out"), "100000");
  EXPECT_TRUE(Done("cat /tmp/out") + "\n" == sent) << "other tokens than those that were sent";
  EXPECT_EQ(Done("grep drop /tmp/said; true"), "");
}

TEST_F(EmulatedPanelTest, AStreamIntoTheMinimalHost) {
  StartMinimalHost(10000,
                   "baudrate=115200 parity=none bits=8 stopbits=1 rx_suffix=0A gap=3000 "
                   "token_queue_size=10000");
  const std::string started = "started\n";
  const std::string sent = Stream(10000, started.size());
  EXPECT_TRUE(Done("cat /tmp/out") + "\n" == started + sent) << "other tokens than those sent";
}

// A device that does not wait: what the queue cannot keep is lost, and each loss is told.
TEST_F(EmulatedPanelTest, NoTokenIsLostInSilence) {
  constexpr int kTokens = 20000;
  StartSub(kTokens, "--rx-suffix 0A --gap 3000 --queue 50");
  std::string sent;
  for (int i = 0; i < kTokens; ++i) sent += CountingToken(i);
  panel_->SendAtRate(sent, 115200);
  Done("n=0; while o=$n; n=$(cat /tmp/out /tmp/said | wc -l); [ $n != $o ]; do sleep 2; done");
  Done("kill -TERM $pid; wait $pid; true");
  const int printed = std::stoi(Done("wc -l </tmp/out"));
  const int told = std::stoi(Done("grep -c 'drop queue-full' /tmp/said; true"));
  std::printf("unpaced stream              %d tokens printed, %d told as lost\n", printed, told);
  EXPECT_EQ(printed + told, kTokens);
  EXPECT_EQ(Done("cat /tmp/out | sort -u | wc -l"), std::to_string(printed));
}

// The plug-in tests, with those that user-mode emulation cannot run. The exhaustive comparison
// keeps one prefix and the slowest megabyte stays out, as there: both take minutes under emulation.
TEST_F(EmulatedPanelTest, PluginTests) {
  const std::string comparison = "Prefixes/FramingTest.AgreesWithTheReferenceOnEveryShortLine/";
  std::string leftOut = "HostileInputTest.AMegabyteOfNodes";
  for (const char* prefix : {"none", "x02", "x03", "x0203", "x0302", "x0303"})
    leftOut += ":" + comparison + prefix;
  // With its path: some tests start the program again.
  const EmulatedPanel::Reply reply = panel_->Run(
      "LOKA_PLUGIN=/opt/libLOKA.so LOKA_STRESS_SECONDS=1 /opt/plugin_tests --gtest_brief=1 "
      "--gtest_color=no --gtest_filter='-" +
          leftOut + "' && LOKA_PLUGIN=/opt/libLOKA.so /opt/arm_difference_tests --gtest_brief=1",
      600000);
  EXPECT_EQ(reply.status, 0) << reply.output;
  EXPECT_NE(reply.output.find("PASSED"), std::string::npos) << reply.output;
}

// The library of each archive in the minimal host, on the UART.
TEST_F(EmulatedPanelTest, ChecksInTheMinimalHost) {
  const std::vector<HostCheck> checks = HostChecks();
  for (const Abi& abi : {kArmhf, kArmel}) {
    PanelSession host(*panel_, abi);
    for (const HostCheck& check : checks) {
      EXPECT_EQ(Problems(check, host), "") << abi.name << " " << check.name;
    }
    std::printf("%-8s checks in the minimal host      %zu\n", abi.name, checks.size());
  }
}

// Clock ticks of the panel: what the process has used, and what has passed.
struct Usage {
  double usedTicks = 0;
  double passedTicks = 0;
};

class FiguresTest : public EmulatedPanelTest {
 protected:
  static Usage UsageNow() {
    constexpr int kTicksPerSecond = 100;
    std::istringstream words(Done("cut -d' ' -f14,15 /proc/$pid/stat; cut -d' ' -f1 /proc/uptime"));
    double user = 0;
    double system = 0;
    double uptimeSeconds = 0;
    words >> user >> system >> uptimeSeconds;
    return {user + system, uptimeSeconds * kTicksPerSecond};
  }

  static void PrintMemory(const Abi& abi) {
    StartMinimalHost(1, "baudrate=9600 parity=none bits=8 stopbits=1 rx_suffix=0A", abi);
    const int residentKib =
        std::stoi(Done("sed -n 's/VmRSS:[^0-9]*\\([0-9]*\\).*/\\1/p' "
                       "/proc/$pid/status"));
    const int libraryKib =
        std::stoi(Done("awk '/-/ { own = /libLOKA/ } /^Rss:/ && own { sum += $2 } "
                       "END { print sum }' /proc/$pid/smaps"));
    std::printf("%-8s one started protocol            %d KiB resident, %d KiB of it libLOKA\n",
                abi.name, residentKib, libraryKib);
    EXPECT_LT(residentKib, 4096);
    EXPECT_LT(libraryKib, 512);
    EXPECT_GT(libraryKib, 0);
    panel_->SendOnLine("X\n");
    Done("wait $pid");
  }

  static void PrintStart(const Abi& abi) {
    constexpr int kRuns = 10;
    const std::string once = std::string(abi.host) + " " + kPort +
                             " 0 'CfgVer=1 model=1 port=com1 mode=RS-232 baudrate=9600 "
                             "parity=none bits=8 stopbits=1 gap=1' </dev/null | grep -c started";
    std::istringstream words(Done("cut -d' ' -f1 /proc/uptime; for i in 1 2 3 4 5 6 7 8 9 10; do " +
                                  once + "; done | wc -l; cut -d' ' -f1 /proc/uptime"));
    double before = 0;
    double after = 0;
    int runs = 0;
    words >> before >> runs >> after;
    EXPECT_EQ(runs, kRuns);
    std::printf("%-8s load, start, stop, unload       %.0f ms\n", abi.name,
                (after - before) * 1000 / kRuns);
  }

  static void PrintCpuShare(const Abi& abi, int rate) {
    constexpr int kSeconds = 4;
    const std::string token = "0123456789012345678\n";
    const int tokens = rate / 10 / static_cast<int>(token.size()) * kSeconds;
    StartMinimalHost(tokens + 1,
                     "parity=none bits=8 stopbits=1 rx_suffix=0A gap=1000 token_queue_size=10000 "
                     "baudrate=" +
                         std::to_string(rate),
                     abi);
    std::string sent;
    for (int i = 0; i < tokens; ++i) sent += token;
    const Usage before = UsageNow();
    panel_->SendAtRate(sent, rate);
    WaitForOutput(sent.size() + std::string("started\n").size());
    const Usage after = UsageNow();
    std::printf(
        "%-8s tokens of 20 bytes, %6d bit/s  %.0f %% of the emulated processor\n", abi.name, rate,
        100 * (after.usedTicks - before.usedTicks) / (after.passedTicks - before.passedTicks));
    panel_->SendOnLine(token);
    Done("wait $pid");
  }
};

TEST_F(FiguresTest, OfTheMinimalHost) {
  for (const Abi& abi : {kArmhf, kArmel}) {
    PrintMemory(abi);
    PrintStart(abi);
    for (const int rate : {9600, 115200}) PrintCpuShare(abi, rate);
  }
}

// The last case: the panel of the others is gone afterwards.
TEST_F(EmulatedPanelTest, PowerCutRightAfterDone) {
  const std::string options = "--store /data/store.db -b 9600 -p none --rx-suffix 03";
  StartHost(options);
  Done("loka set -q baud=19200 parity=odd bits=7 stop=2 rx_suffix=0D0A gap=250");
  panel_->CutPower();
  isRunning_ = false;
  SwitchOn();
  StartHost(options);
  EXPECT_EQ(KernelSettings(), "19200 7O2");
  EXPECT_EQ(Read("0?SP_RxSuffix?string-20"), "0D0A");
  EXPECT_EQ(Read("0?SP_Gap?unsignedInt"), "250");
  panel_->SendOnLine("BACK\r\n");
  EXPECT_TRUE(WaitForTokens(1));
  EXPECT_EQ(Token(), "BACK");
}

}  // namespace
