// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

// Output lines of a command.
std::vector<std::string> RunCommand(const std::string& command);

// Lines of `nm` for defined symbols (address, type, demangled name) that are neither the entry
// point nor in the namespace ProtUtilsN.
std::vector<std::string> UnexpectedExports(const std::vector<std::string>& lines);

// Lines of `nm` for undefined symbols that the language's own libraries do not supply: those carry
// their version, or are weak.
std::vector<std::string> UnexpectedImports(const std::vector<std::string>& lines);
