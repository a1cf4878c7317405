// SPDX-License-Identifier: Apache-2.0
#include "host/document/DescriptionSchema.h"

#include <charconv>
#include <nlohmann/json.hpp>

namespace {

using Json = nlohmann::ordered_json;
using Parameter = DescriptionDocument::Parameter;

constexpr int kIndent = 2;

std::string TypeOf(const Parameter& parameter) {
  const std::string& type = parameter.type == "prop_list" ? parameter.listType : parameter.type;
  return type == "prop_integer" ? "integer" : type == "prop_bool" ? "boolean" : "string";
}

// A text of the description as a value of the type; a number that is none stays a text.
Json ValueOf(const std::string& type, const std::string& text) {
  if (type == "boolean") {
    return text == "true";
  }
  std::int64_t number = 0;
  const auto [stop, failure] = std::from_chars(text.data(), text.data() + text.size(), number);
  const bool isNumber = failure == std::errc() && stop == text.data() + text.size();
  return type == "integer" && isNumber ? Json(number) : Json(text);
}

std::string HelpOf(const ParameterNotes::Note& note) {
  return note.meaning + (note.also.empty() ? "" : "; taken as well: " + note.also);
}

Json PropertyOf(const Parameter& parameter, const DescriptionDocument& document,
                const ParameterNotes::Note& note) {
  const std::string type = TypeOf(parameter);
  Json property = {{"title", parameter.display}, {"type", type}};
  if (!note.meaning.empty()) {
    property["description"] = HelpOf(note);
  }
  Json entries = Json::array();
  for (const std::string& entry : parameter.entries) {
    entries.push_back(ValueOf(type, entry));
  }
  if (parameter.type == "prop_modelRef") {
    for (const DescriptionDocument::Model& model : document.models) {
      entries.push_back(model.name);
    }
  }
  if (!note.extraEntry.empty()) {
    entries.push_back(ValueOf(type, note.extraEntry));
  }
  if (!entries.empty()) {
    property["enum"] = entries;
  } else if (!note.pattern.empty() && type == "string") {
    property["pattern"] = "^(" + note.pattern + ")$";
  }
  if (parameter.min) {
    property["minimum"] = *parameter.min;
  }
  if (parameter.max) {
    property["maximum"] = *parameter.max;
  }
  property["default"] = ValueOf(type, parameter.defaultText);
  return property;
}

}  // namespace

std::string DescribeAsSchema(const DescriptionBlock& block, const DescriptionDocument& document,
                             const ParameterNotes& notes) {
  Json properties = Json::object();
  Json required = Json::array();
  for (const Parameter& parameter : document.parameters) {
    properties[parameter.key] = PropertyOf(parameter, document, notes.Of(parameter.key));
    if (parameter.isMandatory) {
      required.push_back(parameter.key);
    }
  }
  const Json schema = {
      {"$schema", "https://json-schema.org/draft/2020-12/schema"},
      {"title", "Configuration of " + block.name + " " + std::to_string(block.version)},
      {"type", "object"},
      {"properties", properties},
      {"required", required},
      {"additionalProperties", false}};
  return schema.dump(kIndent, ' ', false, Json::error_handler_t::replace) + "\n";
}
