// SPDX-License-Identifier: Apache-2.0
#include "tests/panel/HostChecks.h"

#include <chrono>
#include <cstdio>
#include <thread>
#include <utility>

namespace {

using Steps = std::vector<HostStep>;

constexpr const char* kOrdinary =
    " model=1 port=com1 baudrate=9600 parity=none bits=8 stopbits=1 mode=RS-232";
constexpr int kTries = 2000;
constexpr int kBetweenTriesMs = 5;
constexpr int kSilenceMs = 500;

constexpr int kRates[] = {150, 300, 600, 1200, 2400, 4800, 9600, 19200, 38400, 57600, 115200};
constexpr const char* kParities[] = {"none", "even", "odd", "mark", "space"};
constexpr char kParityLetters[] = {'N', 'E', 'O', 'M', 'S'};
constexpr int kConfiguredParities = 4;

// "41 42" or "4142" to the bytes.
std::string Bytes(const std::string& hex) {
  std::string bytes;
  for (std::size_t i = 0; i + 1 < hex.size(); ++i) {
    if (hex[i] == ' ') continue;
    bytes += static_cast<char>(std::stoi(hex.substr(i, 2), nullptr, 16));
    ++i;
  }
  return bytes;
}

std::string HexOf(const std::string& bytes) {
  std::string hex;
  for (const char byte : bytes) {
    char digits[4];
    (void)std::snprintf(digits, sizeof(digits), "%02X", static_cast<unsigned char>(byte));
    hex += (hex.empty() ? "" : " ") + std::string(digits);
  }
  return hex;
}

// The bytes of a 32-bit number as the console takes them, lowest first.
std::string NumberHex(unsigned number) {
  char digits[9];
  (void)std::snprintf(digits, sizeof(digits), "%02X%02X%02X%02X", number & 0xFFU,
                      number >> 8U & 0xFFU, number >> 16U & 0xFFU, number >> 24U);
  return digits;
}

struct Line {
  int rate;
  int parity;
  int bits;
  int stop;
};

std::string KernelText(const Line& line) {
  return std::to_string(line.rate) + " " + std::to_string(line.bits) + kParityLetters[line.parity] +
         std::to_string(line.stop);
}

HostStep Write(const std::string& tag, const std::string& hex) {
  return {"write 0?" + tag + " " + hex, "true written ok"};
}
HostStep Read(const std::string& tag, const std::string& hex) {
  return {"read 0?" + tag, "true " + hex};
}

// Each rate once, and each parity with each number of bits.
HostCheck ConfiguredLine(const Line& line) {
  return {"Line" + std::to_string(line.rate) + kParityLetters[line.parity] +
              std::to_string(line.bits) + std::to_string(line.stop),
          "baudrate=" + std::to_string(line.rate) + " parity=" + kParities[line.parity] +
              " bits=" + std::to_string(line.bits) + " stopbits=" + std::to_string(line.stop) +
              " gap=100 rx_suffix=0D tx_suffix=0A",
          {{"line", KernelText(line)},
           {"device 41 7F 0D", ""},
           {"until get", "true A\x7F"},
           {"put BC", "true OK"},
           {"sent 42 43 0A", ""}}};
}

std::vector<HostCheck> ConfiguredLines() {
  std::vector<HostCheck> checks;
  int turn = 0;
  for (const int rate : kRates) {
    checks.push_back(
        ConfiguredLine({rate, turn % kConfiguredParities, 8 - turn / 2 % 2, 1 + turn / 3 % 2}));
    ++turn;
  }
  for (int parity = 0; parity < kConfiguredParities; ++parity) {
    for (const int bits : {7, 8}) {
      for (const int stop : {1, 2}) checks.push_back(ConfiguredLine({9600, parity, bits, stop}));
    }
  }
  // One of them stands in both lists.
  for (std::size_t i = 0; i < checks.size(); ++i) {
    for (std::size_t k = checks.size(); --k > i;) {
      if (checks[k].name == checks[i].name) checks.erase(checks.begin() + static_cast<long>(k));
    }
  }
  return checks;
}

void AddLineAtRunTime(const Line& line, Steps& steps) {
  steps.push_back(Write("SP_Baud?unsignedInt", NumberHex(static_cast<unsigned>(line.rate))));
  steps.push_back(Write("SP_Par?unsignedByte", "0" + std::to_string(line.parity)));
  steps.push_back(Write("SP_Bits?unsignedByte", "0" + std::to_string(line.bits)));
  steps.push_back(Write("SP_Stop?unsignedByte", "0" + std::to_string(line.stop)));
  steps.push_back(Write("SP_Done?boolean", "01"));
  steps.push_back({"line", KernelText(line)});
}

// Every rate, and every parity with every number of data and stop bits.
HostCheck LineAtRunTime() {
  HostCheck check = {"LineAtRunTime", "", {{"line", "9600 8N1"}}};
  for (const int rate : kRates) AddLineAtRunTime({rate, 0, 8, 1}, check.steps);
  for (int parity = 0; parity < 5; ++parity) {
    for (const int bits : {7, 8}) {
      for (const int stop : {1, 2}) AddLineAtRunTime({19200, parity, bits, stop}, check.steps);
    }
  }
  return check;
}

std::vector<HostCheck> Framing() {
  return {
      {"PrefixAndSuffix",
       "rx_prefix=02 rx_suffix=03",
       {{"device 58 02 41 42 03 59", ""},
        {"until tokens_available", "true 1"},
        {"get", "true AB"},
        {"get_token_length", "true 2"},
        {"token_ack", "true OK"},
        {"tokens_available", "true 0"}}},
      {"SilenceDropsABeginning",
       "rx_prefix=02 rx_suffix=03 gap=20",
       {{"device 02 41", ""},
        {"silence", ""},
        {"device 42 03 02 43 03", ""},
        {"until get", "true C"},
        {"tokens_available", "true 1"}}},
      {"PrefixOnly",
       "rx_prefix=02",
       {{"device 58 02 41 42 02 43 44", ""},
        {"until tokens_available", "true 2"},
        {"get", "true AB"},
        {"token_ack", "true OK"},
        {"get", "true CD"}}},
      {"EmptyToken",
       "rx_prefix=02",
       {{"device 02 02 45", ""},
        {"until tokens_available", "true 2"},
        {"get_token_length", "true 0"},
        {"token_ack", "true OK"},
        {"get", "true E"}}},
      {"SuffixOfTwoBytes",
       "rx_suffix=0D0A hex_tokens=true",
       {{"device 31 2E 35 0D 6B 67 0D 0A", ""}, {"until get", "true 312E350D6B67"}}},
      {"SilenceOnly",
       "gap=100",
       {{"device 48 49", ""},
        {"until tokens_available", "true 1"},
        {"device 48 4F", ""},
        {"until tokens_available", "true 2"},
        {"get", "true HI"},
        {"token_ack", "true OK"},
        {"get", "true HO"}}},
      {"HexTokens",
       "rx_prefix=02 rx_suffix=03 tx_suffix=0D hex_tokens=true",
       {{"device 02 00 1D FF 80 03", ""},
        {"until get", "true 001DFF80"},
        {"get_token_length", "true 8"},
        {"put 00ff", "true OK"},
        {"sent 00 FF 0D", ""},
        {"put 0F0", "false ERROR: token to send must be in hex format"}}},
      {"FullQueueDropsTheOldest",
       "rx_suffix=0A token_queue_size=3",
       {{"device 41 0A 42 0A 43 0A 44 0A", ""},
        {"until get", "true B"},
        {"tokens_available", "true 3"},
        {"token_ack all", "true OK"},
        {"tokens_available", "true 0"}}},
      // 1001 bytes without a suffix go, what follows is a token; 1000 with their suffix are one.
      {"LongestToken",
       "rx_suffix=03",
       {{"device " + std::string(2 * 1001, '4') + " 45 03", ""},
        {"until get", "true E"},
        {"token_ack", "true OK"},
        {"device " + std::string(2 * 999, '4') + " 03", ""},
        {"until get_token_length", "true 999"}}},
  };
}

// One token waits: "AB" with the numbers of its bytes 41 42.
HostCheck KindsOfTags() {
  return {
      "KindsOfTags",
      "rx_suffix=03 tx_suffix=03 gap=300",
      {{"device 41 42 03", ""},
       {"until tokens_available", "true 1"},
       Read("rx_token?string-5", "4142000000"),
       Read("rx_token?string-4(swap2)", "42410000"),
       Read("rx_token?string-4(swap4)", "00004241"),
       Read("rx_token?string-3(swapnibble)", "142400"),
       Read("rx_token?string-3(neg)", "bfbe00"),
       Read("rx_token?string-2", "token too long"),
       Read("rx_token_len?unsignedInt", "02000000"),
       Read("rx_token_len?unsignedInt(inv)", "fdffffff"),
       Read("tokens_available?unsignedInt(swap4)", "00000001"),
       Read("SP_Gap?unsignedInt", "2c010000"),
       Read("SP_Bits?unsignedByte", "08"),
       Read("SP_Bits?unsignedByte(inv)", "f7"),
       Read("SP_Bits?unsignedByte(bcd)", "08"),
       Read("SP_RxSuffix?string-3", "303300"),
       Read("SP_HexTokens?boolean", "00"),
       Read("connect?boolean", "01"),
       Read("connect?boolean(inv)", "00"),
       Read("tokens_available?unsignedInt(other)", "read conversion error"),
       Read("connect?unsignedInt", "Tag URI error: 0?connect?unsignedInt - not allowed vado type"),
       Read("Connect?boolean", "Tag URI error: 0?Connect?boolean - Can't access memory type"),
       {"write 0?rx_token?string-2 4142", "true writing to read_only type"},
       Write("tx_token?string-4", "43440000"),
       {"sent 43 44 03", ""},
       Write("tx_token?string-4(swap2)", "46450000"),
       {"sent 45 46 03", ""},
       Write("SP_Gap?unsignedInt(bcd)", NumberHex(70)),
       Read("SP_Gap?unsignedInt", "70000000"),
       Write("token_ack?boolean", "00"),
       Read("tokens_available?unsignedInt", "00000000")}};
}

HostCheck ConsoleCommands() {
  return {"ConsoleCommands",
          "rx_prefix=02 rx_suffix=03",
          {{"device 02 41 42 03 02 43 44 03", ""},
           {"until tokens_available", "true 2"},
           {"get_stat", "true Connected"},
           {"token_ack", "true OK"},
           {"get", "true CD"},
           {"put hello world", "true OK"},
           {"sent 68 65 6C 6C 6F 20 77 6F 72 6C 64", ""},
           {"put", "false ERROR: string to send is missing"},
           {"connect", "false ERROR: new connect state is missing"},
           {"connect on", "false ERROR: wrong value"},
           {"set_rxGap", "false ERROR: new value is missing"},
           {"set_rxGap soon", "true ERROR: wrong value"},
           {"set_rxGap 50ms", "true OK"},
           Read("SP_Gap?unsignedInt", "00000000"),
           {"set_hexToken yes", "true ERROR: wrong value"},
           {"set_hexToken ON", "true OK"},
           {"put 0D0", "false ERROR: token to send must be in hex format"},
           {"set_hexToken OFF", "true OK"},
           {"set_txPrefix 05", "true OK"},
           {"set_txSuffix 06", "true OK"},
           {"put X", "true OK"},
           {"sent 05 58 06", ""},
           {"token_ack all", "true OK"},
           {"set_rxPrefix none", "true OK"},
           {"set_rxSuffix 0A", "true OK"},
           // A receive pass that has begun keeps its framing to its end.
           {"silence", ""},
           {"silence", ""},
           {"device 02 5A 0A", ""},
           {"until get", "true \x02Z"},
           {"write 0?SP_Baud?unsignedInt", "true error: missing parameters (URI string + data)"},
           {"write 0?SP_Baud?unsignedInt 01000000", "true illegal baudrate intValue"},
           {"write 0?SP_Bits?unsignedByte 0", "true error: incorrect length of data to write"},
           {"write 0?SP_Bits?unsignedByte 0G", "true error: incorrect hex data"},
           {"lasterror", "true illegal baudrate intValue"},
           {"getmaxtm", "true maxtm = 0 ms"},
           {"HELP", "false "}}};
}

std::vector<HostCheck> SettingsAtRunTime() {
  return {
      {"StagedValuesWaitForDone",
       "rx_suffix=03",
       {Write("SP_Baud?unsignedInt", NumberHex(57600)),
        Write("SP_Mode?unsignedByte", "01"),
        Write("SP_RxSuffix?string-3", "374300"),
        Write("SP_TxPrefix?string-3", "303200"),
        Write("SP_TokenQueueSize?unsignedInt", NumberHex(2)),
        Read("SP_Baud?unsignedInt", "00e10000"),
        {"line", "9600 8N1"},
        {"device 41 7C 03", ""},
        {"until get", "true A|"},
        Write("SP_Done?boolean", "01"),
        {"line", "57600 8N1"},
        {"tokens_available", "true 0"},
        {"silence", ""},
        {"silence", ""},
        {"device 42 03 7C 43 7C 44 7C", ""},
        {"until get", "true C"},
        {"tokens_available", "true 2"},
        {"put E", "true OK"},
        {"sent 02 45", ""}}},
      {"RefusedValues",
       "",
       {{"write 0?SP_Baud?unsignedInt " + NumberHex(14400), "true illegal baudrate intValue"},
        {"write 0?SP_RxPrefix?string-3 303000", "true written ok"},
        {"write 0?SP_RxPrefix?string-2 3000", "true Rx prefix value is not hex format"},
        {"write 0?SP_Bits?unsignedByte 06", "true Rx prefix value is not hex format"},
        {"write 0?SP_Stop?unsignedByte 03", "true Rx prefix value is not hex format"},
        {"write 0?SP_Par?unsignedByte 05", "true Rx prefix value is not hex format"},
        {"write 0?SP_Mode?unsignedByte 04", "true Rx prefix value is not hex format"},
        Read("SP_Bits?unsignedByte", "08"),
        Write("SP_Done?boolean", "01"),
        {"line", "9600 8N1"}}},
  };
}

std::vector<HostCheck> Connection() {
  return {
      {"DisconnectAndConnect",
       "rx_suffix=03 tx_suffix=03",
       {Write("connect?boolean", "00"),
        {"get_stat", "true Disconnected"},
        Read("connect?boolean", "00"),
        {"put X", "false ERROR: serial port is not active for sending"},
        {"write 0?connect?boolean 00", "true Serial port not active for sending"},
        Write("connect?boolean", "01"),
        {"get_stat", "true Connected"},
        {"line", "9600 8N1"},
        {"device 41 03", ""},
        {"until get", "true A"},
        // The state that is there already is a token to send.
        Write("connect?boolean", "01"),
        {"sent 01 03", ""},
        {"connect OFF", "true OK"},
        {"connect OFF", "true OK"},
        {"get_stat", "true Disconnected"},
        {"get", "true A"}}},
      {"ConnectWhenAsked",
       "autoConnect=false baudrate=38400 rx_suffix=03",
       {{"get_stat", "true Disconnected"},
        {"connect ON", "true OK"},
        {"line", "38400 8N1"},
        {"device 41 03", ""},
        {"until get", "true A"}}},
  };
}

HostCheck Refused(const std::string& name, const std::string& keys, const std::string& text) {
  return {"Refused" + name, keys, {}, text};
}

std::vector<HostCheck> RefusedConfigurations() {
  return {
      Refused("Parity", "parity=space", "Parser: parameter 'parity' has invalid value"),
      Refused("Mode", "mode=RS485", "Parser: parameter 'mode' has invalid value"),
      Refused("Prefix", "rx_prefix=2", "rx_prefix not in hex format"),
      Refused("QueueSize", "token_queue_size=10001", "parameter 'token_queue_size' out of range"),
      Refused("Flag", "hex_tokens=TRUE", "Parser: parameter 'hex_tokens' has illegal value")};
}

// The host's result, a blank, its reply without line ends behind it.
std::string AskHost(const std::string& command, HostSession& session) {
  std::string reply = session.Ask(command);
  const std::size_t lastLine = reply.rfind('\n') + 1;
  const std::string result = reply.substr(lastLine);
  reply.erase(lastLine);
  while (!reply.empty() && reply.back() == '\n') reply.pop_back();
  return result + " " + reply;
}

// What the host answers; for "until", the last answer.
std::string Answer(const HostStep& step, HostSession& session) {
  constexpr const char* kUntil = "until ";
  if (step.command.rfind(kUntil, 0) != 0) return AskHost(step.command, session);
  std::string answer;
  for (int i = 0; i < kTries && answer != step.answer; ++i) {
    if (i > 0) std::this_thread::sleep_for(std::chrono::milliseconds(kBetweenTriesMs));
    answer = AskHost(step.command.substr(std::string(kUntil).size()), session);
  }
  return answer;
}

std::string Play(const HostStep& step, HostSession& session) {
  const std::size_t blank = step.command.find(' ');
  const std::string word = step.command.substr(0, blank);
  const std::string rest = blank == std::string::npos ? "" : step.command.substr(blank + 1);
  std::string answer = step.answer;
  std::string expected = step.answer;
  if (word == "device") {
    session.SendOnLine(Bytes(rest));
  } else if (word == "silence") {
    std::this_thread::sleep_for(std::chrono::milliseconds(kSilenceMs));
  } else if (word == "sent") {
    expected = rest;
    answer = HexOf(session.TakeFromLine(Bytes(rest).size()));
  } else if (word == "line") {
    answer = session.LineSettings();
    if (answer.empty()) return "";
  } else {
    answer = Answer(step, session);
  }
  if (answer == expected) return "";
  return step.command + "\n  expected: " + expected + "\n  came:     " + answer + "\n";
}

void Append(std::vector<HostCheck> more, std::vector<HostCheck>& checks) {
  for (HostCheck& check : more) checks.push_back(std::move(check));
}

}  // namespace

std::vector<HostCheck> HostChecks() {
  std::vector<HostCheck> checks = {LineAtRunTime(), KindsOfTags(), ConsoleCommands()};
  Append(ConfiguredLines(), checks);
  Append(Framing(), checks);
  Append(SettingsAtRunTime(), checks);
  Append(Connection(), checks);
  Append(RefusedConfigurations(), checks);
  return checks;
}

std::string Problems(const HostCheck& check, HostSession& session) {
  const std::string first = session.Start("CfgVer=1 " + check.keys + kOrdinary);
  std::string problems;
  if (first != check.firstLine) problems = "first line: " + first + "\n";
  if (first == "started") {
    for (const HostStep& step : check.steps) problems += Play(step, session);
  }
  const int status = session.End();
  if (status != (check.firstLine == "started" ? 0 : 4)) {
    problems += "exit status " + std::to_string(status) + "\n";
  }
  return problems;
}
