// SPDX-License-Identifier: Apache-2.0
#include "host/commands/DemoCommand.h"

#include <unistd.h>

#include <CLI/CLI.hpp>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <filesystem>
#include <system_error>

#include "host/base/ExitStatus.h"
#include "host/demo/DemoDevice.h"
#include "host/demo/DemoReport.h"
#include "host/demo/DemoSteps.h"

namespace fs = std::filesystem;

namespace {

// A folder of its own that goes with the object.
class TemporaryFolder {
 public:
  TemporaryFolder() {
    std::string path = (fs::temp_directory_path() / "loka-demo-XXXXXX").string();
    if (mkdtemp(path.data()) == nullptr) {
      throw std::system_error(errno, std::generic_category(), path);
    }
    path_ = path;
  }
  ~TemporaryFolder() {
    std::error_code ignored;
    fs::remove_all(path_, ignored);
  }
  TemporaryFolder(const TemporaryFolder&) = delete;
  TemporaryFolder& operator=(const TemporaryFolder&) = delete;

  fs::path Path() const { return path_; }

 private:
  fs::path path_;
};

// As no-color.org asks: any value of NO_COLOR that is not empty.
bool WantsColours() {
  const char* const noColour = std::getenv("NO_COLOR");
  return isatty(STDOUT_FILENO) != 0 && (noColour == nullptr || noColour[0] == '\0');
}

int RunSteps(const std::string& pluginFile) {
  const TemporaryFolder folder;
  DemoDevice device;
  DemoReport report(WantsColours());
  (void)std::printf("simulated device: process %d at %s\n\n", device.ProcessId(),
                    device.PortPath().c_str());
  DemoSteps steps(pluginFile, (folder.Path() / "store.db").string(), &device, &report);
  steps.RunAll();
  return static_cast<int>(report.Finish() ? ExitStatus::kDone : ExitStatus::kRefused);
}

}  // namespace

void AddDemo(CLI::App* app, DemoOptions* options) {
  CLI::App* const demo =
      app->add_subcommand("demo", "Show and check the driver against a simulated device");
  demo->add_option("--plugin", options->pluginFile,
                   "Driver to load (else $LOKA_PLUGIN, else beside loka)")
      ->type_name("FILE");
  demo->footer("Example: loka demo");
}

// An empty group hides a command.
void AddDemoDevice(CLI::App* app, DemoDeviceOptions* /*options*/) {
  app->add_subcommand("demo-device", "")->group("");
}

int RunDemoDeviceProcess(const DemoDeviceOptions& /*options*/) { return RunDemoDevice(); }

void AddDemoRestarted(CLI::App* app, DemoRestartedOptions* options) {
  CLI::App* const restarted = app->add_subcommand("demo-restarted", "")->group("");
  restarted->add_option("--plugin", options->pluginFile);
  restarted->add_option("--port", options->portPath)->required();
  restarted->add_option("--store", options->storeFile)->required();
}

int RunDemoRestartedProcess(const DemoRestartedOptions& options) {
  return RunDemoRestarted(options.pluginFile, options.portPath, options.storeFile);
}

int RunDemo(const DemoOptions& options) {
  (void)std::setvbuf(stdout, nullptr, _IOLBF, BUFSIZ);
  try {
    return RunSteps(options.pluginFile);
  } catch (const DemoError& error) {
    (void)std::fprintf(stderr, "loka: %s\n", error.what());
    return static_cast<int>(error.Status());
  } catch (const std::exception& error) {
    (void)std::fprintf(stderr, "loka: the demonstration cannot run: %s\n", error.what());
    return static_cast<int>(ExitStatus::kRefused);
  }
}
