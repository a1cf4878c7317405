// SPDX-License-Identifier: Apache-2.0
// Any sequence of console commands beside a running receive task: no reply leaves its buffer, and
// what the commands count agrees with each other.
//
// Input: one command a line. The first byte of a line picks a known command to stand in front of
// the rest (128 and more: none); an even byte lets the line receive a token first. Replay:
// build/fuzz/fuzz_console FILE
#include "fuzz/FuzzInput.h"
#include "fuzz/FuzzedDriver.h"
#include "fuzz/Require.h"

namespace {

constexpr const char* kCommands[] = {"help",
                                     "info",
                                     "xml",
                                     "lasterror",
                                     "getmaxtm",
                                     "deletetags",
                                     "read ",
                                     "read 0?",
                                     "read 0?rx_token?string-",
                                     "read 0?SP_RxPrefix?string-",
                                     "write ",
                                     "write 0?SP_Done?boolean ",
                                     "write 0?SP_TokenQueueSize?unsignedInt ",
                                     "write 0?tx_token?string-4 ",
                                     "write 0?connect?boolean ",
                                     "connect ",
                                     "connect ON",
                                     "connect OFF",
                                     "get_stat",
                                     "put ",
                                     "get",
                                     "get_token_length",
                                     "tokens_available",
                                     "token_ack",
                                     "token_ack all",
                                     "set_hexToken ",
                                     "set_hexToken ON",
                                     "set_hexToken OFF",
                                     "set_rxGap ",
                                     "set_rxPrefix ",
                                     "set_rxSuffix ",
                                     "set_txPrefix ",
                                     "set_txSuffix "};
constexpr unsigned int kNoCommand = 128;

// A tag may declare two gigabytes, and the driver then takes that much memory for as long as the
// command lasts. Only the time of a run would be at stake here: numbers of more than six digits are
// cut.
std::string WithoutLongNumbers(const std::string& line) {
  constexpr int kMostDigits = 6;
  std::string shorter;
  int digits = 0;
  for (const char c : line) {
    digits = c >= '0' && c <= '9' ? digits + 1 : 0;
    if (digits <= kMostDigits || line.find("string-") == std::string::npos) shorter += c;
  }
  return shorter;
}

std::string NextCommand(FuzzInput& input, bool& receivesFirst) {
  const unsigned int choice = input.Byte();
  receivesFirst = choice % 2 == 0;
  const std::string front =
      choice < kNoCommand ? kCommands[choice % (sizeof kCommands / sizeof kCommands[0])] : "";
  return WithoutLongNumbers(front + input.Line());
}

// "tokens_available", "get" and "get_token_length" speak of the same queue.
void CheckCounts(FuzzedDriver& driver) {
  const int available = std::stoi(driver.Command("tokens_available").bytes);
  Require(available == driver.ReadNumber("tokens_available"), "two numbers of tokens");
  const int length = std::stoi(driver.Command("get_token_length").bytes);
  Require(length == driver.ReadNumber("rx_token_len"), "two lengths of a token");
  Require(available > 0 || length == 0, "a length without a token");
  const std::string token = driver.Command("get", 5000).bytes.c_str();
  Require(static_cast<int>(token.size()) <= length, "a token that is longer than its length");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
  FuzzInput input(data, size);
  FuzzedDriver driver;
  driver.Run("rx_prefix=02 rx_suffix=03 tx_suffix=0D gap=20 token_queue_size=4");
  while (!input.IsEmpty()) {
    bool receivesFirst = false;
    const std::string command = NextCommand(input, receivesFirst);
    if (receivesFirst)
      driver.Receive(
          "\x02"
          "4142" +
          command.substr(0, 20) + "\x03");
    // Reply buffers of many sizes, zero and one among them.
    const int replyBytes = static_cast<int>(command.size() * 7 % 300);
    driver.Command(command, replyBytes);
    driver.CheckRules();
  }
  CheckCounts(driver);
  return 0;
}
