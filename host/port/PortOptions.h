// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

// How one port is to be opened and used: the path of a port word and the options behind it.
struct PortOptions {
  enum class Flow { kNone, kRtsCts, kXonXoff };
  enum class Level { kKeep, kOn, kOff };
  enum class Rs485 { kAuto, kIoctl, kRts, kOff };

  std::string path;
  Flow flow = Flow::kNone;
  Level dtr = Level::kKeep;
  Level rts = Level::kKeep;
  Rs485 rs485 = Rs485::kAuto;
  bool stripsEcho = false;
  bool flushesOnOpen = false;
  int txDelayMs = 0;  // between two bytes of a send
  bool isLowLatency = true;
  Level hupcl = Level::kKeep;
  bool reconnects = true;

  // All defaults.
  static PortOptions For(const std::string& path);
};

// Reads "PATH[,NAME=VALUE]..." where PATH may have "pty:" in front. False, with a reason that names
// the option and what it takes, when there is no path, an option is unknown, given twice or has
// another value, or two options contradict each other. Any thread.
bool ParsePortOptions(const std::string& text, PortOptions* options, std::string* error);

// One option as help, manual page and documents show it. The first value is the default.
struct PortOptionEntry {
  const char* name;
  const char* values;  // "none|rtscts|xonxoff"
  const char* help;
};

// All options, in the order in which they are documented.
const std::vector<PortOptionEntry>& PortOptionTable();

// The table as lines for a help text, two columns.
std::vector<std::string> DescribePortOptions();
