// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

struct DescriptionDocument;

// Where a driver's description document says something else about its configuration than ConfigKeys
// does, one line a difference; empty when the two agree. Any thread.
std::vector<std::string> DocumentDifferences(const DescriptionDocument& document);
