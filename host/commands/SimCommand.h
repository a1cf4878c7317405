// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "host/sim/SimOptions.h"

namespace CLI {
class App;
}

// Adds the command "sim" with one command below it for each device. Parsing fills `options`, which
// must outlive the application object. Main thread.
void AddSim(CLI::App* app, SimOptions* options);
