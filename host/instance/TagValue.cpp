// SPDX-License-Identifier: Apache-2.0
#include "host/instance/TagValue.h"

#include <array>
#include <charconv>
#include <cstdint>
#include <cstring>
#include <limits>
#include <system_error>

#include "host/text/ByteText.h"
#include "interfaces/ITag.h"

namespace {

template <typename Number>
std::string ShowNumber(const std::string& bytes) {
  Number number{};
  if (bytes.size() < sizeof number) {
    return "";
  }
  std::memcpy(&number, bytes.data(), sizeof number);
  std::array<char, 64> text{};
  const auto end = std::to_chars(text.data(), text.data() + text.size(), number);
  return {text.data(), end.ptr};
}

template <typename Number>
bool ParseNumber(const std::string& text, std::string* bytes, std::string* error) {
  Number number{};
  const char* const end = text.data() + text.size();
  const auto parsed = std::from_chars(text.data(), end, number);
  if (parsed.ec != std::errc() || parsed.ptr != end) {
    *error = "expected a number";
    if constexpr (std::numeric_limits<Number>::is_integer) {
      *error += " from " + std::to_string(std::numeric_limits<Number>::min()) + " to " +
                std::to_string(std::numeric_limits<Number>::max());
    }
    *error += ", not \"" + EscapeBytes(text) + "\"";
    return false;
  }
  bytes->assign(sizeof number, '\0');
  std::memcpy(bytes->data(), &number, sizeof number);
  return true;
}

bool ParseBoolean(const std::string& text, std::string* bytes, std::string* error) {
  const bool isOn = text == "1" || text == "true" || text == "on";
  if (!isOn && text != "0" && text != "false" && text != "off") {
    *error = "expected 0 or 1, not \"" + EscapeBytes(text) + "\"";
    return false;
  }
  bytes->assign(1, isOn ? '\1' : '\0');
  return true;
}

bool ParseString(std::size_t room, const std::string& text, std::string* bytes,
                 std::string* error) {
  if (text.find('\0') != std::string::npos) {
    *error = "a text tag ends at the first zero byte; send bytes with hex_tokens=true";
    return false;
  }
  if (text.size() >= room) {
    *error = "the text has " + std::to_string(text.size()) + " bytes and needs string-" +
             std::to_string(text.size() + 1) + " or longer";
    return false;
  }
  *bytes = text;
  bytes->resize(room, '\0');
  return true;
}

bool ParseBytes(std::size_t room, const std::string& text, std::string* bytes, std::string* error) {
  if (!ParseHexBytes(text, bytes) || bytes->size() != room) {
    *error = "expected " + std::to_string(room) + " bytes as hexadecimal digits";
    return false;
  }
  return true;
}

}  // namespace

std::size_t TagValueBytes(const ITag& tag) {
  return static_cast<std::size_t>(tag.GetVarLength() > 0 ? tag.GetVarLength() : 0);
}

bool IsTextTag(const ITag& tag) { return tag.GetVarType() == ICU_STRING; }

std::string ShowTagValue(const ITag& tag, const std::string& bytes) {
  switch (tag.GetVarType()) {
    case ICU_BOOLEAN:
    case ICU_UNSIGNED_BYTE:
      return ShowNumber<unsigned char>(bytes);
    case ICU_BYTE:
      return ShowNumber<signed char>(bytes);
    case ICU_SHORT:
      return ShowNumber<std::int16_t>(bytes);
    case ICU_UNSIGNED_SHORT:
      return ShowNumber<std::uint16_t>(bytes);
    case ICU_INT:
      return ShowNumber<std::int32_t>(bytes);
    case ICU_UNSIGNED_INT:
      return ShowNumber<std::uint32_t>(bytes);
    case ICU_INT64:
      return ShowNumber<std::int64_t>(bytes);
    case ICU_UINT64:
      return ShowNumber<std::uint64_t>(bytes);
    case ICU_FLOAT:
      return ShowNumber<float>(bytes);
    case ICU_DOUBLE:
      return ShowNumber<double>(bytes);
    case ICU_STRING:
      return bytes.substr(0, bytes.find('\0'));
    default:
      return CompactHex(bytes);
  }
}

bool ParseTagValue(const ITag& tag, const std::string& text, std::string* bytes,
                   std::string* error) {
  const std::size_t room = TagValueBytes(tag);
  switch (tag.GetVarType()) {
    case ICU_BOOLEAN:
      return ParseBoolean(text, bytes, error);
    case ICU_UNSIGNED_BYTE:
      return ParseNumber<unsigned char>(text, bytes, error);
    case ICU_BYTE:
      return ParseNumber<signed char>(text, bytes, error);
    case ICU_SHORT:
      return ParseNumber<std::int16_t>(text, bytes, error);
    case ICU_UNSIGNED_SHORT:
      return ParseNumber<std::uint16_t>(text, bytes, error);
    case ICU_INT:
      return ParseNumber<std::int32_t>(text, bytes, error);
    case ICU_UNSIGNED_INT:
      return ParseNumber<std::uint32_t>(text, bytes, error);
    case ICU_INT64:
      return ParseNumber<std::int64_t>(text, bytes, error);
    case ICU_UINT64:
      return ParseNumber<std::uint64_t>(text, bytes, error);
    case ICU_FLOAT:
      return ParseNumber<float>(text, bytes, error);
    case ICU_DOUBLE:
      return ParseNumber<double>(text, bytes, error);
    case ICU_STRING:
      return ParseString(room, text, bytes, error);
    default:
      return ParseBytes(room, text, bytes, error);
  }
}
