// SPDX-License-Identifier: Apache-2.0
#include "host/term/HistoryPath.h"

#include <filesystem>

#include "host/store/StorePath.h"

std::string HistoryPath() {
  const std::string store = DefaultStorePath();
  return store.empty() ? "" : (std::filesystem::path(store).parent_path() / "history").string();
}
