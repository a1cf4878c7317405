// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "host/sim/SimOptions.h"

// Runs a simulated device on a pseudo-terminal until a signal, a count or a time ends it. The first
// message comes 250 ms after the port was opened for the first time, the others at fixed intervals
// from there, whether somebody listens or not. Nothing a host does or leaves undone makes the
// device wait: what cannot be written is lost and counted. Returns the exit status of the program.
// Main thread, before any other is started.
int RunSim(const SimOptions& options);
