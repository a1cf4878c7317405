// SPDX-License-Identifier: Apache-2.0
// Any received stream, with bytes, silences and setting changes in between, compared token by token
// with the reference framer; in hex mode, with every queue size.
//
// Input: sections. A section begins with a byte that says which settings follow (bit 0 prefix, bit
// 1 suffix, bit 2 hex mode, bit 3 queue size, bit 4 through SP_Done instead of the console), the
// settings, a length byte and so many bytes of the line: 0xFE is a silence, 0xFF repeats the byte
// behind it 200 times, 0xF0 to 0xF3 stand for bytes of the prefix and of the suffix.
// Replay: build/fuzz/fuzz_receive FILE
#include <deque>
#include <vector>

#include "fuzz/FuzzInput.h"
#include "fuzz/FuzzedDriver.h"
#include "fuzz/Require.h"
#include "tests/support/ReferenceFramer.h"

namespace {

constexpr int kGapMs = 20;
constexpr std::size_t kLongestMarkBytes = 6;
constexpr int kRepeats = 200;

std::string HexText(const std::string& bytes) {
  constexpr const char* kDigits = "0123456789ABCDEF";
  std::string text;
  for (const char c : bytes) {
    const auto byte = static_cast<unsigned char>(c);
    text += kDigits[byte / 16];
    text += kDigits[byte % 16];
  }
  return text;
}

std::string OrNone(const std::string& text) { return text.empty() ? "none" : text; }

// The settings that the driver should run with, and the tokens that should wait.
struct Expected {
  std::string prefix;
  std::string suffix;
  bool hexTokens = false;
  int queueSize = 100;
  std::deque<std::string> tokens;
};

class ReceiveRun {
 public:
  explicit ReceiveRun(FuzzInput& input) : input_(input) {
    driver_.Run("gap=" + std::to_string(kGapMs));
  }

  void Section() {
    Settings();
    Line();
    Compare();
  }

  void Acknowledge() {
    while (!expected_.tokens.empty()) {
      driver_.Write("0?token_ack?boolean", "\1");
      expected_.tokens.pop_front();
      Compare();
    }
    driver_.Write("0?token_ack?boolean", "\1");
    Compare();
  }

 private:
  std::string Mark() {
    std::string mark;
    for (std::size_t left = input_.Below(kLongestMarkBytes + 1); left > 0; --left) {
      mark += static_cast<char>(input_.Byte());
    }
    return mark;
  }

  void Settings() {
    const unsigned int flags = input_.Byte();
    const bool applies = (flags & 16U) != 0;
    if ((flags & 1U) != 0) expected_.prefix = Mark();
    if ((flags & 2U) != 0) expected_.suffix = Mark();
    if ((flags & 4U) != 0) expected_.hexTokens = input_.Flag();
    // The console has no command for the queue size.
    if (applies && (flags & 8U) != 0) expected_.queueSize = static_cast<int>(input_.Byte()) - 5;
    if (applies) {
      ApplyByTags();
    } else {
      ApplyByConsole();
    }
  }

  void ApplyByConsole() {
    driver_.Command("set_rxPrefix " + OrNone(HexText(expected_.prefix)));
    driver_.Command("set_rxSuffix " + OrNone(HexText(expected_.suffix)));
    driver_.Command(expected_.hexTokens ? "set_hexToken ON" : "set_hexToken OFF");
  }

  void ApplyByTags() {
    Stage("SP_RxPrefix?string-20", OrNone(HexText(expected_.prefix)));
    Stage("SP_RxSuffix?string-20", HexText(expected_.suffix));
    Stage("SP_HexTokens?boolean", std::string(1, expected_.hexTokens ? '\1' : '\0'));
    const auto size = static_cast<unsigned int>(expected_.queueSize);
    Stage("SP_TokenQueueSize?unsignedInt",
          {static_cast<char>(size), static_cast<char>(size >> 8U), static_cast<char>(size >> 16U),
           static_cast<char>(size >> 24U)});
    Stage("SP_Done?boolean", "\1");
    expected_.tokens.clear();
  }

  void Stage(const std::string& memoryAndType, const std::string& value) {
    Require(driver_.Write("0?" + memoryAndType, value) != 0, memoryAndType + " is refused");
  }

  // One byte of the input stands for a byte or a silence of the line.
  void Line() {
    std::vector<int> events;
    for (unsigned int left = input_.Byte(); left > 0 && !input_.IsEmpty(); --left) {
      const unsigned int code = input_.Byte();
      if (code == 0xFE) {
        events.push_back(kSilence);
      } else if (code == 0xFF) {
        events.insert(events.end(), kRepeats, static_cast<int>(input_.Byte()));
      } else {
        events.push_back(Shortcut(code));
      }
    }
    for (const int event : events) {
      if (event == kSilence) {
        driver_.Host().Line().Silence(kGapMs);
      } else {
        driver_.Host().Line().Feed(std::string(1, static_cast<char>(event)));
      }
    }
    driver_.Receive("");
    events.push_back(kSilence);  // behind the script the line stays silent
    for (const std::string& token : ReferenceTokens(events, expected_.prefix, expected_.suffix)) {
      const bool isFull = !expected_.tokens.empty() &&
                          static_cast<int>(expected_.tokens.size()) >= expected_.queueSize;
      expected_.tokens.push_back(expected_.hexTokens ? HexText(token) : token);
      if (isFull) expected_.tokens.pop_front();
    }
  }

  int Shortcut(unsigned int code) const {
    const std::string& mark = code < 0xF2 ? expected_.prefix : expected_.suffix;
    const std::size_t at = code % 2;
    return code >= 0xF0 && code <= 0xF3 && at < mark.size()
               ? static_cast<int>(static_cast<unsigned char>(mark[at]))
               : static_cast<int>(code);
  }

  void Compare() {
    const auto count = static_cast<int>(expected_.tokens.size());
    Require(driver_.ReadNumber("tokens_available") == count,
            "another number of tokens than the reference: " + std::to_string(count));
    const std::string front = count == 0 ? "" : expected_.tokens.front();
    Require(driver_.ReadNumber("rx_token_len") == static_cast<int>(front.size()),
            "another length than the reference");
    const std::string text = driver_.Read("0?rx_token?string-2500").bytes.c_str();
    Require(text == front.c_str(), "another token than the reference");
  }

  FuzzInput& input_;
  FuzzedDriver driver_;
  Expected expected_;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
  FuzzInput input(data, size);
  ReceiveRun run(input);
  while (!input.IsEmpty()) run.Section();
  run.Acknowledge();
  return 0;
}
