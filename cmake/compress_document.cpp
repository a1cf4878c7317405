// SPDX-License-Identifier: Apache-2.0
//
// Build tool, run on the build machine: compresses a text file with zlib's default compression and
// writes the stream as C++ source.
//
//   compress_document INPUT OUTPUT
//
// The output defines XML_STREAM_LENGTH (the stream's bytes, as a number), XML_STREAM_LENGTH_TEXT
// (the same as a string literal) and XML_STREAM_BYTES (an initialiser list).

#include <zlib.h>

#include <fstream>
#include <iostream>
#include <iterator>
#include <string>
#include <vector>

int main(int argc, char** argv) {
  if (argc != 3) {
    std::cerr << "usage: compress_document INPUT OUTPUT\n";
    return 2;
  }
  std::ifstream input(argv[1], std::ios::binary);
  const std::string text((std::istreambuf_iterator<char>(input)), std::istreambuf_iterator<char>());
  if (!input || text.empty()) {
    std::cerr << "compress_document: cannot read " << argv[1] << '\n';
    return 1;
  }
  uLongf length = compressBound(text.size());
  std::vector<unsigned char> stream(length);
  if (compress(stream.data(), &length, reinterpret_cast<const unsigned char*>(text.data()),
               text.size()) != Z_OK) {
    std::cerr << "compress_document: zlib failed\n";
    return 1;
  }
  std::ofstream output(argv[2], std::ios::binary);
  output << "// Made from the document's text by the build; do not edit.\n"
         << "#define XML_STREAM_LENGTH " << length << '\n'
         << "#define XML_STREAM_LENGTH_TEXT \"" << length << "\"\n"
         << "#define XML_STREAM_BYTES { ";
  for (uLongf i = 0; i < length; ++i) {
    output << static_cast<unsigned int>(stream[i]) << ", ";
  }
  output << "}\n";
  output.close();
  return output ? 0 : 1;
}
