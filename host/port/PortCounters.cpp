// SPDX-License-Identifier: Apache-2.0
#include "host/port/PortCounters.h"

LineErrors& operator+=(LineErrors& sum, const LineErrors& more) {
  sum.areKnown = sum.areKnown || more.areKnown;
  sum.framing += more.framing;
  sum.parity += more.parity;
  sum.overruns += more.overruns;
  sum.breaks += more.breaks;
  sum.bufferOverruns += more.bufferOverruns;
  return sum;
}

PortCounters& operator+=(PortCounters& sum, const PortCounters& more) {
  sum.receivedBytes += more.receivedBytes;
  sum.servedBytes += more.servedBytes;
  sum.sentBytes += more.sentBytes;
  sum.sends += more.sends;
  sum.lostSends += more.lostSends;
  sum.lostSendBytes += more.lostSendBytes;
  sum.lostBytes += more.lostBytes;
  sum.losses += more.losses;
  sum.reconnects += more.reconnects;
  sum.lostMs += more.lostMs;
  sum.echoBytes += more.echoBytes;
  sum.echoMismatches += more.echoMismatches;
  sum.lineErrors += more.lineErrors;
  return sum;
}
