// SPDX-License-Identifier: Apache-2.0
#include "host/commands/PortsCommand.h"

#include <CLI/CLI.hpp>
#include <cstdio>
#include <vector>

#include "host/base/ExitStatus.h"
#include "host/port/PortList.h"
#include "host/port/PortOptions.h"
#include "host/port/PortReport.h"

namespace {

std::string Footer() {
  std::string text =
      "Example: loka ports -l\n"
      "A port word is com1=PATH (or pty:PATH), with options behind it, the default first:\n";
  for (const std::string& line : DescribePortOptions()) {
    text += "  ," + line + "\n";
  }
  text += "As in: --port com1=/dev/ttyUSB0,flow=rtscts,dtr=off";
  return text;
}

}  // namespace

void AddPorts(CLI::App* app, PortsOptions* options) {
  CLI::App* const ports = app->add_subcommand("ports", "List the serial ports of this machine");
  ports->add_flag("-l,--long", options->isLong, "All that is known, and the word for --port");
  ports->add_flag("-j,--json", options->asJson, "One JSON object a port");
  // For tests, with folders that they have made up; an empty group hides them.
  ports->add_option("--class-folder", options->classFolder)->group("");
  ports->add_option("--device-root", options->deviceRoot)->group("");
  ports->footer(Footer());
}

int RunPorts(const PortsOptions& options) {
  std::vector<ListedPort> ports = ListPorts(options.classFolder, options.deviceRoot);
  FindStates(&ports);
  const std::vector<std::string> lines =
      options.asJson ? PortsAsJson(ports) : DescribePorts(ports, options.isLong);
  for (const std::string& line : lines) {
    (void)std::printf("%s\n", line.c_str());
  }
  if (ports.empty()) {
    (void)std::fprintf(stderr, "loka: no serial port here now; is the adapter plugged in?\n");
  } else if (!options.asJson && !options.isLong) {
    (void)std::fprintf(stderr, "loka: to use the first one: --port com1=%s\n",
                       ports.front().path.c_str());
  }
  return static_cast<int>(ExitStatus::kDone);
}
