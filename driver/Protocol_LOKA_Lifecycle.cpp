// SPDX-License-Identifier: Apache-2.0
#include "driver/ParameterNames.h"
#include "driver/Protocol_LOKA.h"
#include "driver/Texts_LOKA.h"
#include "protlib/SemaphoreLock.h"

namespace {

// Turns the words for parity and mode into codes. Returns what is wrong with the first bad one,
// which stays as it was with everything behind it; or null.
const char* MapWords(const _LOKA::CommonParams& common, SerialSettings& serial) {
  const std::optional<int> parity = ParityFromConfig(common.parity);
  if (!parity) {
    return Texts_LOKA::kBadParity;
  }
  serial.parity = *parity;
  const std::optional<int> mode = ModeFromConfig(common.mode);
  if (!mode) {
    return Texts_LOKA::kBadMode;
  }
  serial.mode = *mode;
  return nullptr;
}

}  // namespace

int Protocol_LOKA::Config(const char* configuration) {
  return Guarded(0, [&] {
    if (!params_.parse(configuration == nullptr ? "" : configuration)) {
      SetError(kGeneralError, params_.getLastError());
      return 0;
    }
    const _LOKA::CommonParams& common = *params_.getCommonParams();
    portName_ = common.port;
    SerialSettings serial = settings_.Serial();
    serial.baudrate = common.baudrate;
    serial.dataBits = common.bits;
    serial.stopBits = common.stopbits;
    const char* const problem = MapWords(common, serial);
    settings_.SetSerial(serial);
    if (problem != nullptr) {
      SetError(kGeneralError, problem);
      return 0;
    }
    return 1;
  });
}

// The settings to run with: the overrides that were activated before, in this run or an earlier
// one, and the configured values where there is none.
void Protocol_LOKA::LoadSettings() {
  const _LOKA::CommonParams& common = *params_.getCommonParams();
  active_.setIdent(GetIdent());

  SerialSettings serial = settings_.Serial();
  active_.get(ParameterNames::kBaud, kNoNode, serial.baudrate, serial.baudrate);
  active_.get(ParameterNames::kParity, kNoNode, serial.parity, serial.parity);
  active_.get(ParameterNames::kBits, kNoNode, serial.dataBits, serial.dataBits);
  active_.get(ParameterNames::kStop, kNoNode, serial.stopBits, serial.stopBits);
  active_.get(ParameterNames::kMode, kNoNode, serial.mode, serial.mode);
  settings_.SetSerial(serial);

  const auto loadText = [this](const char* name, const std::string& configured, FramingText which) {
    std::string text;
    active_.get(name, kNoNode, configured, text);
    settings_.SetText(which, text);
  };
  loadText(ParameterNames::kRxPrefix, common.rx_prefix, FramingText::kRxPrefix);
  loadText(ParameterNames::kRxSuffix, common.rx_suffix, FramingText::kRxSuffix);
  loadText(ParameterNames::kTxPrefix, common.tx_prefix, FramingText::kTxPrefix);
  loadText(ParameterNames::kTxSuffix, common.tx_suffix, FramingText::kTxSuffix);

  int gapMs = 0;
  active_.get(ParameterNames::kGap, kNoNode, common.gap, gapMs);
  settings_.SetGapMs(gapMs);
  bool hexTokens = false;
  active_.get(ParameterNames::kHexTokens, kNoNode, common.hex_tokens, hexTokens);
  settings_.SetHexTokens(hexTokens);
  int queueSize = 0;
  active_.get(ParameterNames::kTokenQueueSize, kNoNode, common.token_queue_size, queueSize);
  settings_.SetTokenQueueSize(queueSize);
}

bool Protocol_LOKA::OpenPort() {
  if (link_.Open(portName_, settings_.Serial())) {
    return true;
  }
  SetError(kGeneralError, Texts_LOKA::kCannotOpenPort);
  return false;
}

bool Protocol_LOKA::OpenPortUnderSemaphore() {
  const SemaphoreLock lock(portSemaphore_, LockRank::kPortSemaphore);
  return OpenPort();
}

void Protocol_LOKA::ClosePortUnderSemaphore() {
  const SemaphoreLock lock(portSemaphore_, LockRank::kPortSemaphore);
  if (portSemaphore_ != nullptr) {
    link_.Close();
  } else {
    link_.CloseWithoutSemaphore();
  }
}

int Protocol_LOKA::Start() {
  const LockOrderScope order(LockRank::kLife);
  const std::lock_guard<std::mutex> lock(lifeMutex_);
  if (started_) {
    return 1;
  }
  return Guarded(0, [this] {
    LoadSettings();
    if (params_.getCommonParams()->autoConnect) {
      // The console may have opened it before, with what was configured then.
      link_.CloseWithoutSemaphore();
      if (!OpenPort()) {
        return 0;
      }
    }
    taskRunner_.Start();
    started_ = true;
    return 1;
  });
}

int Protocol_LOKA::Stop() {
  const LockOrderScope order(LockRank::kLife);
  const std::lock_guard<std::mutex> lock(lifeMutex_);
  if (started_) {
    taskRunner_.Stop();
    link_.CloseWithoutSemaphore();
    started_ = false;
  }
  return 1;
}
