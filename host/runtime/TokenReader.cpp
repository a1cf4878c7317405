// SPDX-License-Identifier: Apache-2.0
#include "host/runtime/TokenReader.h"

#include "host/runtime/HostSession.h"
#include "host/runtime/HostTag.h"
#include "host/text/ByteText.h"

namespace {

// The driver needs no memory of its own for a read up to this length.
constexpr unsigned int kFirstRoomCharacters = 63;
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

// Reads text and length of the same token. A text that is as long as the length belongs to it; when
// it is not, the token has a zero byte in it or the text did not fit the tag, or a full queue has
// dropped its oldest token in between. So both are then read until the length stays the same.
bool TokenReader::ReadStable(std::string* text, unsigned int* length) {
  if (!MakeRoom(0)) {
    return false;
  }
  bool isKnown = false;
  for (int attempt = 0; attempt < kAttempts; ++attempt) {
    const bool isRead = tokenTag_->ReadText(text);
    if (!isRead) {
      error_ = tokenTag_->Error();
    }
    const unsigned int before = *length;
    if (!ReadNumber(*lengthTag_, length)) {
      return false;
    }
    const bool isSettled = isKnown && before == *length;
    if (isRead ? isSettled || text->size() == *length : isSettled && *length <= roomCharacters_) {
      return isRead;
    }
    isKnown = true;
    if (!MakeRoom(*length)) {
      return false;
    }
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
  if (!Prepare()) {
    return Outcome::kFailed;
  }
  bool isHex = false;
  unsigned int length = 0;
  if (!ReadHexMode(&isHex) || !ReadStable(&text_, &length)) {
    return Outcome::kFailed;
  }
  if (length == 0) {
    // No token, an empty one, or one that has come meanwhile.
    unsigned int waiting = 0;
    if (!CountWaiting(&waiting)) {
      return Outcome::kFailed;
    }
    if (waiting == 0) {
      return Outcome::kEmpty;
    }
    if (!ReadStable(&text_, &length)) {
      return Outcome::kFailed;
    }
  }
  token->isCut = text_.size() < length;
  token->lengthBytes = length;
  // A token that was queued before hex mode was switched on is still plain.
  if (isHex && !token->isCut && ParseHexBytes(text_, &token->bytes)) {
    token->lengthBytes = static_cast<unsigned int>(token->bytes.size());
  } else {
    token->bytes = text_;
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
