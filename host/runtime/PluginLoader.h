// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>
#include <vector>

class IInterfaceFactory;

// A plug-in loaded with dlopen(3), its symbols kept to itself and all of them resolved at once.
// Loading thread.
class PluginLoader {
 public:
  static constexpr const char* kFileName = "libLOKA.so";

  // The files that are tried, in order: the one named on the command line and no other; else the
  // one that $LOKA_PLUGIN names and no other; else libLOKA.so beside the program and in
  // ../lib/loka/plugins as seen from there.
  static std::vector<std::string> Candidates(const std::string& commandLineFile);

  // Loads the first candidate that exists. Null, with the reason in `error`, when there is none or
  // it cannot be loaded or is no plug-in.
  static std::unique_ptr<PluginLoader> Load(const std::vector<std::string>& candidates,
                                            std::string* error);

  // Unloads the library. Everything that came from it must be gone.
  ~PluginLoader();

  PluginLoader(const PluginLoader&) = delete;
  PluginLoader& operator=(const PluginLoader&) = delete;

  // The plug-in's factory, never null; lives as long as this object.
  IInterfaceFactory* Factory() const { return factory_; }

  // The file that was loaded.
  const std::string& Path() const { return path_; }

  // Keeps the library loaded for good, for the case that a thread is still inside it.
  void KeepLoaded() { library_ = nullptr; }

 private:
  PluginLoader(void* library, std::string path);

  bool FindEntry(std::string* error);

  void* library_;
  std::string path_;
  IInterfaceFactory* factory_ = nullptr;
};
