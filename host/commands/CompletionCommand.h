// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace CLI {
class App;
}

struct CompletionOptions {
  std::string shell;  // "bash", "zsh" or "fish"
};

void AddCompletion(CLI::App* app, CompletionOptions* options);

// Prints the completion file of a shell, made of the commands as they are. Returns the exit status
// of the program.
int RunCompletion(const CompletionOptions& options);

struct WordsOptions {
  std::string kind;        // "ports", "profiles", "instances", "uris", "console"
  std::string pluginFile;  // for "console"
};

struct ManualPageOptions {
  std::string file;  // a page with marks, see FillManualPage
};

// The hidden command that the build calls for the manual pages.
void AddManualPage(CLI::App* app, ManualPageOptions* options);

// Prints a manual page, its marks filled. Returns the exit status of the program.
int RunManualPage(const ManualPageOptions& options);

// The hidden command that completion files ask.
void AddWords(CLI::App* app, WordsOptions* options);

// Prints words of one kind, one a line: paths of serial ports, names of profiles and of running
// instances, addresses of tags, the driver's console commands. Opens no port. What cannot be found
// out is left out. Returns the exit status of the program.
int RunWords(const WordsOptions& options);
