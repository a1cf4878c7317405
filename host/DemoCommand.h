// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

// Shows the driver's whole main job against a simulated device and checks each step of it. Needs no
// hardware and leaves no files. `pluginFile` is as on the command line. Returns the exit status of
// the program: 0 when every step was as expected, 1 when not, or why the host could not be brought
// up.
int RunDemo(const std::string& pluginFile);
