// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "host/document/DescriptionBlock.h"
#include "host/document/DescriptionDocument.h"
#include "host/document/ParameterNotes.h"

// A JSON Schema (2020-12) of the driver's configuration, written as an object with one member a
// key: types, entries of lists, ranges, defaults, the keys that must be there and no others.
// Indented by two blanks, ends with a line feed. Any thread.
std::string DescribeAsSchema(const DescriptionBlock& block, const DescriptionDocument& document,
                             const ParameterNotes& notes);
