// SPDX-License-Identifier: Apache-2.0
#include "host/framing/ByteRole.h"

const char* NameOf(ByteRole role) {
  switch (role) {
    case ByteRole::kPrefix:
      return "prefix";
    case ByteRole::kBody:
      return "body";
    case ByteRole::kSuffix:
      return "suffix";
    case ByteRole::kDropped:
      break;
  }
  return "dropped";
}

const char* NameOf(DropReason reason) {
  switch (reason) {
    case DropReason::kNoPrefix:
      return "no-prefix";
    case DropReason::kPrefixRestart:
      return "prefix-restart";
    case DropReason::kPartialPrefix:
      return "partial-prefix";
    case DropReason::kNoBody:
      return "no-body";
    case DropReason::kNoSuffix:
      return "no-suffix";
    case DropReason::kOver1000:
      return "over-1000";
    case DropReason::kDisconnected:
      return "disconnected";
    case DropReason::kQueueFull:
      return "queue-full";
    case DropReason::kNone:
      break;
  }
  return "";
}

const char* HintFor(DropReason reason) {
  switch (reason) {
    case DropReason::kNoPrefix:
      return "bytes in front of the prefix never belong to a token";
    case DropReason::kPrefixRestart:
      return "a byte that breaks the prefix off starts the search again at that byte";
    case DropReason::kPartialPrefix:
      return "a silence as long as the gap ends the prefix too; a longer --gap allows pauses in it";
    case DropReason::kNoBody:
      return "a prefix with nothing behind it is no token";
    case DropReason::kNoSuffix:
      return "a silence as long as the gap ends suffix framing too; a longer --gap allows slow or "
             "typed lines";
    case DropReason::kOver1000:
      return "a token has at most 1000 bytes with its framing; is the suffix the one the device "
             "sends?";
    case DropReason::kDisconnected:
      return "closing the port drops what has not become a token yet";
    case DropReason::kQueueFull:
      return "the oldest token makes room when the queue is full; read faster or raise --queue";
    case DropReason::kNone:
      break;
  }
  return "";
}
