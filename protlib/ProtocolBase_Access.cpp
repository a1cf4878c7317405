// SPDX-License-Identifier: Apache-2.0
#include <cstring>
#include <limits>

#include "interfaces/ITag.h"
#include "protlib/ProtUtilsN.h"
#include "protlib/ProtocolBase.h"
#include "protlib/SystemClock.h"
#include "protlib/WorkBuffer.h"

namespace {

constexpr idal_error_t kTagRead = 1;

// Stamps a successful read; a failed one leaves the time stamp as it was.
int Stamped(int result, unsigned long long* timestampMs) {
  if (result != 0 && timestampMs != nullptr) {
    *timestampMs = currentTimeStamp();
  }
  return result;
}

}  // namespace

int ProtocolBase::Read(const ITag* tag, unsigned char* value) {
  if (tag == nullptr || value == nullptr) {
    SetArgumentError();
    return 0;
  }
  return Guarded(0, [&] {
    constexpr std::size_t kStackBytes = 64;
    const int size = tag->PackedLen();
    WorkBuffer<kStackBytes> image(size);
    if (!image.IsValid()) {
      SetMemoryError();
      return 0;
    }
    int result = 0;
    if (CanReadBitBlock(tag)) {
      const int imageBits = size > std::numeric_limits<int>::max() / 8 ? 0 : size * 8;
      const int bitCount = ProtUtilsN::IsBitType(tag) ? tag->GetVarLength() : imageBits;
      result = ReadBitBlock(tag, image.Data(), bitCount);
    } else {
      result = ReadBlock(tag, image.Data(), size);
    }
    if (result == 0) {
      return 0;
    }
    if (!tag->ConvertVariable(image.Data(), value, false)) {
      SetError(kConversionError, "read conversion error");
      return 0;
    }
    return 1;
  });
}

int ProtocolBase::WriteBlock(const ITag* /*tag*/, const unsigned char* /*buffer*/,
                             int /*lengthBytes*/) {
  SetError(kNotPossibleNow, "Optimized writing not supported");
  return 0;
}

int ProtocolBase::ReadDatagramWithStatus(const ITag* const* tags, int count, unsigned char* buffer,
                                         idal_error_t* status) {
  const int result = ReadDatagram(tags, count, buffer);
  if (result != 0 && status != nullptr) {
    for (int i = 0; i < count; ++i) {
      status[i] = kTagRead;
    }
  }
  return result;
}

int ProtocolBase::readWithTimestamp(const ITag* tag, unsigned char* value,
                                    unsigned long long* timestampMs) {
  return Stamped(Read(tag, value), timestampMs);
}

int ProtocolBase::readBlockWithTimestamp(const ITag* tag, unsigned char* buffer, int lengthBytes,
                                         unsigned long long* timestampMs) {
  return Stamped(ReadBlock(tag, buffer, lengthBytes), timestampMs);
}

int ProtocolBase::readBitBlockWithTimestamp(const ITag* tag, unsigned char* buffer, int bitCount,
                                            unsigned long long* timestampMs) {
  return Stamped(ReadBitBlock(tag, buffer, bitCount), timestampMs);
}

int ProtocolBase::readDatagramWithTimestamp(const ITag* const* tags, int count,
                                            unsigned char* buffer, idal_error_t* status,
                                            unsigned long long* timestampsMs) {
  if (ReadDatagramWithStatus(tags, count, buffer, status) == 0) {
    return 0;
  }
  const unsigned long long now = currentTimeStamp();
  for (int i = 0; timestampsMs != nullptr && i < count; ++i) {
    timestampsMs[i] = now;
  }
  return 1;
}

bool ProtocolBase::FindArrayItem(const ITag* tag, int index) const {
  if (tag->GetItemType() == ICU_NONE) {
    SetError(kGeneralError, "accessing an array item where the tag is not array");
    return false;
  }
  if (index < 0 || index >= ProtUtilsN::GetItemCount(tag)) {
    SetError(kGeneralError, "accessing array item out of range");
    return false;
  }
  return true;
}

// Reads the whole array and hands it, the item's place in it and the item's length to `use`.
template <typename Use>
int ProtocolBase::WithArrayItem(const ITag* tag, int index, Use use) {
  return Guarded(0, [&] {
    if (!FindArrayItem(tag, index)) {
      return 0;
    }
    constexpr std::size_t kStackBytes = 256;
    WorkBuffer<kStackBytes> array(tag->GetVarLength());
    if (!array.IsValid()) {
      SetMemoryError();
      return 0;
    }
    const int result = Read(tag, array.Data());
    if (result == 0) {
      return 0;
    }
    const auto itemBytes = static_cast<std::size_t>(ProtUtilsN::GetBasicLength(tag));
    return use(result, array.Data(), static_cast<std::size_t>(index) * itemBytes, itemBytes);
  });
}

int ProtocolBase::readArrayItem(const ITag* tag, int index, unsigned char* item) {
  if (tag == nullptr || item == nullptr) {
    SetArgumentError();
    return 0;
  }
  return WithArrayItem(
      tag, index,
      [item](int result, const unsigned char* array, std::size_t offset, std::size_t itemBytes) {
        std::memcpy(item, array + offset, itemBytes);
        return result;
      });
}

int ProtocolBase::writeArrayItem(const ITag* tag, int index, const unsigned char* item) {
  if (tag == nullptr || item == nullptr) {
    SetArgumentError();
    return 0;
  }
  return WithArrayItem(tag, index,
                       [this, tag, item](int /*result*/, unsigned char* array, std::size_t offset,
                                         std::size_t itemBytes) {
                         std::memcpy(array + offset, item, itemBytes);
                         return Write(tag, array);
                       });
}
