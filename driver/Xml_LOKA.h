// SPDX-License-Identifier: Apache-2.0
#pragma once

// The driver's description document for the host's configurator, in the form in which the library
// carries it: a block of constant data that tools also find by scanning the library file for its
// markers. In this order, without gaps:
//
//   identification line   begins with "<<VADO_XML_START>>"; short name, display name, version,
//                         platform; one zero byte
//   length line           "compressedXML=" and the stream's length in bytes; one zero byte
//   stream                the document compressed with zlib (RFC 1950)
//   end marker            "<<VADO_XML_END>>"; one zero byte
//
// The document's text stands in Xml_LOKA.xml; the build compresses it.

// The length line; the stream follows behind its zero byte. Any thread.
const char* GetXml_LOKA();
