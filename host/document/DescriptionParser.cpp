// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <charconv>
#include <limits>
#include <pugixml.hpp>
#include <string_view>

#include "host/document/DescriptionDocument.h"
#include "host/text/Utf8Text.h"

namespace {

using pugi::xml_node;

// Deeper than any description; the reader needs three levels.
constexpr int kMaxDepth = 32;
// The driver's own document has 27; the limit keeps a search through them short.
constexpr std::size_t kMaxProperties = 256;
// How much of the document an error text repeats.
constexpr std::size_t kMaxExcerptBytes = 40;

std::string Excerpt(std::string_view text) {
  return PrintableUtf8(text.substr(0, kMaxExcerptBytes)) +
         (text.size() > kMaxExcerptBytes ? "..." : "");
}

// The attributes of one element. The first one that is missing or wrong is kept as the error.
class AttributeReader {
 public:
  AttributeReader(const xml_node& element, std::string* error) : element_(element), error_(error) {}

  std::string Text(const char* name) {
    if (!element_.attribute(name)) {
      Fail(std::string("lacks the attribute ") + name);
    }
    return element_.attribute(name).value();
  }

  std::string OptionalText(const char* name) const { return element_.attribute(name).value(); }

  bool Flag(const char* name) {
    const std::string text = Text(name);
    if (text != "true" && text != "false") {
      FailValue(name, text, "true or false");
    }
    return text == "true";
  }

  std::int64_t Number(const char* name) {
    const std::string text = Text(name);
    std::int64_t number = 0;
    if (!ParseAll(text, 10, &number)) {
      FailValue(name, text, "a whole number");
    }
    return number;
  }

  std::optional<std::int64_t> OptionalNumber(const char* name) {
    return element_.attribute(name) ? std::optional(Number(name)) : std::nullopt;
  }

  // "0x" and hexadecimal digits.
  std::uint32_t Mask(const char* name) {
    const std::string text = Text(name);
    std::int64_t mask = -1;
    if (text.rfind("0x", 0) != 0 || !ParseAll(std::string_view(text).substr(2), 16, &mask) ||
        mask < 0 || mask > std::numeric_limits<std::uint32_t>::max()) {
      FailValue(name, text, "0x and hexadecimal digits");
      return 0;
    }
    return static_cast<std::uint32_t>(mask);
  }

  // The element's own text, which must not be empty.
  std::string Name() {
    std::string name = element_.child_value();
    if (name.empty()) {
      Fail("has no text");
    }
    return name;
  }

 private:
  static bool ParseAll(std::string_view text, int base, std::int64_t* number) {
    const char* const end = text.data() + text.size();
    const auto [stop, failure] = std::from_chars(text.data(), end, *number, base);
    return failure == std::errc() && stop == end;
  }

  void FailValue(const char* name, const std::string& text, const char* expected) {
    Fail(std::string("has ") + name + "=\"" + Excerpt(text) + "\", expected " + expected);
  }

  void Fail(const std::string& reason) {
    if (error_->empty()) {
      *error_ = std::string("the element ") + element_.name() + " '" +
                Excerpt(element_.child_value()) + "' " + reason;
    }
  }

  const xml_node& element_;
  std::string* const error_;
};

DescriptionDocument::Parameter ReadParameter(const xml_node& element, std::string* error) {
  AttributeReader reader(element, error);
  DescriptionDocument::Parameter parameter;
  parameter.key = reader.Name();
  parameter.display = reader.Text("display");
  parameter.type = reader.Text("type");
  parameter.listType = reader.OptionalText("listType");
  parameter.group = reader.Text("group");
  parameter.defaultText = reader.Text("default");
  parameter.isNodeProperty = reader.Flag("isNodeProperty");
  parameter.isDistinct = reader.Flag("isDistinct");
  parameter.isMandatory = reader.Flag("isMandatory");
  parameter.min = reader.OptionalNumber("min");
  parameter.max = reader.OptionalNumber("max");
  for (const xml_node& entry : element.children("list_entry")) {
    parameter.entries.emplace_back(entry.child_value());
  }
  return parameter;
}

DescriptionDocument::MemoryType ReadMemoryType(const xml_node& element, std::string* error) {
  constexpr const char* kFlags[] = {
      "canBitWrite",           "isSwap2",       "isSwap4",          "mustBitRead", "isSwap8",
      "hasInternalConversion", "useInDatagram", "canBitArrayWrite", "isReadOnly",  "isWriteOnly"};
  AttributeReader reader(element, error);
  DescriptionDocument::MemoryType memoryType;
  memoryType.name = reader.Name();
  memoryType.display = reader.Text("display");
  memoryType.naturalType = reader.Text("naturalType");
  memoryType.vadoTypes = reader.Mask("vadoTypes");
  memoryType.min = reader.Number("min");
  memoryType.max = reader.Number("max");
  memoryType.blockReadCount = reader.Number("blockReadCount");
  memoryType.blockWriteCount = reader.Number("blockWriteCount");
  for (const char* const flag : kFlags) {
    memoryType.flags.emplace_back(flag, reader.Flag(flag));
  }
  memoryType.isReadOnly = reader.Flag("isReadOnly");
  memoryType.isWriteOnly = reader.Flag("isWriteOnly");
  return memoryType;
}

DescriptionDocument::TagField ReadTagField(const xml_node& element, std::string* error) {
  AttributeReader reader(element, error);
  DescriptionDocument::TagField field;
  field.name = reader.Name();
  field.display = reader.Text("display");
  field.type = reader.Text("type");
  field.defaultText = reader.Text("default");
  field.isMandatory = reader.Flag("mandatory");
  return field;
}

DescriptionDocument::Model ReadModel(const xml_node& element, std::string* error) {
  AttributeReader reader(element, error);
  DescriptionDocument::Model model;
  model.name = reader.Name();
  model.display = reader.Text("display");
  model.datagramCount = reader.Number("datagramCount");
  model.datagramLength = reader.Number("datagramLength");
  for (const xml_node& child : element.children("memtype_ref")) {
    AttributeReader reference(child, error);
    model.memoryTypes.push_back(
        {reference.Name(), reference.Number("min"), reference.Number("max")});
  }
  return model;
}

// The children of one name in a section of the document, each read by `read`.
template <typename Item, typename Read>
void ReadSection(const xml_node& root, const char* section, const char* name, Read read,
                 std::vector<Item>* items, std::string* error) {
  if (!root.child(section) && error->empty()) {
    *error = std::string("the element ") + section + " is missing";
  }
  for (const xml_node& element : root.child(section).children(name)) {
    items->push_back(read(element, error));
  }
}

bool IsElement(const xml_node& node) { return node.type() == pugi::node_element; }

bool HasElements(const xml_node& element) {
  return std::any_of(element.begin(), element.end(), IsElement);
}

bool IsSection(std::string_view name) {
  constexpr std::string_view kSections[] = {"parameters", "memtypes", "tag_uri", "models",
                                            "conversions"};
  return std::find(std::begin(kSections), std::end(kSections), name) != std::end(kSections);
}

void ReadProperties(const xml_node& root, DescriptionDocument* document, std::string* error) {
  for (const xml_node& element : root.children()) {
    if (IsElement(element) && !IsSection(element.name()) && !HasElements(element)) {
      document->properties.emplace_back(element.name(), element.child_value());
    }
  }
  if (document->properties.size() > kMaxProperties) {
    *error = "the document has more than " + std::to_string(kMaxProperties) + " properties";
  }
}

class DepthCheck : public pugi::xml_tree_walker {
 public:
  bool for_each(xml_node& /*node*/) override { return depth() < kMaxDepth; }
};

// XML allows no other control characters than these.
bool IsXmlText(const std::string& text) {
  return IsUtf8(text) && std::none_of(text.begin(), text.end(), [](char character) {
           const auto byte = static_cast<unsigned char>(character);
           return byte < 0x20 && byte != '\t' && byte != '\n' && byte != '\r';
         });
}

bool ParseXml(const std::string& xml, pugi::xml_document* tree, std::string* error) {
  if (!IsXmlText(xml)) {
    *error = "the document is no XML text in UTF-8";
    return false;
  }
  const pugi::xml_parse_result result =
      tree->load_buffer(xml.data(), xml.size(), pugi::parse_default, pugi::encoding_utf8);
  if (!result) {
    *error = std::string("the document is no well-formed XML: ") + result.description() +
             " at byte " + std::to_string(result.offset);
    return false;
  }
  if (std::count_if(tree->begin(), tree->end(), IsElement) != 1) {
    *error = "the document is no well-formed XML: expected one root element";
    return false;
  }
  DepthCheck depth;
  if (!tree->traverse(depth)) {
    *error = "the document nests more than " + std::to_string(kMaxDepth) + " elements";
    return false;
  }
  return true;
}

}  // namespace

bool ParseDescription(const std::string& xml, DescriptionDocument* document, std::string* error) {
  pugi::xml_document tree;
  error->clear();
  if (!ParseXml(xml, &tree, error)) {
    return false;
  }
  const xml_node root = tree.document_element();
  if (std::string_view(root.name()) != "protocol_cfg") {
    *error = "expected the root element protocol_cfg, found '" + Excerpt(root.name()) + "'";
    return false;
  }
  DescriptionDocument result;
  ReadProperties(root, &result, error);
  ReadSection(root, "parameters", "parameter", ReadParameter, &result.parameters, error);
  ReadSection(root, "memtypes", "memtype", ReadMemoryType, &result.memoryTypes, error);
  ReadSection(root, "tag_uri", "tag_field", ReadTagField, &result.tagFields, error);
  ReadSection(root, "models", "model", ReadModel, &result.models, error);
  if (!error->empty()) {
    return false;
  }
  *document = std::move(result);
  return true;
}
