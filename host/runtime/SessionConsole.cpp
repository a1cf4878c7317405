// SPDX-License-Identifier: Apache-2.0
#include "host/runtime/SessionConsole.h"

#include <vector>

#include "host/runtime/HostSession.h"
#include "host/store/StorageBatch.h"
#include "interfaces/IProtocol.h"

namespace {

// A value that does not fit is cut so that line feed and zero byte still do, at most so far from
// the end.
constexpr std::size_t kCutMarginBytes = 4;

}  // namespace

ConsoleReply SessionConsole::Run(const std::string& line) {
  // All zero: some commands have no reply. The byte more ends a reply that fills all the others.
  std::vector<char> buffer(kMaxReplyBytes + 1, '\0');
  ConsoleReply reply;
  {
    const StorageBatch batch(session_->Storage());
    reply.isDone = session_->Protocol()->DoCommand(line.c_str(), buffer.data(), kMaxReplyBytes);
  }
  reply.text = buffer.data();
  reply.isCut = reply.text.size() + kCutMarginBytes > kMaxReplyBytes;
  return reply;
}
