// SPDX-License-Identifier: Apache-2.0
// Any contents of permanent storage: the protocol starts, every setting reads back what is stored
// (or its configured value where nothing is), and receiving, sending and storing go on.
//
// Input: a flag byte for the storage (bit 0 extended interface, bit 1 that leaves out zeros), and
// for each key a byte that picks absent, boolean, number or text, and the value. Replay:
// build/fuzz/fuzz_storage FILE
#include <algorithm>
#include <map>

#include "fuzz/FuzzInput.h"
#include "fuzz/FuzzedDriver.h"
#include "fuzz/Require.h"

namespace {

constexpr const char* kIdent = "panel";
constexpr const char* kNumbers[][2] = {
    {"baud", "SP_Baud"}, {"gap", "SP_Gap"}, {"token_queue_size", "SP_TokenQueueSize"}};
constexpr const char* kBytes[][2] = {
    {"parity", "SP_Par"}, {"bits", "SP_Bits"}, {"stop", "SP_Stop"}, {"mode", "SP_Mode"}};
constexpr const char* kTexts[][2] = {{"rx_prefix", "SP_RxPrefix"},
                                     {"rx_suffix", "SP_RxSuffix"},
                                     {"tx_prefix", "SP_TxPrefix"},
                                     {"tx_suffix", "SP_TxSuffix"}};

enum class Kind { kAbsent, kBoolean, kNumber, kText };

class StorageRun {
 public:
  explicit StorageRun(FuzzInput& input) : input_(input) {
    const unsigned int flags = input.Byte();
    isPlain_ = (flags & 1U) == 0;
    Storage().SetExtended(!isPlain_);
    Storage().SetUnterminated((flags & 2U) != 0);
    driver_->SetIdent(kIdent);
    for (const auto& key : kNumbers) Fill(key[0]);
    for (const auto& key : kBytes) Fill(key[0]);
    for (const auto& key : kTexts) Fill(key[0]);
    Fill("hex_tokens");
    driver_.Run("rx_suffix=03 tx_prefix=02");
  }

  void CheckSettings() {
    for (const auto& key : kNumbers) {
      const int value = driver_.ReadNumber(key[1]);
      Require(KindOf(key[0]) != Kind::kNumber || value == numbers_[key[0]],
              std::string("another value than stored: ") + key[1]);
    }
    for (const auto& key : kBytes) {
      const FuzzedRead outcome = driver_.Read(std::string("0?") + key[1] + "?unsignedByte");
      Require(outcome.result != 0, std::string(key[1]) + " cannot be read");
      Require(KindOf(key[0]) != Kind::kNumber ||
                  outcome.bytes[0] == static_cast<char>(numbers_[key[0]]),
              std::string("another value than stored: ") + key[1]);
    }
    for (const auto& key : kTexts) CheckText(key[0], key[1]);
    Require(driver_.Read("0?SP_HexTokens?boolean").result != 0, "SP_HexTokens cannot be read");
  }

  void GoOn() {
    driver_.Receive(
        "A\x03"
        "B\x03"
        "C\x03");
    const int most = std::max(1, driver_.ReadNumber("SP_TokenQueueSize"));
    Require(driver_.ReadNumber("tokens_available") <= most, "more tokens than the queue keeps");
    driver_.Write("0?tx_token?string-8", "4142");
    char text[64] = {};
    Require(driver_->vcsGetComParams(text, sizeof text) == 1, "no communication parameters");
    // Staged over whatever was stored, and stored itself.
    Require(driver_.Write("0?SP_Bits?unsignedByte", "\7") != 0, "SP_Bits is refused");
    Require(driver_.Write("0?SP_Done?boolean", "\1") != 0, "SP_Done fails");
    driver_->Stop();
    Require(driver_->Start() != 0, "Start fails");
    Require(driver_.Read("0?SP_Bits?unsignedByte").bytes == "\7", "SP_Bits is not in effect");
    Require(Storage().GetInteger(kIdent, "bits") == 7, "SP_Bits is not stored");
  }

 private:
  ScriptedStorage& Storage() { return driver_.Host().Storage(); }

  void Fill(const std::string& key) {
    const auto kind = static_cast<Kind>(input_.Below(4));
    kinds_[key] = kind;
    switch (kind) {
      case Kind::kAbsent:
        break;
      case Kind::kBoolean:
        Storage().PutBoolean(kIdent, key, input_.Flag());
        break;
      case Kind::kNumber:
        numbers_[key] = input_.Int();
        Storage().Put(kIdent, key, numbers_[key]);
        break;
      case Kind::kText:
        // Long ones too: the extended interface refuses what does not fit.
        texts_[key] = input_.Text();
        for (unsigned int repeats = input_.Byte() % 4; repeats > 0; --repeats) {
          texts_[key] += texts_[key];
        }
        Storage().PutString(kIdent, key, texts_[key]);
        break;
    }
  }

  Kind KindOf(const std::string& key) { return kinds_[key]; }

  void CheckText(const std::string& key, const std::string& memoryType) {
    const FuzzedRead outcome = driver_.Read("0?" + memoryType + "?string-5000");
    Require(outcome.result != 0, memoryType + " cannot be read");
    if (isPlain_ && KindOf(key) == Kind::kText) {
      Require(outcome.bytes.c_str() == std::string(texts_[key].c_str()),
              "another text than stored: " + memoryType);
    }
  }

  FuzzInput& input_;
  FuzzedDriver driver_;
  bool isPlain_ = false;
  std::map<std::string, Kind> kinds_;
  std::map<std::string, int> numbers_;
  std::map<std::string, std::string> texts_;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
  FuzzInput input(data, size);
  StorageRun run(input);
  run.CheckSettings();
  run.GoOn();
  return 0;
}
