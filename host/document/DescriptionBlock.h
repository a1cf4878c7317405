// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

// The block in which a driver library carries its description document. In this order, without
// gaps:
//
//   identification line   "<<VADO_XML_START>>Name=...?FullName=...?Version=...?Platform=...", zero
//   length line           "compressedXML=" and the stream's bytes in decimal, zero
//   stream                the document compressed with zlib (RFC 1950)
//   end marker            "<<VADO_XML_END>>", zero
//
// A running driver hands out the address of the length line; a file is searched for the markers.
struct DescriptionBlock {
  // What the identification line says. FullName and Platform may be empty.
  std::string name;
  std::string fullName;
  int version = 0;
  std::string platform;

  int compressedBytes = 0;
  std::string xml;  // the document, byte for byte
};

// All three: false, with the reason and what was expected in `error`, for anything that is not as
// described above. Nothing is trusted: a length is compared with the bytes that are there, and no
// more than kMaxDocumentBytes are inflated. Any thread.

// What a document and its stream may have. The driver's own document has 14 KB; the limit keeps
// hostile bytes from filling the memory.
constexpr int kMaxDocumentBytes = 1024 * 1024;

// Finds the first whole block in the bytes of a file. A start marker without a block behind it, as
// a program has that searches for blocks, is passed over.
bool FindDescription(std::string_view bytes, DescriptionBlock* block, std::string* error);

// The same in a file, which is read and never loaded, so that it may be of another architecture.
bool FindDescriptionInFile(const std::string& path, DescriptionBlock* block, std::string* error);

// Reads from the length line on, as a loaded driver hands it out. Only compressedBytes and xml are
// set. The caller vouches that a length line is followed by as many bytes as it says.
bool ReadDescriptionAt(const char* lengthLine, DescriptionBlock* block, std::string* error);
