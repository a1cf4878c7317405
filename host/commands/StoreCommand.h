// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

namespace CLI {
class App;
}

// `loka store`: looks at and changes the file of stored settings, without a driver.
struct StoreOptions {
  enum class Action { kNone, kList, kGet, kSet, kRemove, kExport, kImport };

  Action action = Action::kNone;
  std::string storeFile;           // empty: that of the running instance, else the default file
  std::string ident;               // empty: the only key space of the file
  std::string instanceName;        // --instance
  std::vector<std::string> words;  // keys or KEY=VALUE
  std::string importFile;
  bool isAll = false;
  bool isJson = false;
};

void AddStore(CLI::App* app, StoreOptions* options);

// Returns the exit status of the program. Everything that is asked for is done, or nothing of it.
int RunStore(const StoreOptions& options);
