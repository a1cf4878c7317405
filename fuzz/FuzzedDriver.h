// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "interfaces/IProtModule.h"
#include "interfaces/IProtocol7.h"
#include "interfaces/IProtocolFactory.h"
#include "interfaces/ITag.h"
#include "tests/support/ScriptedHost.h"

// What one read gave.
struct FuzzedRead {
  int result = 0;
  std::string bytes;
};

// The driver in a scripted host, for one fuzz input. Everything must be given back at the end and
// no rule of the host's objects broken, or the program ends.
class FuzzedDriver {
 public:
  // Longest value that is read or written whole; a host may declare more than memory holds.
  static constexpr int kLongestValueBytes = 1 << 16;

  FuzzedDriver();
  ~FuzzedDriver();
  FuzzedDriver(const FuzzedDriver&) = delete;
  FuzzedDriver& operator=(const FuzzedDriver&) = delete;

  ScriptedHost& Host() { return host_; }
  IProtocol7* operator->() const { return protocol_; }

  // The keys that a configuration must have, for port com1, and more.
  static std::string Config(const std::string& more);

  // Configures and starts; both must succeed.
  void Run(const std::string& more);

  // Runs the receive task until the line has been silent.
  void Receive(const std::string& bytes);

  // Deletes the protocol and makes a new one.
  void Renew();

  // Reads a tag into a buffer of exactly its length; nothing may be written beside it, and nothing
  // at all by a read that fails. Values that are too long are left alone (result 0).
  FuzzedRead Read(const ITag* tag);
  FuzzedRead ReadBlock(const ITag* tag, int lengthBytes);
  // Writes a value, cut or filled with zeros to the tag's length.
  int Write(const ITag* tag, const std::string& value);

  // The same through a tag that lives as long as the call. The URI must be a good one.
  FuzzedRead Read(const std::string& uri);
  int Write(const std::string& uri, const std::string& value);
  int ReadNumber(const std::string& memoryType);

  // One console command with a reply buffer of that many bytes.
  FuzzedRead Command(const std::string& line, int replyBytes = 400);

  // Fails when a semaphore is held while nobody is inside the driver, or a rule was broken.
  void CheckRules();

 private:
  ScriptedHost host_;
  IProtModule* module_ = nullptr;
  IProtocolFactory* protocols_ = nullptr;
  IProtocol7* protocol_ = nullptr;
};
