// SPDX-License-Identifier: Apache-2.0
#include "host/document/DescriptionDocument.h"

#include <algorithm>

std::string DescriptionDocument::Property(const std::string& name) const {
  const auto found = std::find_if(properties.begin(), properties.end(),
                                  [&name](const auto& property) { return property.first == name; });
  return found == properties.end() ? "" : found->second;
}

const DescriptionDocument::Parameter* DescriptionDocument::FindParameter(
    const std::string& key) const {
  const auto found =
      std::find_if(parameters.begin(), parameters.end(),
                   [&key](const Parameter& parameter) { return parameter.key == key; });
  return found == parameters.end() ? nullptr : &*found;
}
