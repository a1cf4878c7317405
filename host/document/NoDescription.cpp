// SPDX-License-Identifier: Apache-2.0
// Stands in for the reading of descriptions where the libraries for it are not wanted.
#include "host/document/DescriptionDocument.h"
#include "host/document/Inflate.h"

namespace {

constexpr const char* kWithout = "this loka was built without descriptions (LOKA_WITH_DESCRIPTION)";

}  // namespace

bool ParseDescription(const std::string& /*xml*/, DescriptionDocument* /*document*/,
                      std::string* error) {
  *error = kWithout;
  return false;
}

bool Inflate(std::string_view /*stream*/, int /*maxBytes*/, std::string* /*text*/,
             std::string* error) {
  *error = kWithout;
  return false;
}
