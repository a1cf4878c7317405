// SPDX-License-Identifier: Apache-2.0
#include "driver/Xml_LOKA.h"

#include "Xml_LOKA_stream.h"

namespace {

#define LOKA_XML_IDENTIFICATION \
  "<<VADO_XML_START>>Name=LOKA?FullName=Loka Serial?Version=111?Platform=QM77_LIN"
#define LOKA_XML_LENGTH_LINE "compressedXML=" XML_STREAM_LENGTH_TEXT
#define LOKA_XML_END "<<VADO_XML_END>>"

// Bytes only, so that nothing stands between the pieces.
struct XmlBlock {
  char identification[sizeof LOKA_XML_IDENTIFICATION];
  char lengthLine[sizeof LOKA_XML_LENGTH_LINE];
  unsigned char stream[XML_STREAM_LENGTH];
  char endMarker[sizeof LOKA_XML_END];
};

static_assert(sizeof(XmlBlock) == sizeof LOKA_XML_IDENTIFICATION + sizeof LOKA_XML_LENGTH_LINE +
                                      XML_STREAM_LENGTH + sizeof LOKA_XML_END,
              "the block has to be contiguous");

const XmlBlock Xml_LOKA = {LOKA_XML_IDENTIFICATION, LOKA_XML_LENGTH_LINE, XML_STREAM_BYTES,
                           LOKA_XML_END};

}  // namespace

const char* GetXml_LOKA() { return Xml_LOKA.lengthLine; }
