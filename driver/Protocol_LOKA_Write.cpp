// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cstring>

#include "driver/BlockAccess.h"
#include "driver/HexText.h"
#include "driver/ParameterNames.h"
#include "driver/Protocol_LOKA.h"
#include "driver/Tag_LOKA.h"
#include "driver/Texts_LOKA.h"
#include "model/MemoryType.h"
#include "protlib/SemaphoreLock.h"
#include "protlib/WorkBuffer.h"

namespace {

// Zero bytes behind the value in the work buffer: they end every text and let a number be read from
// any place.
constexpr int kZeroTailBytes = 8;

int IntegerIn(const unsigned char* data) {
  int value = 0;
  std::memcpy(&value, data, sizeof value);
  return value;
}

const char* TextIn(const unsigned char* data) { return reinterpret_cast<const char*>(data); }

}  // namespace

int Protocol_LOKA::Write(const ITag* tag, const unsigned char* value) {
  if (!started_) {
    SetError(kNotPossibleNow, Texts_LOKA::kNotStarted);
    return 0;
  }
  if (tag == nullptr || value == nullptr) {
    SetArgumentError();
    return 0;
  }
  const auto& ours = *static_cast<const Tag_LOKA*>(tag);
  if (ours.GetMemoryType().isReadOnly()) {
    SetError(kGeneralError, Texts_LOKA::kReadOnly);
    return 0;
  }
  return Guarded(0, [&] { return WriteItems(ours, value); });
}

int Protocol_LOKA::WriteItems(const Tag_LOKA& tag, const unsigned char* value) {
  constexpr std::size_t kStackBytes = 128;
  const BlockAccess access = BlockAccess::ForWrite(tag);
  if (access.index + access.items > tag.GetMemoryType().getMaxIndex()) {
    SetError(kGeneralError, Texts_LOKA::kBehindEnd);
    return 0;
  }
  const long long bufferBytes = static_cast<long long>(tag.PackedLen()) + kZeroTailBytes;
  WorkBuffer<kStackBytes> work(bufferBytes);
  if (!work.IsValid()) {
    SetMemoryError();
    return 0;
  }
  if (!ReadCoveredItems(tag, access, work.Data(), static_cast<std::size_t>(bufferBytes))) {
    return 0;
  }
  if (!tag.ConvertVariable(value, work.Data() + access.skip, true)) {
    SetError(kConversionError, Texts_LOKA::kWriteConversion);
    return 0;
  }
  const long long chunk = std::max(1, tag.GetMemoryType().getBlockWriteCount());
  long long index = access.index;
  long long position = 0;
  for (long long left = access.items; left > 0;) {
    const long long count = std::min(left, chunk);
    if (!doWrite(tag, work.Data() + position)) {
      return 0;
    }
    position += access.Advance(index, count);
    index += count;
    left -= count;
  }
  return 1;
}

// Where the value covers its first or last item only partly, the rest of that item keeps its value.
bool Protocol_LOKA::ReadCoveredItems(const Tag_LOKA& tag, const BlockAccess& access,
                                     unsigned char* buffer, std::size_t bufferBytes) {
  constexpr long long kMostItemsReadAtOnce = 10;
  const long long packedBytes = tag.PackedLen();
  if (access.skip == 0 && access.bytes == packedBytes) {
    return true;
  }
  const ReadTarget firstItem(buffer, bufferBytes);
  if (access.items <= kMostItemsReadAtOnce &&
      access.items < tag.GetMemoryType().getBlockReadCount()) {
    return doReadBlock(tag, firstItem);
  }
  if (access.skip != 0 && !doReadBlock(tag, firstItem)) {
    return false;
  }
  if (access.items < 2 || (access.skip + packedBytes) % access.itemBytes == 0) {
    return true;
  }
  const auto lastOffset = static_cast<std::size_t>((access.items - 1) * access.itemBytes);
  return doReadBlock(tag, ReadTarget(buffer + lastOffset, bufferBytes - lastOffset));
}

bool Protocol_LOKA::doWrite(const Tag_LOKA& tag, const unsigned char* data) {
  if (tag.IsSerialParam()) {
    return WriteSerialParam(tag, data);
  }
  const SemaphoreLock lock(queueSemaphore_, LockRank::kQueueSemaphore);
  return WriteTokenType(tag, data);
}

// Stages one serial setting, without a semaphore; only applying them takes one. A parity, data
// bits, stop bits or mode out of range fails without an error text: hosts rely on that.
bool Protocol_LOKA::WriteSerialParam(const Tag_LOKA& tag, const unsigned char* data) {
  const int intValue = IntegerIn(data);
  const int byteValue = data[0];
  const char* const text = TextIn(data);
  switch (tag.Id()) {
    case MemoryTypeId::kBaud:
      if (!IsListedBaudrate(intValue)) {
        SetError(kGeneralError, Texts_LOKA::kBadBaudrate);
        return false;
      }
      return StageInteger(ParameterNames::kBaud, intValue, true);
    case MemoryTypeId::kBits:
      return StageInteger(ParameterNames::kBits, byteValue, IsDataBits(byteValue));
    case MemoryTypeId::kStop:
      return StageInteger(ParameterNames::kStop, byteValue, IsStopBits(byteValue));
    case MemoryTypeId::kParity:
      return StageInteger(ParameterNames::kParity, byteValue, IsParityCode(byteValue));
    case MemoryTypeId::kMode:
      return StageInteger(ParameterNames::kMode, byteValue, IsSettableMode(byteValue));
    case MemoryTypeId::kRxPrefix:
      return StageFramingText(ParameterNames::kRxPrefix, text, Texts_LOKA::kRxPrefixNotHex);
    case MemoryTypeId::kRxSuffix:
      return StageFramingText(ParameterNames::kRxSuffix, text, Texts_LOKA::kRxSuffixNotHex);
    case MemoryTypeId::kTxPrefix:
      return StageFramingText(ParameterNames::kTxPrefix, text, Texts_LOKA::kTxPrefixNotHex);
    case MemoryTypeId::kTxSuffix:
      return StageFramingText(ParameterNames::kTxSuffix, text, Texts_LOKA::kTxSuffixNotHex);
    case MemoryTypeId::kGap:
      return StageInteger(ParameterNames::kGap, intValue, true);
    case MemoryTypeId::kHexTokens:
      staged_.set(ParameterNames::kHexTokens, kNoNode, byteValue != 0);
      return true;
    case MemoryTypeId::kTokenQueueSize:
      return StageInteger(ParameterNames::kTokenQueueSize, intValue, true);
    case MemoryTypeId::kDone:
      return ApplyStagedSettings();
    default:
      return true;
  }
}

bool Protocol_LOKA::StageInteger(const char* name, int value, bool isAllowed) {
  if (isAllowed) {
    staged_.set(name, kNoNode, value);
  }
  return isAllowed;
}

bool Protocol_LOKA::StageFramingText(const char* name, const char* text, const char* notHex) {
  if (!isHex(text)) {
    SetError(kGeneralError, notHex);
    return false;
  }
  staged_.set(name, kNoNode, text);
  return true;
}

// Makes the staged settings the active ones, stores them and runs with them. The port is set up
// again only when one of its five settings has changed; the tokens that wait are dropped.
bool Protocol_LOKA::ApplyStagedSettings() {
  const SemaphoreLock lock(queueSemaphore_, LockRank::kQueueSemaphore);
  // A snapshot: what another thread stages meanwhile waits for the next time.
  const GroupParameterReplacer staged(staged_);
  staged.activate(active_, kNoNode, true);
  ApplySerialSettings(staged);
  ApplyTokenSettings(staged);
  tokens_.Clear();
  return true;
}

void Protocol_LOKA::ApplySerialSettings(const GroupParameterReplacer& staged) {
  const SerialSettings running = settings_.Serial();
  SerialSettings next;
  next.baudrate = StagedOrActive(staged, ParameterNames::kBaud, running.baudrate);
  next.parity = StagedOrActive(staged, ParameterNames::kParity, running.parity);
  // The stop bits as the fallback are meant: they only show when no data bits were ever looked up.
  next.dataBits = StagedOrActive(staged, ParameterNames::kBits, running.stopBits);
  next.stopBits = StagedOrActive(staged, ParameterNames::kStop, running.stopBits);
  next.mode = StagedOrActive(staged, ParameterNames::kMode, running.mode);
  if (next == running) {
    return;
  }
  settings_.SetSerial(next);
  link_.Setup(next);
}

void Protocol_LOKA::ApplyTokenSettings(const GroupParameterReplacer& staged) {
  const auto applyText = [&](const char* name, FramingText which) {
    settings_.SetText(which, StagedOrActive(staged, name, settings_.Text(which)));
  };
  applyText(ParameterNames::kRxPrefix, FramingText::kRxPrefix);
  applyText(ParameterNames::kRxSuffix, FramingText::kRxSuffix);
  applyText(ParameterNames::kTxPrefix, FramingText::kTxPrefix);
  applyText(ParameterNames::kTxSuffix, FramingText::kTxSuffix);
  settings_.SetGapMs(StagedOrActive(staged, ParameterNames::kGap, settings_.GapMs()));
  settings_.SetHexTokens(StagedOrActive(staged, ParameterNames::kHexTokens, settings_.HexTokens()));
  settings_.SetTokenQueueSize(
      StagedOrActive(staged, ParameterNames::kTokenQueueSize, settings_.TokenQueueSize()));
}

// Tokens and connection. The caller holds the queue semaphore.
bool Protocol_LOKA::WriteTokenType(const Tag_LOKA& tag, const unsigned char* data) {
  switch (tag.Id()) {
    case MemoryTypeId::kTokenAck:
      tokens_.PopFront();
      return true;
    case MemoryTypeId::kConnect:
      return WriteConnect(data);
    case MemoryTypeId::kTxToken:
      return SendToken(TextIn(data));
    default:
      SetError(kGeneralError, Texts_LOKA::kIllegalWrite);
      return false;
  }
}

// Opens or closes the port. A request for the state that is there already is taken as a token to
// send, with the written bytes as its text: hosts rely on that.
bool Protocol_LOKA::WriteConnect(const unsigned char* data) {
  const bool wantsConnection = data[0] != 0;
  if (wantsConnection == link_.IsConnected()) {
    return SendToken(TextIn(data));
  }
  if (wantsConnection) {
    return OpenPortUnderSemaphore();
  }
  ClosePortUnderSemaphore();
  return true;
}

bool Protocol_LOKA::SendToken(const std::string& text) {
  switch (TrySend(text)) {
    case SendResult::kNotHex:
      SetError(kGeneralError, Texts_LOKA::kTokenNotHex);
      return false;
    case SendResult::kNotActive:
      SetError(kGeneralError, Texts_LOKA::kNotActive);
      return false;
    case SendResult::kSent:
      break;
  }
  return true;
}

// Frames the token and hands it to the port; the port's own result does not matter.
Protocol_LOKA::SendResult Protocol_LOKA::TrySend(const std::string& text) {
  const bool hexTokens = settings_.HexTokens();
  if (hexTokens && !isHex(text.c_str())) {
    return SendResult::kNotHex;
  }
  if (!link_.IsConnected() || !link_.Send(FrameForSending(text, hexTokens))) {
    return SendResult::kNotActive;
  }
  return SendResult::kSent;
}

std::string Protocol_LOKA::FrameForSending(const std::string& text, bool hexTokens) const {
  return fromHex(settings_.Text(FramingText::kTxPrefix)) + (hexTokens ? fromHex(text) : text) +
         fromHex(settings_.Text(FramingText::kTxSuffix));
}
