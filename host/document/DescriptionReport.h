// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "host/document/DescriptionBlock.h"
#include "host/document/DescriptionDocument.h"

// A description for people and for programs. Any thread.

// Identity, configuration keys and memory types as tables, safe for a terminal. Ends with a line
// feed.
std::string DescribeAsText(const DescriptionBlock& block, const DescriptionDocument& document);

// Everything that the document says as one JSON object, indented by two blanks, in UTF-8, ending
// with a line feed. The keys are part of the program's interface: they may be added to, not
// changed.
//
//   module       name, fullName, version, platform (null when the driver was loaded, which does
//                not tell it)
//   properties   the flags and identity elements by name; true and false as such, whole numbers
//                as numbers
//   parameters   key, display, type, listType, group, default, isNodeProperty, isDistinct,
//                isMandatory, min, max, entries; null for what a parameter does not have
//   memoryTypes  name, display, naturalType, vadoTypes (a number), min, max, blockReadCount,
//                blockWriteCount and the ten flags
//   tagFields    name, display, type, default, isMandatory
//   models       name, display, datagramCount, datagramLength, memoryTypes (name, min, max)
std::string DescribeAsJson(const DescriptionBlock& block, const DescriptionDocument& document);
