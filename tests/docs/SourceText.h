// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <string>
#include <vector>

// Source files of the driver as the tests of the manual read them: what C++ cannot enumerate at run
// time stands in their string literals.

// The string literals of a source file, adjacent ones joined, without those in comments, include
// lines and compile-time checks.
std::vector<std::string> LiteralsOf(const std::string& path);

// The named string constants of a header, "kName" to its text.
std::map<std::string, std::string> ConstantsOf(const std::string& path);

// The source files of the driver: the .h and .cpp files of the folders that make the plug-in.
std::vector<std::string> DriverSources();
