// SPDX-License-Identifier: Apache-2.0
#include "host/PortList.h"

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <map>

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
    if (found == stableNames.end()) {
      plain.push_back({device, ""});
    } else {
      stable.push_back({found->second, device});
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
