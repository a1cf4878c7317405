// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "host/runtime/Console.h"

class HostSession;

// The console of a session that is open, started or not.
class SessionConsole final : public Console {
 public:
  // Bytes that a reply may have. A tag's value takes two for each of its bytes; the longest tags
  // that the driver fills have 9999.
  static constexpr int kMaxReplyBytes = 1024 * 1024;

  // The session must outlive this object.
  explicit SessionConsole(HostSession* session) : session_(session) {}

  // What the command stores is one batch of the storage.
  ConsoleReply Run(const std::string& line) override;

 private:
  HostSession* const session_;
};
