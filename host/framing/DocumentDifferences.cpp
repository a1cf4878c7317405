// SPDX-License-Identifier: Apache-2.0
#include "host/framing/DocumentDifferences.h"

#include <algorithm>

#include "host/document/DescriptionDocument.h"
#include "host/framing/ConfigKeyTable.h"
#include "host/text/ByteText.h"

namespace {

using Parameter = DescriptionDocument::Parameter;

std::string AllowedBy(const Parameter& parameter) {
  std::string text;
  for (const std::string& entry : parameter.entries) {
    text += (text.empty() ? "" : ", ") + entry;
  }
  if (parameter.min && parameter.max) {
    text += std::to_string(*parameter.min) + " to " + std::to_string(*parameter.max);
  }
  return text;
}

std::string AllowedBy(const ConfigKey& key) {
  std::string text;
  for (const std::string_view entry : key.entries) {
    text += (text.empty() ? "" : ", ") + std::string(entry);
  }
  return key.key == "token_queue_size" ? key.AllowedText() : text;
}

void Compare(const std::string& key, const char* what, const std::string& described,
             const std::string& known, std::vector<std::string>* differences) {
  if (described != known) {
    differences->push_back(EscapeBytes(key + ": the driver's description gives the " + what + " " +
                                       (described.empty() ? "nothing" : described) +
                                       ", loka knows " + (known.empty() ? "nothing" : known)));
  }
}

}  // namespace

std::vector<std::string> DocumentDifferences(const DescriptionDocument& document) {
  std::vector<std::string> differences;
  for (const Parameter& parameter : document.parameters) {
    const ConfigKey* const known = FindConfigKey(parameter.key);
    if (known == nullptr) {
      differences.push_back(EscapeBytes(parameter.key) +
                            ": the driver's description has this key, loka does not know it");
      continue;
    }
    Compare(parameter.key, "default", parameter.defaultText, std::string(known->defaultText),
            &differences);
    Compare(parameter.key, "values", AllowedBy(parameter), AllowedBy(*known), &differences);
    Compare(parameter.key, "mark", parameter.isMandatory ? "mandatory" : "optional",
            known->isMandatory ? "mandatory" : "optional", &differences);
  }
  for (const ConfigKey& key : ConfigKeys()) {
    if (document.FindParameter(std::string(key.key)) == nullptr) {
      differences.push_back(std::string(key.key) + ": not in the driver's description");
    }
  }
  return differences;
}
