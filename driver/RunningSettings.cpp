// SPDX-License-Identifier: Apache-2.0
#include "driver/RunningSettings.h"

#include <utility>

#include "driver/HexText.h"

SerialSettings RunningSettings::Serial() const {
  const LeafLock lock(mutex_);
  return serial_;
}

void RunningSettings::SetSerial(const SerialSettings& serial) {
  const LeafLock lock(mutex_);
  serial_ = serial;
}

std::string RunningSettings::Text(FramingText which) const {
  const LeafLock lock(mutex_);
  return texts_[static_cast<std::size_t>(which)];
}

void RunningSettings::SetText(FramingText which, std::string text) {
  const LeafLock lock(mutex_);
  texts_[static_cast<std::size_t>(which)].swap(text);
  ++rxVersion_;
}

void RunningSettings::UpdateRxFraming(RxFramingSnapshot& snapshot) const {
  if (snapshot.version == rxVersion_) {
    return;
  }
  std::string prefix;
  std::string suffix;
  unsigned int version = 0;
  {
    const LeafLock lock(mutex_);
    prefix = texts_[static_cast<std::size_t>(FramingText::kRxPrefix)];
    suffix = texts_[static_cast<std::size_t>(FramingText::kRxSuffix)];
    version = rxVersion_;
  }
  snapshot.framing = {fromHex(prefix), fromHex(suffix)};
  snapshot.version = version;
}
