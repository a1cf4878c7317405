// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cstring>

#include "driver/BlockAccess.h"
#include "driver/ParameterNames.h"
#include "driver/Protocol_LOKA.h"
#include "driver/Tag_LOKA.h"
#include "driver/Texts_LOKA.h"
#include "model/MemoryType.h"
#include "protlib/SemaphoreLock.h"
#include "protlib/WorkBuffer.h"

int Protocol_LOKA::ReadBlock(const ITag* tag, unsigned char* buffer, int lengthBytes) {
  if (!started_) {
    SetError(kNotPossibleNow, Texts_LOKA::kNotStarted);
    return 0;
  }
  if (tag == nullptr || buffer == nullptr || lengthBytes < 0) {
    SetArgumentError();
    return 0;
  }
  return Guarded(
      0, [&] { return ReadItems(*static_cast<const Tag_LOKA*>(tag), buffer, lengthBytes); });
}

// Reads the memory type in blocks. Every block starts with the whole value again: a memory type has
// one value, whatever the index.
int Protocol_LOKA::ReadItems(const Tag_LOKA& tag, unsigned char* buffer, int lengthBytes) {
  constexpr std::size_t kStackBytes = 128;
  const BlockAccess access = BlockAccess::ForRead(tag, lengthBytes);
  WorkBuffer<kStackBytes> work(access.bytes);
  if (!work.IsValid()) {
    SetMemoryError();
    return 0;
  }
  const long long chunk = std::max(1, tag.GetMemoryType().getBlockReadCount());
  long long index = access.index;
  long long position = 0;
  for (long long left = access.items; left > 0;) {
    const long long count = std::min(left, chunk);
    const auto room = static_cast<std::size_t>(access.bytes - position);
    if (!doReadBlock(tag, ReadTarget(work.Data() + position, room))) {
      return 0;
    }
    position += access.Advance(index, count);
    index += count;
    left -= count;
  }
  std::memcpy(buffer, work.Data() + access.skip, static_cast<std::size_t>(lengthBytes));
  return 1;
}

bool Protocol_LOKA::doReadBlock(const Tag_LOKA& tag, ReadTarget target) {
  if (tag.IsSerialParam()) {
    return ReadSerialParam(tag, target);
  }
  const SemaphoreLock lock(queueSemaphore_, LockRank::kQueueSemaphore);
  return ReadTokenType(tag, target);
}

// The serial settings: what is staged, or else what is active. Takes no semaphore.
bool Protocol_LOKA::ReadSerialParam(const Tag_LOKA& tag, ReadTarget target) {
  const SerialSettings running = settings_.Serial();
  const auto value = [this](const char* name, auto runningValue) {
    return StagedOrActive(staged_, name, runningValue);
  };
  switch (tag.Id()) {
    case MemoryTypeId::kBaud:
      target.PutInt32(value(ParameterNames::kBaud, running.baudrate));
      return true;
    case MemoryTypeId::kParity:
      target.PutByte(value(ParameterNames::kParity, running.parity));
      return true;
    case MemoryTypeId::kBits:
      target.PutByte(value(ParameterNames::kBits, running.dataBits));
      return true;
    case MemoryTypeId::kStop:
      target.PutByte(value(ParameterNames::kStop, running.stopBits));
      return true;
    case MemoryTypeId::kMode:
      target.PutByte(value(ParameterNames::kMode, running.mode));
      return true;
    case MemoryTypeId::kRxPrefix:
      return ReadFramingText(tag, target, ParameterNames::kRxPrefix, FramingText::kRxPrefix,
                             Texts_LOKA::kRxPrefixTooLong);
    case MemoryTypeId::kRxSuffix:
      return ReadFramingText(tag, target, ParameterNames::kRxSuffix, FramingText::kRxSuffix,
                             Texts_LOKA::kRxSuffixTooLong);
    case MemoryTypeId::kTxPrefix:
      return ReadFramingText(tag, target, ParameterNames::kTxPrefix, FramingText::kTxPrefix,
                             Texts_LOKA::kTxPrefixTooLong);
    case MemoryTypeId::kTxSuffix:
      return ReadFramingText(tag, target, ParameterNames::kTxSuffix, FramingText::kTxSuffix,
                             Texts_LOKA::kTxSuffixTooLong);
    case MemoryTypeId::kGap:
      target.PutInt32(value(ParameterNames::kGap, settings_.GapMs()));
      return true;
    case MemoryTypeId::kHexTokens:
      target.PutByte(value(ParameterNames::kHexTokens, settings_.HexTokens()) ? 1 : 0);
      return true;
    case MemoryTypeId::kTokenQueueSize:
      target.PutInt32(value(ParameterNames::kTokenQueueSize, settings_.TokenQueueSize()));
      return true;
    case MemoryTypeId::kDone:
      target.PutByte(0);
      return true;
    default:
      return true;
  }
}

bool Protocol_LOKA::ReadFramingText(const Tag_LOKA& tag, ReadTarget target, const char* name,
                                    FramingText which, const char* tooLong) {
  const std::string text = StagedOrActive(staged_, name, settings_.Text(which));
  if (static_cast<long long>(text.size()) >= tag.GetVarLength()) {
    SetError(kGeneralError, tooLong);
    return false;
  }
  target.PutText(text);
  return true;
}

// Tokens and connection. The caller holds the queue semaphore.
bool Protocol_LOKA::ReadTokenType(const Tag_LOKA& tag, ReadTarget target) {
  switch (tag.Id()) {
    case MemoryTypeId::kRxToken:
      return ReadToken(tag, target);
    case MemoryTypeId::kRxTokenLen:
      target.PutInt32(tokens_.FrontLength());
      return true;
    case MemoryTypeId::kTokensAvailable:
      target.PutInt32(tokens_.Count());
      return true;
    case MemoryTypeId::kTokenAck:
    case MemoryTypeId::kTxToken:
      target.PutByte(0);
      return true;
    case MemoryTypeId::kConnect:
      target.PutByte(link_.IsConnected() ? 1 : 0);
      return true;
    default:
      SetError(kGeneralError, Texts_LOKA::kIllegalRead);
      return false;
  }
}

// The oldest token up to its first zero byte; it stays queued. Without a token, an empty text.
bool Protocol_LOKA::ReadToken(const Tag_LOKA& tag, ReadTarget target) {
  const bool fits = tokens_.WithFront([&](const std::string* token) {
    if (token == nullptr) {
      target.PutByte(0);
      return true;
    }
    if (static_cast<long long>(token->size()) >= tag.GetVarLength()) {
      return false;
    }
    target.PutText(*token);
    return true;
  });
  if (!fits) {
    SetError(kGeneralError, Texts_LOKA::kTokenTooLong);
  }
  return fits;
}
