// SPDX-License-Identifier: Apache-2.0
#include "driver/Protocol_LOKA.h"
#include "interfaces/IMultiTask2.h"
#include "protlib/SemaphoreLock.h"

namespace {

constexpr int kDefaultGapMs = 500;  // what a gap of 0 stands for
constexpr int kNotConnectedSleepMs = 10;

}  // namespace

void Protocol_LOKA::Task() {
  if (!link_.IsConnected()) {
    multiTask_->Sleep(kNotConnectedSleepMs);
    return;
  }
  // Without memory the pass is dropped; the tokens that are queued stay.
  NoThrow(false, [this] {
    ReceivePass();
    return true;
  });
}

void Protocol_LOKA::ReceivePass() {
  const SerialLink::ReceivePass mark(link_);
  settings_.UpdateRxFraming(rxFraming_);
  const int gapMs = settings_.GapMs();
  const int timeoutMs = gapMs == 0 ? kDefaultGapMs : gapMs;
  framer_.Begin(rxFraming_.framing);
  for (;;) {
    unsigned char byte = 0;
    switch (ReceiveByte(byte, timeoutMs)) {
      case SerialLink::ReceiveResult::kClosed:
        return;
      case SerialLink::ReceiveResult::kTimeout:
        if (framer_.OnSilence()) {
          QueueToken(framer_.Token());
        }
        return;
      case SerialLink::ReceiveResult::kByte:
        break;
    }
    switch (framer_.OnByte(byte)) {
      case TokenFramer::Result::kMore:
        break;
      case TokenFramer::Result::kToken:
        QueueToken(framer_.Token());
        return;
      case TokenFramer::Result::kTokenAndMore:
        QueueToken(framer_.Token());
        break;
      case TokenFramer::Result::kDropped:
        return;
    }
  }
}

SerialLink::ReceiveResult Protocol_LOKA::ReceiveByte(unsigned char& byte, int timeoutMs) {
  const SemaphoreLock lock(portSemaphore_, LockRank::kPortSemaphore);
  return link_.Receive(byte, timeoutMs);
}

void Protocol_LOKA::QueueToken(std::string_view token) {
  const SemaphoreLock lock(queueSemaphore_, LockRank::kQueueSemaphore);
  addToken(token);
}

// The caller holds the queue semaphore.
void Protocol_LOKA::addToken(std::string_view token) {
  if (settings_.HexTokens()) {
    tokens_.PushHex(token, settings_.TokenQueueSize());
  } else {
    tokens_.Push(token, settings_.TokenQueueSize());
  }
}
