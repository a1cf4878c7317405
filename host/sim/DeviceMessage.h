// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

// What a device puts around each message; empty: nothing.
struct DeviceFraming {
  std::string prefix;
  std::string suffix;
};

// One message that a device wants to send, before any fault.
struct DeviceMessage {
  std::string what;  // "weight", "code", "reply", "echo" and the like, for reports
  DeviceFraming framing;
  std::string body;
  // Not a message of its own (the echo of a modem): no fault changes it and no count includes it.
  bool isVerbatim = false;
};

// Something complete that a device has received.
struct DeviceInput {
  std::string what;   // what the device takes it for, "weight request", "label", "ignored"
  std::string bytes;  // without the end that was recognised, except for labels
};

// What received bytes come to.
struct DeviceAnswer {
  std::vector<DeviceInput> received;
  std::vector<DeviceMessage> replies;
};
