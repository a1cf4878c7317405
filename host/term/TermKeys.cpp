// SPDX-License-Identifier: Apache-2.0
#include "host/term/TermKeys.h"

#include <algorithm>

std::optional<TermKey> FindTermKey(char typed) {
  const auto* const found =
      std::find_if(kTermKeyTable.begin(), kTermKeyTable.end(),
                   [&](const TermKeyEntry& entry) { return entry.typed == typed; });
  return found == kTermKeyTable.end() ? std::nullopt : std::optional<TermKey>(found->key);
}

std::string TermKeyList() {
  constexpr std::size_t kNameColumns = 8;
  std::string text;
  for (const TermKeyEntry& entry : kTermKeyTable) {
    std::string name = entry.name;
    name.resize(kNameColumns, ' ');
    text += "ctrl-t " + name + entry.text + "\n";
  }
  return text;
}
