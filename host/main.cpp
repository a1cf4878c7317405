// SPDX-License-Identifier: Apache-2.0
#include "host/commands/CommandLine.h"

int main(int argumentCount, char** arguments) { return RunCommandLine(argumentCount, arguments); }
