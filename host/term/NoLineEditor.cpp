// SPDX-License-Identifier: Apache-2.0
// Stands in for LibeditLine.cpp where the program is built without it.
#include "host/term/LineEditor.h"

bool LineEditor::IsBuiltIn() { return false; }

std::unique_ptr<LineEditor> LineEditor::Make(int /*keysDescriptor*/, int /*screenDescriptor*/,
                                             const std::string& /*historyFile*/,
                                             std::string* error) {
  *error = "built without line editing";
  return nullptr;
}
