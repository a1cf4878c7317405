// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <zlib.h>

#include <fstream>
#include <iterator>
#include <stdexcept>
#include <string>

#include "tests/support/PluginLibrary.h"

// Library files for the tests, made around a description block. None of them can be loaded.

inline std::string ReadAll(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}

inline std::string WriteAll(const std::string& path, const std::string& bytes) {
  std::ofstream(path, std::ios::binary) << bytes;
  return path;
}

inline std::string Compress(const std::string& text) {
  uLongf length = compressBound(text.size());
  std::string stream(length, '\0');
  if (compress(reinterpret_cast<Bytef*>(stream.data()), &length,
               reinterpret_cast<const Bytef*>(text.data()), text.size()) != Z_OK) {
    throw std::runtime_error("zlib");
  }
  stream.resize(length);
  return stream;
}

constexpr const char* kIdentification = "Name=LOKA?FullName=Loka Serial?Version=111?Platform=ANY";

// A block with everything in its place.
inline std::string BlockOf(const std::string& stream,
                           const std::string& identification = kIdentification) {
  const std::string zero(1, '\0');
  return "<<VADO_XML_START>>" + identification + zero +
         "compressedXML=" + std::to_string(stream.size()) + zero + stream + "<<VADO_XML_END>>" +
         zero;
}

// The block of the plug-in of this build, cut out of its file.
inline std::string PluginBlock() {
  const std::string bytes = ReadAll(PluginLibrary::DefaultPath());
  const std::size_t start = bytes.find("<<VADO_XML_START>>");
  const std::string endMarker("<<VADO_XML_END>>\0", 17);
  const std::size_t end = bytes.find(endMarker, start);
  if (start == std::string::npos || end == std::string::npos) {
    throw std::runtime_error("the plug-in has no block");
  }
  return bytes.substr(start, end - start + endMarker.size());
}

// The stream in a block.
inline std::string StreamOf(const std::string& block) {
  const std::size_t lengthLine = block.find('\0') + 1;
  const std::size_t stream = block.find('\0', lengthLine) + 1;
  return block.substr(stream, block.size() - stream - 17);
}

// Something that looks like a 32-bit ARM library up to its header, with the block behind it.
inline std::string ArmLibrary(const std::string& block) {
  std::string header(
      "\x7F"
      "ELF\x01\x01\x01\0\0\0\0\0\0\0\0\0\x03\0\x28\0\x01\0\0\0",
      24);
  header.resize(1024, '\x5A');
  return header + block + std::string(777, '\xC3');
}

// The smallest document that is a description.
inline std::string SmallDocument() {
  return "<?xml version=\"1.0\" encoding=\"utf-8\"?>\n<protocol_cfg><name>X</name><parameters/>"
         "<memtypes/><tag_uri/><models/></protocol_cfg>\n";
}
