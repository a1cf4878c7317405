// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>

#include "driver/Protocol_LOKA.h"
#include "tests/support/ScriptedHost.h"

// One driver instance on a scripted host, to try what the manual says.
class DriverInUse {
 public:
  DriverInUse();
  ~DriverInUse();
  DriverInUse(const DriverInUse&) = delete;
  DriverInUse& operator=(const DriverInUse&) = delete;

  Protocol_LOKA& Driver() { return *driver_; }
  ScriptedHost& Host() { return host_; }

  // Configures; the error text when that fails, else the empty text.
  std::string Config(const std::string& text);
  // Configures and starts. False, with the reason as a failure of the running test, when refused.
  bool Start(const std::string& text);

  // Makes a tag; the error text when that fails, else the empty text.
  std::string TagError(const std::string& uri);

  // A console command with its reply, without the line feed at its end.
  std::string Command(const std::string& line, bool& result);

  // The bytes come in without a pause and are followed by a long silence.
  void Receive(const std::string& bytes, const std::string& port);

  // Reads rx_token as text and acknowledges it.
  std::string TakeToken();
  int TokensAvailable();

  // Reads and writes a whole tag, as bytes.
  bool Read(const std::string& uri, std::string& value);
  bool Write(const std::string& uri, std::string value);

 private:
  ScriptedHost host_;
  std::unique_ptr<Protocol_LOKA> driver_;
};

// "02 41" as bytes.
std::string BytesFrom(const std::string& hexDump);
