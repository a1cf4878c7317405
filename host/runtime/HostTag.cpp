// SPDX-License-Identifier: Apache-2.0
#include "host/runtime/HostTag.h"

#include <cstdint>
#include <cstring>
#include <vector>

#include "host/store/StorageBatch.h"
#include "interfaces/IProtocol.h"
#include "interfaces/ITag.h"

namespace {

std::size_t ValueBytes(const ITag* tag) {
  return static_cast<std::size_t>(tag->GetVarLength() > 0 ? tag->GetVarLength() : 0);
}

}  // namespace

HostTag::HostTag(IProtocol* protocol, ITag* tag, SqliteStorage* storage)
    : protocol_(protocol), tag_(tag), storage_(storage) {}

HostTag::~HostTag() { protocol_->FreeTag(tag_); }

bool HostTag::ReadNumber(unsigned int* value) const {
  std::uint32_t number = 0;
  if (ValueBytes(tag_) == 1) {
    unsigned char byte = 0;
    if (protocol_->Read(tag_, &byte) == 0) {
      return false;
    }
    number = byte;
  } else if (ValueBytes(tag_) == sizeof number) {
    unsigned char bytes[sizeof number] = {};
    if (protocol_->Read(tag_, bytes) == 0) {
      return false;
    }
    std::memcpy(&number, bytes, sizeof number);
  } else {
    return false;
  }
  *value = number;
  return true;
}

bool HostTag::WriteNumber(unsigned int value) {
  const std::uint32_t number = value;
  if (ValueBytes(tag_) == 1) {
    return Write(std::string(1, static_cast<char>(static_cast<unsigned char>(value))));
  }
  std::string bytes(sizeof number, '\0');
  std::memcpy(bytes.data(), &number, sizeof number);
  return ValueBytes(tag_) == sizeof number && Write(bytes);
}

bool HostTag::ReadText(std::string* text) const {
  // The driver ends a text with a zero byte within the tag; the byte more holds in any case.
  std::vector<unsigned char> value(ValueBytes(tag_) + 1, 0);
  if (protocol_->Read(tag_, value.data()) == 0) {
    return false;
  }
  value.back() = 0;
  std::size_t length = 0;
  while (value[length] != 0) {
    ++length;
  }
  text->assign(value.begin(), value.begin() + static_cast<std::ptrdiff_t>(length));
  return true;
}

bool HostTag::WriteText(const std::string& text) {
  if (text.size() >= ValueBytes(tag_) || text.find('\0') != std::string::npos) {
    return false;
  }
  std::string value = text;
  value.resize(ValueBytes(tag_), '\0');
  return Write(value);
}

bool HostTag::ReadBytes(std::string* bytes) const {
  std::vector<unsigned char> value(ValueBytes(tag_) + 1, 0);
  if (protocol_->Read(tag_, value.data()) == 0) {
    return false;
  }
  bytes->assign(value.begin(), value.end() - 1);
  return true;
}

bool HostTag::WriteBytes(const std::string& bytes) {
  return bytes.size() == ValueBytes(tag_) && Write(bytes);
}

bool HostTag::Write(const std::string& value) {
  const std::vector<unsigned char> bytes(value.begin(), value.end());
  storeError_.clear();
  // Ends after the driver has let its semaphore go; only then is the disk touched. A failure to
  // store is told by the storage itself and does not undo what the driver did.
  StorageBatch batch(storage_);
  const bool isWritten = protocol_->Write(tag_, bytes.data()) != 0;
  (void)batch.End(&storeError_);
  return isWritten;
}

int HostTag::ErrorCode() const { return protocol_->GetLastError(); }

std::string HostTag::Error() const {
  const char* const text = protocol_->GetLastErrorString();
  return text == nullptr ? "" : text;
}
