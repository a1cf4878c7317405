// SPDX-License-Identifier: Apache-2.0
// Stands in for SpdlogFile.cpp where the program is built without it.
#include "host/log/LogFile.h"

bool LogFile::IsBuiltIn() { return false; }

// The signature is that of the file which keeps the handler.
// NOLINTNEXTLINE(performance-unnecessary-value-param)
std::unique_ptr<LogFile> LogFile::Open(const std::string& /*path*/, ProblemHandler /*onProblem*/,
                                       std::string* error) {
  *error = "log file: built without logs";
  return nullptr;
}
