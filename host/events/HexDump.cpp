// SPDX-License-Identifier: Apache-2.0
#include "host/events/HexDump.h"

#include "host/text/ByteText.h"

std::string HexDump(std::string_view bytes) {
  std::string text = HexBytes(bytes) + "   ";
  for (const char character : bytes) {
    const bool isPrintable = character >= 0x20 && character < 0x7F;
    text += isPrintable ? character : '.';
  }
  return text;
}
