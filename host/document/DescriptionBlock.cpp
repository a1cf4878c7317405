// SPDX-License-Identifier: Apache-2.0
#include "host/document/DescriptionBlock.h"

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstring>
#include <filesystem>
#include <fstream>

#include "host/document/Inflate.h"

namespace {

constexpr std::string_view kStartMarker = "<<VADO_XML_START>>";
constexpr std::string_view kLengthKey = "compressedXML=";
constexpr std::string_view kEndMarker{"<<VADO_XML_END>>\0", 17};
constexpr std::size_t kMaxSkippedLineBytes = 1024;
// A driver library has a few megabytes at most, debug information included.
constexpr std::uintmax_t kMaxFileBytes = 64UL * 1024 * 1024;
// Each start marker may cost one attempt to inflate.
constexpr int kMaxStartMarkers = 64;

// A whole number without sign or leading zeros that is not above `largest`, or -1.
int WholeNumber(std::string_view text, int largest) {
  int number = 0;
  const char* const end = text.data() + text.size();
  const auto [stop, failure] = std::from_chars(text.data(), end, number);
  const bool isPlain = !text.empty() && text.front() >= '0' && text.front() <= '9' &&
                       (text.front() != '0' || text.size() == 1);
  return isPlain && failure == std::errc() && stop == end && number <= largest ? number : -1;
}

// Takes the text up to the next zero byte, which goes too. False when there is none near.
bool TakeLine(std::string_view* bytes, std::string_view* line) {
  const std::size_t end = bytes->substr(0, kMaxSkippedLineBytes).find('\0');
  if (end == std::string_view::npos) {
    return false;
  }
  *line = bytes->substr(0, end);
  bytes->remove_prefix(end + 1);
  return true;
}

// The value of "key=value" among fields that are separated by question marks.
std::string_view Field(std::string_view line, std::string_view key) {
  while (!line.empty()) {
    const std::size_t end = std::min(line.find('?'), line.size());
    const std::string_view field = line.substr(0, end);
    if (field.size() > key.size() && field.substr(0, key.size()) == key &&
        field[key.size()] == '=') {
      return field.substr(key.size() + 1);
    }
    line.remove_prefix(std::min(end + 1, line.size()));
  }
  return {};
}

bool ReadIdentification(std::string_view line, DescriptionBlock* block, std::string* error) {
  block->name = Field(line, "Name");
  block->fullName = Field(line, "FullName");
  block->version = WholeNumber(Field(line, "Version"), 1'000'000'000);
  block->platform = Field(line, "Platform");
  if (block->name.empty() || block->version < 0) {
    *error = "the identification line lacks Name= or a Version= with a whole number";
    return false;
  }
  return true;
}

bool ReadLengthLine(std::string_view line, int* lengthBytes, std::string* error) {
  const bool hasKey = line.substr(0, kLengthKey.size()) == kLengthKey;
  *lengthBytes = hasKey ? WholeNumber(line.substr(kLengthKey.size()), kMaxDocumentBytes) : -1;
  if (*lengthBytes <= 0) {
    *error = "expected a length line \"compressedXML=\" with a number from 1 to " +
             std::to_string(kMaxDocumentBytes);
    return false;
  }
  return true;
}

bool InflateDocument(std::string_view stream, DescriptionBlock* block, std::string* error) {
  block->compressedBytes = static_cast<int>(stream.size());
  return Inflate(stream, kMaxDocumentBytes, &block->xml, error);
}

// Reads a block behind its start marker.
bool ReadBlock(std::string_view bytes, DescriptionBlock* block, std::string* error) {
  std::string_view line;
  if (!TakeLine(&bytes, &line)) {
    *error = "the identification line does not end";
    return false;
  }
  if (!ReadIdentification(line, block, error)) {
    return false;
  }
  int lengthBytes = 0;
  if (!TakeLine(&bytes, &line)) {
    *error = "the length line does not end";
    return false;
  }
  if (!ReadLengthLine(line, &lengthBytes, error)) {
    return false;
  }
  const auto length = static_cast<std::size_t>(lengthBytes);
  if (bytes.size() < length || bytes.substr(length, kEndMarker.size()) != kEndMarker) {
    *error = "expected the end marker \"<<VADO_XML_END>>\" behind " + std::to_string(lengthBytes) +
             " bytes of compressed document";
    return false;
  }
  return InflateDocument(bytes.substr(0, length), block, error);
}

// At most one byte more than the limit, so that a file that grows meanwhile is noticed.
bool ReadFile(const std::string& path, std::string* bytes, std::string* error) {
  namespace fs = std::filesystem;
  std::error_code failure;
  const fs::file_status status = fs::status(path, failure);
  if (!fs::exists(status)) {
    *error = failure ? failure.message() : std::strerror(ENOENT);
    return false;
  }
  if (!fs::is_regular_file(status)) {
    *error = "expected a driver library, but this is no file";
    return false;
  }
  const std::uintmax_t size = fs::file_size(path, failure);
  if (failure) {
    *error = failure.message();
    return false;
  }
  if (size > kMaxFileBytes) {
    *error = "too large for a driver library: " + std::to_string(size) + " bytes, the limit is " +
             std::to_string(kMaxFileBytes);
    return false;
  }
  errno = 0;
  std::ifstream file(path, std::ios::binary);
  bytes->resize(static_cast<std::size_t>(size));
  file.read(bytes->data(), static_cast<std::streamsize>(size));
  if (!file.is_open() || file.bad()) {
    *error = errno == 0 ? "cannot be read" : std::strerror(errno);
    return false;
  }
  bytes->resize(static_cast<std::size_t>(file.gcount()));
  return true;
}

}  // namespace

bool FindDescription(std::string_view bytes, DescriptionBlock* block, std::string* error) {
  std::string firstReason;
  int markers = 0;
  for (std::size_t at = bytes.find(kStartMarker); at != std::string_view::npos;
       at = bytes.find(kStartMarker, at + kStartMarker.size())) {
    if (++markers > kMaxStartMarkers) {
      break;
    }
    DescriptionBlock candidate;
    std::string reason;
    if (ReadBlock(bytes.substr(at + kStartMarker.size()), &candidate, &reason)) {
      *block = std::move(candidate);
      return true;
    }
    firstReason = firstReason.empty() ? reason : firstReason;
  }
  *error = markers == 0 ? "no description here; expected a driver library with the marker "
                          "\"<<VADO_XML_START>>\""
                        : "the description is damaged: " + firstReason;
  return false;
}

bool FindDescriptionInFile(const std::string& path, DescriptionBlock* block, std::string* error) {
  std::string bytes;
  if (!ReadFile(path, &bytes, error) || !FindDescription(bytes, block, error)) {
    *error = path + ": " + *error;
    return false;
  }
  return true;
}

bool ReadDescriptionAt(const char* lengthLine, DescriptionBlock* block, std::string* error) {
  // The line's longest form; a driver that hands out something else may have less bytes there.
  const std::size_t longest = kLengthKey.size() + std::to_string(kMaxDocumentBytes).size() + 1;
  const std::string_view line(lengthLine, strnlen(lengthLine, longest));
  int lengthBytes = 0;
  if (!ReadLengthLine(line, &lengthBytes, error)) {
    return false;
  }
  return InflateDocument({lengthLine + line.size() + 1, static_cast<std::size_t>(lengthBytes)},
                         block, error);
}
