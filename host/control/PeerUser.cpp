// SPDX-License-Identifier: Apache-2.0
#include "host/control/PeerUser.h"

#include <sys/socket.h>
#include <unistd.h>

bool IsPeerTrusted(int descriptor) {
  ucred peer{};
  socklen_t length = sizeof peer;
  return getsockopt(descriptor, SOL_SOCKET, SO_PEERCRED, &peer, &length) == 0 &&
         (peer.uid == geteuid() || peer.uid == 0);
}
