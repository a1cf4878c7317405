// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "interfaces/IInterfaceFactory.h"

// A loaded plug-in library. The handle is closed with the object.
class PluginLibrary {
 public:
  explicit PluginLibrary(const std::string& path);
  ~PluginLibrary();
  PluginLibrary(const PluginLibrary&) = delete;
  PluginLibrary& operator=(const PluginLibrary&) = delete;

  // Null with the loader's message in Error when the library could not be loaded.
  IInterfaceFactory* Factory() const { return factory_; }
  void* Symbol(const char* name) const;
  const std::string& Error() const { return error_; }

  // The library under test: LOKA_PLUGIN in the environment, else the one of this build.
  static std::string DefaultPath();
  // The library under test, loaded once and kept for the whole run.
  static PluginLibrary& Shared();

 private:
  void* handle_ = nullptr;
  IInterfaceFactory* factory_ = nullptr;
  std::string error_;
};
