// SPDX-License-Identifier: Apache-2.0
#include "host/port/PortList.h"

#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <map>
#include <utility>

namespace fs = std::filesystem;

namespace {

std::vector<fs::path> EntriesOf(const fs::path& folder) {
  std::vector<fs::path> entries;
  std::error_code error;
  for (fs::directory_iterator entry(folder, error), end; !error && entry != end;
       entry.increment(error)) {
    entries.push_back(entry->path());
  }
  std::sort(entries.begin(), entries.end());
  return entries;
}

// A port counts when a device stands behind it. The kernel makes a row of ttyS names even on
// machines without such chips; those have the type 0.
bool HasHardware(const fs::path& classEntry) {
  std::error_code error;
  if (!fs::exists(classEntry / "device", error)) {
    return false;
  }
  std::ifstream file(classEntry / "type");
  int type = 0;
  return !(file >> type) || type != 0;
}

// Device name ("ttyUSB0") to by-id path.
std::map<std::string, std::string> StableNames(const fs::path& deviceRoot) {
  std::map<std::string, std::string> names;
  for (const fs::path& link : EntriesOf(deviceRoot / "serial" / "by-id")) {
    std::error_code error;
    const fs::path target = fs::read_symlink(link, error);
    if (!error) {
      names.emplace(target.filename().string(), link.string());
    }
  }
  return names;
}

// The first line of a small file; empty when there is none.
std::string LineOf(const fs::path& file) {
  std::ifstream stream(file);
  std::string line;
  std::getline(stream, line);
  return line;
}

// The device that stands above a port's own entry and tells its product: the USB adapter.
fs::path AdapterOf(const fs::path& classEntry) {
  constexpr int kMostSteps = 4;
  std::error_code error;
  fs::path folder = fs::canonical(classEntry / "device", error);
  for (int step = 0; !error && step < kMostSteps && folder.has_relative_path(); ++step) {
    if (fs::exists(folder / "product", error) || fs::exists(folder / "idVendor", error)) {
      return folder;
    }
    folder = folder.parent_path();
  }
  return {};
}

ListedPort Described(const fs::path& classEntry) {
  ListedPort port;
  std::error_code error;
  port.driver = fs::read_symlink(classEntry / "device" / "driver", error).filename().string();
  std::ifstream latency(classEntry / "device" / "latency_timer");
  if (!(latency >> port.latencyMs)) {
    port.latencyMs = -1;
  }
  const fs::path adapter = AdapterOf(classEntry);
  if (!adapter.empty()) {
    port.manufacturer = LineOf(adapter / "manufacturer");
    port.product = LineOf(adapter / "product");
    port.serialNumber = LineOf(adapter / "serial");
  }
  return port;
}

}  // namespace

std::vector<ListedPort> ListPorts(const std::string& classFolder, const std::string& deviceRoot) {
  const std::map<std::string, std::string> stableNames = StableNames(deviceRoot);
  std::vector<ListedPort> stable;
  std::vector<ListedPort> plain;
  for (const fs::path& entry : EntriesOf(classFolder)) {
    if (!HasHardware(entry)) {
      continue;
    }
    const std::string device = (fs::path(deviceRoot) / entry.filename()).string();
    const auto found = stableNames.find(entry.filename().string());
    ListedPort port = Described(entry);
    if (found == stableNames.end()) {
      port.path = device;
      plain.push_back(std::move(port));
    } else {
      port.path = found->second;
      port.alias = device;
      stable.push_back(std::move(port));
    }
  }
  std::sort(stable.begin(), stable.end(),
            [](const ListedPort& a, const ListedPort& b) { return a.path < b.path; });
  stable.insert(stable.end(), plain.begin(), plain.end());
  return stable;
}

std::string StableNameOf(const std::string& path, const std::string& deviceRoot) {
  std::error_code error;
  const fs::path device = fs::canonical(path, error);
  if (error) {
    return {};
  }
  for (const fs::path& link : EntriesOf(fs::path(deviceRoot) / "serial" / "by-id")) {
    if (fs::canonical(link, error) == device && !error) {
      return link.string();
    }
  }
  return {};
}

bool HasChangingName(const std::string& path) {
  const std::string name = fs::path(path).filename().string();
  return name.rfind("ttyUSB", 0) == 0 || name.rfind("ttyACM", 0) == 0;
}

void FindStates(std::vector<ListedPort>* ports) {
  for (ListedPort& port : *ports) {
    port.holders = FindPortHolders(port.Device());
    if (!port.holders.empty()) {
      port.state = ListedPort::State::kBusy;
    } else if (access(port.Device().c_str(), R_OK | W_OK) != 0) {
      port.state = ListedPort::State::kNoRights;
    }
  }
}
