// SPDX-License-Identifier: Apache-2.0
#include "host/document/DescriptionReport.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cstdio>
#include <nlohmann/json.hpp>
#include <vector>

#include "host/text/Utf8Text.h"

namespace {

// Keeps the keys in the order in which they are set.
using Json = nlohmann::ordered_json;
using Row = std::vector<std::string>;

// --- text ---

// Columns as wide as a terminal shows them, as long as a character takes one place.
std::size_t WidthOf(const std::string& cell) {
  return static_cast<std::size_t>(std::count_if(cell.begin(), cell.end(), [](char character) {
    return (static_cast<unsigned char>(character) & 0xC0U) != 0x80U;
  }));
}

// Rows with the same number of cells, each indented by two blanks; the last column may be long.
std::string Table(const std::vector<Row>& rows) {
  std::vector<std::size_t> widths(rows.front().size(), 0);
  for (const Row& row : rows) {
    for (std::size_t i = 0; i + 1 < row.size(); ++i) {
      widths[i] = std::max(widths[i], WidthOf(row[i]));
    }
  }
  std::string text;
  for (const Row& row : rows) {
    text += ' ';
    for (std::size_t i = 0; i < row.size(); ++i) {
      text += ' ' + row[i];
      text.append(i + 1 < row.size() ? widths[i] - WidthOf(row[i]) + 1 : 0, ' ');
    }
    text += '\n';
  }
  return text;
}

// A text for a cell: one line, never empty.
std::string Cell(const std::string& text) {
  std::string cell = text.empty() ? "-" : PrintableUtf8(text);
  std::replace_if(
      cell.begin(), cell.end(),
      [](char character) { return character == '\n' || character == '\t'; }, ' ');
  return cell;
}

std::string RangeText(const DescriptionDocument::Parameter& parameter) {
  const auto from = parameter.min ? std::to_string(*parameter.min) : "";
  const auto to = parameter.max ? std::to_string(*parameter.max) : "";
  if (parameter.min && parameter.max) {
    return ", " + from + " to " + to;
  }
  return (parameter.min ? ", from " + from : "") + (parameter.max ? ", up to " + to : "");
}

// What a configuration text may say for a key, in words where the document's word is a code.
std::string ValuesText(const DescriptionDocument::Parameter& parameter) {
  if (parameter.type == "prop_list") {
    std::string entries;
    for (const std::string& entry : parameter.entries) {
      entries += (entries.empty() ? "" : " ") + Cell(entry);
    }
    return entries;
  }
  if (parameter.type == "prop_bool") {
    return "true false";
  }
  if (parameter.type == "prop_integer") {
    return "whole number" + RangeText(parameter);
  }
  if (parameter.type == "prop_string") {
    return "text" + RangeText(parameter);
  }
  return (parameter.type == "prop_modelRef" ? "name of a model" : Cell(parameter.type)) +
         RangeText(parameter);
}

std::string ParameterTable(const DescriptionDocument& document) {
  std::vector<Row> rows = {{"key", "default", "required", "name", "values"}};
  for (const DescriptionDocument::Parameter& parameter : document.parameters) {
    rows.push_back({Cell(parameter.key), Cell(parameter.defaultText),
                    parameter.isMandatory ? "yes" : "no", Cell(parameter.display),
                    ValuesText(parameter)});
  }
  return Table(rows);
}

std::string MaskText(std::uint32_t mask) {
  std::array<char, 16> text{};
  (void)std::snprintf(text.data(), text.size(), "0x%x", static_cast<unsigned int>(mask));
  return text.data();
}

std::string AccessText(const DescriptionDocument::MemoryType& memoryType) {
  if (memoryType.isReadOnly) {
    return memoryType.isWriteOnly ? "none" : "read";
  }
  return memoryType.isWriteOnly ? "write" : "read, write";
}

std::string MemoryTypeTable(const DescriptionDocument& document) {
  std::vector<Row> rows = {{"memory type", "access", "natural type", "mask", "items", "name"}};
  for (const DescriptionDocument::MemoryType& memoryType : document.memoryTypes) {
    rows.push_back({Cell(memoryType.name), AccessText(memoryType), Cell(memoryType.naturalType),
                    MaskText(memoryType.vadoTypes),
                    std::to_string(memoryType.min) + " to " + std::to_string(memoryType.max),
                    Cell(memoryType.display)});
  }
  return Table(rows);
}

// --- JSON ---

Json NumberOrNull(const std::optional<std::int64_t>& number) {
  return number ? Json(*number) : Json(nullptr);
}

Json TextOrNull(const std::string& text) { return text.empty() ? Json(nullptr) : Json(text); }

bool IsIdentity(const std::string& name) {
  return name == "name" || name == "display" || name == "displayDlgTitle" ||
         name == "compatibilityCode";
}

// A property's text as the value that it stands for. Names stay texts, whatever they look like.
Json PropertyValue(const std::string& name, const std::string& text) {
  if (IsIdentity(name)) {
    return text;
  }
  if (text == "true" || text == "false") {
    return text == "true";
  }
  std::int64_t number = 0;
  const auto [stop, failure] = std::from_chars(text.data(), text.data() + text.size(), number);
  const bool isNumber = failure == std::errc() && std::to_string(number) == text;
  return isNumber ? Json(number) : Json(text);
}

Json ParameterJson(const DescriptionDocument::Parameter& parameter) {
  const bool isList = parameter.type == "prop_list";
  return {{"key", parameter.key},
          {"display", parameter.display},
          {"type", parameter.type},
          {"listType", TextOrNull(parameter.listType)},
          {"group", parameter.group},
          {"default", parameter.defaultText},
          {"isNodeProperty", parameter.isNodeProperty},
          {"isDistinct", parameter.isDistinct},
          {"isMandatory", parameter.isMandatory},
          {"min", NumberOrNull(parameter.min)},
          {"max", NumberOrNull(parameter.max)},
          {"entries", isList ? Json(parameter.entries) : Json(nullptr)}};
}

Json MemoryTypeJson(const DescriptionDocument::MemoryType& memoryType) {
  Json json = {{"name", memoryType.name},
               {"display", memoryType.display},
               {"naturalType", memoryType.naturalType},
               {"vadoTypes", memoryType.vadoTypes},
               {"min", memoryType.min},
               {"max", memoryType.max},
               {"blockReadCount", memoryType.blockReadCount},
               {"blockWriteCount", memoryType.blockWriteCount}};
  for (const auto& [name, value] : memoryType.flags) {
    json[name] = value;
  }
  return json;
}

Json TagFieldJson(const DescriptionDocument::TagField& field) {
  return {{"name", field.name},
          {"display", field.display},
          {"type", field.type},
          {"default", field.defaultText},
          {"isMandatory", field.isMandatory}};
}

Json ReferenceJson(const DescriptionDocument::MemoryTypeReference& reference) {
  return {{"name", reference.name}, {"min", reference.min}, {"max", reference.max}};
}

template <typename Item, typename ToJson>
Json List(const std::vector<Item>& items, ToJson toJson) {
  Json list = Json::array();
  for (const Item& item : items) {
    list.push_back(toJson(item));
  }
  return list;
}

Json ModelJson(const DescriptionDocument::Model& model) {
  return {{"name", model.name},
          {"display", model.display},
          {"datagramCount", model.datagramCount},
          {"datagramLength", model.datagramLength},
          {"memoryTypes", List(model.memoryTypes, ReferenceJson)}};
}

}  // namespace

std::string DescribeAsText(const DescriptionBlock& block, const DescriptionDocument& document) {
  const std::string platform = block.platform.empty() ? "" : "  platform " + Cell(block.platform);
  return Cell(block.name) + "  " + Cell(block.fullName) + "  version " +
         std::to_string(block.version) + "  code " + Cell(document.Property("code")) + platform +
         "\ndocument: " + std::to_string(block.xml.size()) + " bytes, " +
         std::to_string(block.compressedBytes) + " compressed\n\nConfiguration\n" +
         ParameterTable(document) + "\nMemory types\n" + MemoryTypeTable(document);
}

std::string DescribeAsJson(const DescriptionBlock& block, const DescriptionDocument& document) {
  Json properties = Json::object();
  for (const auto& [name, text] : document.properties) {
    properties[name] = PropertyValue(name, text);
  }
  const Json json = {{"module",
                      {{"name", block.name},
                       {"fullName", block.fullName},
                       {"version", block.version},
                       {"platform", TextOrNull(block.platform)}}},
                     {"properties", properties},
                     {"parameters", List(document.parameters, ParameterJson)},
                     {"memoryTypes", List(document.memoryTypes, MemoryTypeJson)},
                     {"tagFields", List(document.tagFields, TagFieldJson)},
                     {"models", List(document.models, ModelJson)}};
  // Bytes of the identification line need not be UTF-8; JSON has to be.
  return json.dump(2, ' ', false, Json::error_handler_t::replace) + "\n";
}
