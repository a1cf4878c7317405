// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <string>

#include "host/framing/FramingSettings.h"

namespace CLI {
class App;
}

// The line and the framing on the command line: -b -p -d -s --mode --rx-prefix --rx-suffix
// --tx-prefix --tx-suffix --gap --hex --queue. What is not given keeps what the configuration says,
// and without a configuration the default of the description document (see ConfigKeys). Texts of
// prefixes and suffixes are those of ParseControlText. A value that cannot be right is a usage
// error. Main thread.
class FramingFlags {
 public:
  FramingFlags() = default;
  ~FramingFlags() = default;

  // The options refer to this object.
  FramingFlags(const FramingFlags&) = delete;
  FramingFlags& operator=(const FramingFlags&) = delete;

  // All of them, for a command that runs or describes a protocol instance.
  void AddAll(CLI::App* command);

  // Only those that decide how received bytes are cut.
  void AddReceiving(CLI::App* command);

  // --port NAME and --auto-connect true|false, for a command that writes configurations. --port
  // takes the name that the driver asks the host for, not a path.
  void AddConfiguring(CLI::App* command);

  // Sets CfgVer, model or autoConnect, which have no option here, unless it was given. False with
  // the reason in `error` for a value that the key does not have.
  bool Preset(const std::string& key, const std::string& value, std::string* error);

  // True when at least one of the options was given.
  bool IsGiven() const { return !given_.empty(); }

  // The configuration with what was given on the command line in it.
  std::string Apply(const std::string& configuration) const;

  // A whole configuration of defaults with what was given. Keys that are not mandatory stand in it
  // only when they were given.
  std::string Configuration() const;

  // What was given, as it stands in a configuration, by its key.
  const std::map<std::string, std::string>& Given() const { return given_; }

 private:
  void AddLine(CLI::App* command);
  void AddSending(CLI::App* command);
  void AddChoice(CLI::App* command, const char* flags, const char* key, const char* typeName,
                 const char* help);
  void AddBytes(CLI::App* command, const char* flags, const char* key, const char* help);

  std::map<std::string, std::string> given_;
};
