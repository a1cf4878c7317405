// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "host/document/DescriptionBlock.h"
#include "host/document/DescriptionDocument.h"
#include "host/document/ParameterNotes.h"

// A page for a browser: a form with one input a configuration key, which writes the configuration
// text as it is filled in, and tables of the memory types and the settings. HTML 5 that is
// well-formed XML as well, in UTF-8, complete in itself: it names no outside address and its
// security policy allows none. Any thread.
std::string DescribeAsForm(const DescriptionBlock& block, const DescriptionDocument& document,
                           const ParameterNotes& notes);
