// SPDX-License-Identifier: Apache-2.0
#include "host/runtime/HostTag.h"

#include <cstdint>
#include <cstring>

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
  unsigned char bytes[sizeof number] = {};
  if (ValueBytes(tag_) == 1) {
    bytes[0] = static_cast<unsigned char>(value);
    return Write(bytes);
  }
  std::memcpy(bytes, &number, sizeof number);
  return ValueBytes(tag_) == sizeof number && Write(bytes);
}

bool HostTag::ReadText(std::string* text) const {
  if (!ReadValue(text)) {
    return false;
  }
  text->resize(std::strlen(text->c_str()));
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

bool HostTag::ReadBytes(std::string* bytes) const { return ReadValue(bytes); }

// Reads into the text's own memory, so that reading again needs none.
bool HostTag::ReadValue(std::string* value) const {
  value->assign(ValueBytes(tag_), '\0');
  if (protocol_->Read(tag_, reinterpret_cast<unsigned char*>(value->data())) == 0) {
    value->clear();
    return false;
  }
  return true;
}

bool HostTag::WriteBytes(const std::string& bytes) {
  return bytes.size() == ValueBytes(tag_) && Write(bytes);
}

bool HostTag::Write(const std::string& value) {
  return Write(reinterpret_cast<const unsigned char*>(value.data()));
}

bool HostTag::Write(const unsigned char* value) {
  storeError_.clear();
  // Ends after the driver has let its semaphore go; only then is the disk touched. A failure to
  // store is told by the storage itself and does not undo what the driver did.
  StorageBatch batch(storage_);
  const bool isWritten = protocol_->Write(tag_, value) != 0;
  (void)batch.End(&storeError_);
  return isWritten;
}

int HostTag::ErrorCode() const { return protocol_->GetLastError(); }

std::string HostTag::Error() const {
  const char* const text = protocol_->GetLastErrorString();
  return text == nullptr ? "" : text;
}
