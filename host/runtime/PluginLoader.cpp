// SPDX-License-Identifier: Apache-2.0
#include "host/runtime/PluginLoader.h"

#include <dlfcn.h>

#include <cstdlib>
#include <filesystem>
#include <utility>

#include "interfaces/IInterfaceFactory.h"

namespace fs = std::filesystem;

namespace {

std::string DlErrorText() {
  const char* const text = dlerror();
  return text == nullptr ? "unknown reason" : text;
}

// dlopen searches the system's folders for a name without a slash; a file named by the user means
// that file.
std::string AsPath(const std::string& file) {
  return file.find('/') == std::string::npos ? "./" + file : file;
}

}  // namespace

std::vector<std::string> PluginLoader::Candidates(const std::string& commandLineFile) {
  if (!commandLineFile.empty()) {
    return {AsPath(commandLineFile)};
  }
  const char* const variable = std::getenv("LOKA_PLUGIN");
  if (variable != nullptr && variable[0] != '\0') {
    return {AsPath(variable)};
  }
  std::error_code error;
  const fs::path folder = fs::read_symlink("/proc/self/exe", error).parent_path();
  if (error) {
    return {};
  }
  const fs::path installed = folder.parent_path() / "lib" / "loka" / "plugins" / kFileName;
  return {(folder / kFileName).string(), installed.string()};
}

std::unique_ptr<PluginLoader> PluginLoader::Load(const std::vector<std::string>& candidates,
                                                 std::string* error) {
  std::string tried;
  for (const std::string& path : candidates) {
    std::error_code ignored;
    if (!fs::exists(path, ignored)) {
      tried += (tried.empty() ? "" : ", ") + path;
      continue;
    }
    void* const library = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (library == nullptr) {
      *error = "cannot load the plug-in: " + DlErrorText();
      return nullptr;
    }
    auto loader = std::unique_ptr<PluginLoader>(new PluginLoader(library, path));
    return loader->FindEntry(error) ? std::move(loader) : nullptr;
  }
  *error = "no plug-in found; tried " + (tried.empty() ? "nothing" : tried) +
           " (name one with --plugin FILE or LOKA_PLUGIN)";
  return nullptr;
}

PluginLoader::PluginLoader(void* library, std::string path)
    : library_(library), path_(std::move(path)) {}

PluginLoader::~PluginLoader() {
  if (library_ != nullptr) {
    (void)dlclose(library_);
  }
}

bool PluginLoader::FindEntry(std::string* error) {
  // dlsym hands out data pointers for functions too (dlsym(3)).
  auto* const entry =
      reinterpret_cast<GetInterfaceFactoryFunction>(dlsym(library_, kGetInterfaceFactoryName));
  if (entry == nullptr) {
    *error = path_ + " is no plug-in: it does not offer " + kGetInterfaceFactoryName;
    return false;
  }
  factory_ = entry();
  if (factory_ == nullptr) {
    *error = path_ + ": " + kGetInterfaceFactoryName + " returns nothing";
    return false;
  }
  return true;
}
