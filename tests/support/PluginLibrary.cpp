// SPDX-License-Identifier: Apache-2.0
#include "tests/support/PluginLibrary.h"

#include <dlfcn.h>

#include <cstdlib>

PluginLibrary::PluginLibrary(const std::string& path) {
  handle_ = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
  if (handle_ == nullptr) {
    const char* reason = dlerror();
    error_ = reason != nullptr ? reason : "cannot load " + path;
    return;
  }
  const auto getFactory =
      reinterpret_cast<GetInterfaceFactoryFunction>(Symbol(kGetInterfaceFactoryName));
  if (getFactory == nullptr) {
    error_ = std::string(kGetInterfaceFactoryName) + " is not exported by " + path;
    return;
  }
  factory_ = getFactory();
}

PluginLibrary::~PluginLibrary() {
  if (handle_ != nullptr) dlclose(handle_);
}

void* PluginLibrary::Symbol(const char* name) const { return dlsym(handle_, name); }

std::string PluginLibrary::DefaultPath() {
  const char* given = std::getenv("LOKA_PLUGIN");
  return given != nullptr ? given : LOKA_PLUGIN_PATH;
}

PluginLibrary& PluginLibrary::Shared() {
  static auto* shared = new PluginLibrary(DefaultPath());
  return *shared;
}
