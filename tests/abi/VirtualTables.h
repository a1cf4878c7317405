// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <string>
#include <vector>

// The slots of each class, by the class's name. In a slot stands the operation's name with its
// parameters, or "destructor, complete" and "destructor, deleting".
using SlotTables = std::map<std::string, std::vector<std::string>>;

// Adds the tables of the concrete classes that an object file of this build's processor defines;
// classes of the language's own library are left out. Throws std::runtime_error when the file
// cannot be read as one.
void AddSlotTables(const std::string& objectFile, SlotTables& tables);

// "Class" lines, below each its slots as "  number operation".
std::string FormatSlotTables(const SlotTables& tables);
