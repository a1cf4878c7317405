// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

class IProtocol;
class ITag;
class SqliteStorage;

// One tag of a running protocol with its value as a number or a text. Each write is one batch of
// the storage. Reads: any thread; writes: one thread at a time; a tag's end: when nobody uses it.
class HostTag {
 public:
  // Takes over a tag that IProtocol::CreateTag returned. The storage may be null.
  HostTag(IProtocol* protocol, ITag* tag, SqliteStorage* storage);
  ~HostTag();

  HostTag(const HostTag&) = delete;
  HostTag& operator=(const HostTag&) = delete;

  // All four: false when the driver refuses; Error says why.

  // For tags of type boolean, unsignedByte and unsignedInt.
  bool ReadNumber(unsigned int* value) const;
  bool WriteNumber(unsigned int value);

  // For tags of type string-N: the bytes in front of the first zero byte.
  bool ReadText(std::string* text) const;
  // Fails without asking the driver when the text has no room in the tag with its zero byte or
  // holds a zero byte.
  bool WriteText(const std::string& text);

  // For tags of every type: the host value as it stands, GetVarLength bytes.
  bool ReadBytes(std::string* bytes) const;
  // Fails without asking the driver for any other number of bytes.
  bool WriteBytes(const std::string& bytes);

  const ITag& Tag() const { return *tag_; }

  // The driver's error text, as it stands. Empty for refusals that the driver does not explain.
  std::string Error() const;

  // The driver's number for the same; it stays, too, when a refusal is not explained.
  int ErrorCode() const;

  // Why what the last write stored could not be kept on disk; empty when it could.
  const std::string& StoreError() const { return storeError_; }

 private:
  bool ReadValue(std::string* value) const;
  bool Write(const std::string& value);
  bool Write(const unsigned char* value);

  IProtocol* const protocol_;
  ITag* const tag_;
  SqliteStorage* const storage_;
  std::string storeError_;
};
