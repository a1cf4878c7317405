// SPDX-License-Identifier: Apache-2.0
#include "host/runtime/TokenReader.h"

#include "host/runtime/HostSession.h"
#include "host/runtime/HostTag.h"
#include "host/text/ByteText.h"

namespace {

constexpr unsigned int kFirstRoomCharacters = 255;
constexpr int kAttempts = 100;

}  // namespace

TokenReader::TokenReader(HostSession* session) : session_(session) {}

TokenReader::~TokenReader() = default;

std::unique_ptr<HostTag> TokenReader::MakeTag(const std::string& uri) {
  return session_->CreateTag(uri, &error_);
}

bool TokenReader::Prepare() {
  if (acknowledgeTag_ != nullptr) {
    return true;
  }
  availableTag_ = MakeTag("0?tokens_available?unsignedInt");
  lengthTag_ = MakeTag("0?rx_token_len?unsignedInt");
  hexTag_ = MakeTag("0?SP_HexTokens?boolean");
  auto acknowledgeTag = MakeTag("0?token_ack?boolean");
  if (availableTag_ == nullptr || lengthTag_ == nullptr || hexTag_ == nullptr) {
    return false;
  }
  acknowledgeTag_ = std::move(acknowledgeTag);
  return acknowledgeTag_ != nullptr;
}

void TokenReader::GiveTagsBack() {
  availableTag_.reset();
  lengthTag_.reset();
  hexTag_.reset();
  acknowledgeTag_.reset();
  tokenTag_.reset();
  roomCharacters_ = 0;
}

bool TokenReader::ReadNumber(const HostTag& tag, unsigned int* value) {
  if (tag.ReadNumber(value)) {
    return true;
  }
  error_ = tag.Error();
  return false;
}

bool TokenReader::CountWaiting(unsigned int* count) {
  return Prepare() && ReadNumber(*availableTag_, count);
}

// A tag of string-N reads texts of up to N - 1 characters.
bool TokenReader::MakeRoom(unsigned int lengthCharacters) {
  unsigned int room = roomCharacters_ == 0 ? kFirstRoomCharacters : roomCharacters_;
  while (room < lengthCharacters) {
    room = room * 2 + 1;
  }
  if (room != roomCharacters_) {
    tokenTag_ = MakeTag("0?rx_token?string-" + std::to_string(room + 1));
    roomCharacters_ = tokenTag_ == nullptr ? 0 : room;
  }
  return tokenTag_ != nullptr;
}

// Reads length and text of the same token. A full queue may drop its oldest token in between, so
// the length is asked for again and both are read anew when it has changed.
bool TokenReader::ReadStable(std::string* text, unsigned int* length) {
  for (int attempt = 0; attempt < kAttempts; ++attempt) {
    unsigned int before = 0;
    unsigned int after = 0;
    if (!ReadNumber(*lengthTag_, &before) || !MakeRoom(before)) {
      return false;
    }
    const bool isRead = tokenTag_->ReadText(text);
    if (!isRead) {
      error_ = tokenTag_->Error();
    }
    if (!ReadNumber(*lengthTag_, &after)) {
      return false;
    }
    if (before != after) {
      continue;
    }
    *length = after;
    return isRead;
  }
  return false;
}

bool TokenReader::ReadHexMode(bool* isHex) {
  unsigned int number = 0;
  if (!hexMode_ && !ReadNumber(*hexTag_, &number)) {
    return false;
  }
  *isHex = hexMode_.value_or(number != 0);
  return true;
}

TokenReader::Outcome TokenReader::Peek(ReceivedToken* token) {
  unsigned int waiting = 0;
  if (!CountWaiting(&waiting)) {
    return Outcome::kFailed;
  }
  if (waiting == 0) {
    return Outcome::kEmpty;
  }
  bool isHex = false;
  std::string text;
  unsigned int length = 0;
  if (!ReadHexMode(&isHex) || !ReadStable(&text, &length)) {
    return Outcome::kFailed;
  }
  token->isCut = text.size() < length;
  token->lengthBytes = length;
  // A token that was queued before hex mode was switched on is still plain.
  if (isHex && !token->isCut && ParseHexBytes(text, &token->bytes)) {
    token->lengthBytes = static_cast<unsigned int>(token->bytes.size());
  } else {
    token->bytes = text;
  }
  return Outcome::kToken;
}

TokenReader::Outcome TokenReader::Take(ReceivedToken* token) {
  const Outcome outcome = Peek(token);
  if (outcome == Outcome::kToken && !Acknowledge()) {
    return Outcome::kFailed;
  }
  return outcome;
}

bool TokenReader::Acknowledge() {
  if (!Prepare()) {
    return false;
  }
  if (!acknowledgeTag_->WriteNumber(1)) {
    error_ = acknowledgeTag_->Error();
    return false;
  }
  return true;
}
