// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace CLI {
class App;
}

struct DemoOptions {
  std::string pluginFile;  // --plugin
};

void AddDemo(CLI::App* app, DemoOptions* options);

// Shows the driver's whole main job against a simulated device and checks each step of it. Needs no
// hardware and leaves no files. Returns the exit status of the program: 0 when every step was as
// expected, 1 when not, or why the host could not be brought up.
int RunDemo(const DemoOptions& options);

// The simulated device of the demonstration, which it starts as a process of its own.
struct DemoDeviceOptions {};
void AddDemoDevice(CLI::App* app, DemoDeviceOptions* options);
int RunDemoDeviceProcess(const DemoDeviceOptions& options);

// The panel after a restart, which the demonstration starts as a process of its own.
struct DemoRestartedOptions {
  std::string pluginFile;
  std::string portPath;
  std::string storeFile;
};
void AddDemoRestarted(CLI::App* app, DemoRestartedOptions* options);
int RunDemoRestartedProcess(const DemoRestartedOptions& options);
