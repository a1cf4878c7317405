// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <optional>
#include <string>

class HostSession;
class HostTag;

// A token as it was taken from the driver's queue.
struct ReceivedToken {
  std::string bytes;             // decoded in hex mode; without what stands behind a zero byte
  unsigned int lengthBytes = 0;  // the true length
  bool isCut = false;            // plain mode and a zero byte in it: `bytes` ends in front of that
};

// Takes tokens through the tags, one after the other, and reads through a longer tag when a token
// is too long for the one at hand. One thread.
//
// The tags are separate reads. While the queue is full the driver drops its oldest token at any
// time, also between the read and the acknowledge, which then drops the one behind it; no reader
// can prevent that. Below the limit nothing is lost.
class TokenReader {
 public:
  // The session must be started and outlive the reader.
  explicit TokenReader(HostSession* session);
  ~TokenReader();

  TokenReader(const TokenReader&) = delete;
  TokenReader& operator=(const TokenReader&) = delete;

  enum class Outcome { kToken, kEmpty, kFailed };

  // Reads the oldest token and acknowledges it. kFailed leaves the reason in Error.
  Outcome Take(ReceivedToken* token);

  // The same without acknowledging.
  Outcome Peek(ReceivedToken* token);

  // Drops the oldest token.
  bool Acknowledge();

  // Tokens that wait; false when the driver refuses.
  bool CountWaiting(unsigned int* count);

  // Whether tokens are hexadecimal text from now on. Who knows what the driver runs with says it
  // here; the driver's tag, which is asked otherwise, shows what is staged and not what is in
  // effect.
  void SetHexMode(bool isHex) { hexMode_ = isHex; }

  // Frees the tags that the reader keeps; the next call makes them again.
  void GiveTagsBack();

  // The driver's text for the last failure.
  const std::string& Error() const { return error_; }

 private:
  bool Prepare();
  bool ReadHexMode(bool* isHex);
  std::unique_ptr<HostTag> MakeTag(const std::string& uri);
  bool ReadNumber(const HostTag& tag, unsigned int* value);
  bool MakeRoom(unsigned int lengthCharacters);
  bool ReadStable(std::string* text, unsigned int* length);

  HostSession* const session_;
  std::unique_ptr<HostTag> availableTag_;
  std::unique_ptr<HostTag> lengthTag_;
  std::unique_ptr<HostTag> hexTag_;
  std::unique_ptr<HostTag> acknowledgeTag_;
  std::unique_ptr<HostTag> tokenTag_;
  std::optional<bool> hexMode_;
  unsigned int roomCharacters_ = 0;  // longest text that tokenTag_ can read
  std::string text_;                 // of the last read, for its memory
  std::string error_;
};
