// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

// What a driver's description document says, as plain values. Texts are UTF-8 and may hold any
// character that XML allows; who shows them on a terminal takes PrintableUtf8.
struct DescriptionDocument {
  // A key of the configuration text.
  struct Parameter {
    std::string key;
    std::string display;
    std::string type;      // "prop_integer", "prop_string", "prop_bool", "prop_list", ...
    std::string listType;  // type of the entries of a "prop_list", else empty
    std::string group;
    std::string defaultText;  // as it stands in a configuration text
    bool isNodeProperty = false;
    bool isDistinct = false;
    bool isMandatory = false;
    std::optional<std::int64_t> min;
    std::optional<std::int64_t> max;
    std::vector<std::string> entries;  // what a "prop_list" allows
  };

  struct MemoryType {
    std::string name;
    std::string display;
    std::string naturalType;
    std::uint32_t vadoTypes = 0;  // mask of the value types
    std::int64_t min = 0;
    std::int64_t max = 0;
    std::int64_t blockReadCount = 0;
    std::int64_t blockWriteCount = 0;
    // The attributes that are true or false, in the document's order.
    std::vector<std::pair<std::string, bool>> flags;
    bool isReadOnly = false;
    bool isWriteOnly = false;
  };

  // A part of a tag's address.
  struct TagField {
    std::string name;
    std::string display;
    std::string type;
    std::string defaultText;
    bool isMandatory = false;
  };

  struct MemoryTypeReference {
    std::string name;
    std::int64_t min = 0;
    std::int64_t max = 0;
  };

  struct Model {
    std::string name;
    std::string display;
    std::int64_t datagramCount = 0;
    std::int64_t datagramLength = 0;
    std::vector<MemoryTypeReference> memoryTypes;
  };

  // Elements that hold a text and nothing else, in the document's order: flags and identity.
  std::vector<std::pair<std::string, std::string>> properties;
  std::vector<Parameter> parameters;
  std::vector<MemoryType> memoryTypes;
  std::vector<TagField> tagFields;
  std::vector<Model> models;

  // The text of a property, empty when there is none.
  std::string Property(const std::string& name) const;

  // The parameter of a key, null when there is none.
  const Parameter* FindParameter(const std::string& key) const;
};

// Reads a document. False, with the place and what was expected in `error`, when it is no
// well-formed XML in UTF-8 or lacks what a description needs. Elements and attributes that are not
// known are passed over. Any thread.
bool ParseDescription(const std::string& xml, DescriptionDocument* document, std::string* error);
