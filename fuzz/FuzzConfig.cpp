// SPDX-License-Identifier: Apache-2.0
// Any configuration text: it is refused with a reason, or the protocol starts and every setting
// reads back in its range. The same text gives the same answer a second time, on a new protocol.
//
// Input: the text, up to its first zero byte.
// Replay: build/fuzz/fuzz_config FILE
#include <cctype>

#include "fuzz/FuzzInput.h"
#include "fuzz/FuzzedDriver.h"
#include "fuzz/Require.h"

namespace {

constexpr int kLargestQueue = 10000;
constexpr int kGeneralError = -1;

bool IsHexText(const std::string& text) {
  if (text == "none") return true;
  for (const char c : text) {
    if (std::isxdigit(static_cast<unsigned char>(c)) == 0) return false;
  }
  return text.size() % 2 == 0;
}

void CheckFramingText(FuzzedDriver& driver, const std::string& memoryType) {
  const FuzzedRead outcome = driver.Read("0?" + memoryType + "?string-60000");
  Require(outcome.result != 0, memoryType + " cannot be read");
  Require(IsHexText(outcome.bytes.c_str()), memoryType + " is no hex text");
}

// What an accepted configuration leads to.
void CheckStarted(FuzzedDriver& driver) {
  // A node of an unknown model has no tags.
  if (driver->CreateTag("0?SP_Gap?unsignedInt") == nullptr) return;
  const int queueSize = driver.ReadNumber("SP_TokenQueueSize");
  Require(queueSize >= 1 && queueSize <= kLargestQueue, "queue size out of range");
  for (const char* memoryType : {"SP_RxPrefix", "SP_RxSuffix", "SP_TxPrefix", "SP_TxSuffix"}) {
    CheckFramingText(driver, memoryType);
  }
  for (const char* memoryType : {"SP_Par", "SP_Mode"}) {
    const FuzzedRead outcome = driver.Read(std::string("0?") + memoryType + "?unsignedByte");
    Require(outcome.result != 0 && static_cast<unsigned char>(outcome.bytes[0]) <= 3,
            std::string(memoryType) + " out of range");
  }
  driver.ReadNumber("SP_Baud");
  driver.ReadNumber("SP_Gap");
}

int Configure(FuzzedDriver& driver, const std::string& text) {
  const int accepted = driver->Config(text.c_str());
  if (accepted == 0) {
    Require(driver->GetLastError() == kGeneralError, "refused without an error code");
    Require(*driver->GetLastErrorString() != '\0', "refused without a reason");
  }
  return accepted;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
  const std::string text = FuzzInput(data, size).Rest();
  FuzzedDriver driver;
  const int accepted = Configure(driver, text);
  const std::string reason = driver->GetLastErrorString();
  driver.Renew();
  Require(Configure(driver, text) == accepted, "another answer the second time");
  Require(driver->GetLastErrorString() == reason, "another reason the second time");
  // Also what was refused has to be harmless: fields read before the error keep their values.
  const bool isStarted = driver->Start() != 0;
  Require(isStarted, "a scripted port can always be opened");
  if (accepted != 0) CheckStarted(driver);
  driver.Receive("\x02token\x03");
  driver->CreateTag("1?rx_token?string-20");
  return 0;
}
