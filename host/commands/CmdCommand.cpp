// SPDX-License-Identifier: Apache-2.0
#include "host/commands/CmdCommand.h"

#include <unistd.h>

#include <CLI/CLI.hpp>
#include <algorithm>
#include <cstdio>
#include <string_view>

#include "host/base/ExitStatus.h"
#include "host/commands/CommandFailure.h"
#include "host/instance/LocalInstance.h"
#include "host/runtime/HostEvents.h"
#include "host/runtime/SessionConsole.h"
#include "host/text/ByteText.h"
#include "host/text/Output.h"
#include "host/text/Utf8Text.h"

namespace {

// The driver answers these without a configuration. Every other command is about the line, or about
// settings and tags that a driver has while it is started.
constexpr std::string_view kCommandsWithoutPort[] = {"help",      "info",     "xml",
                                                     "lasterror", "getmaxtm", "deletetags"};

std::string CommandWord(const std::string& line) { return line.substr(0, line.find(' ')); }

bool NeedsPort(const std::string& line) {
  const std::string word = CommandWord(line);
  return std::find(std::begin(kCommandsWithoutPort), std::end(kCommandsWithoutPort), word) ==
         std::end(kCommandsWithoutPort);
}

// What every driver of this kind answers in the same way, whatever it does.
bool DescribesDriver(const std::string& line) {
  const std::string word = CommandWord(line);
  return word == "help" || word == "xml" || word == "getmaxtm";
}

std::string JoinWords(const std::vector<std::string>& words) {
  std::string line;
  for (const std::string& word : words) {
    line += (line.empty() ? "" : " ") + word;
  }
  return line;
}

// A reply may hold bytes of a device, which could steer a terminal; programs get it as it stands.
std::string ForStream(const ConsoleReply& reply, int fileDescriptor) {
  std::string text = isatty(fileDescriptor) != 0 ? PrintableUtf8(reply.text) : reply.text;
  if (!text.empty() && text.back() != '\n') {
    text += '\n';
  }
  return text;
}

// Returns the exit status of the program.
int ShowReply(const ConsoleReply& reply, const std::string& line) {
  if (reply.isCut) {
    TellUser("the reply is cut after " + std::to_string(reply.text.size()) + " bytes");
  }
  if (reply.isDone) {
    const bool isWritten = WriteResult(ForStream(reply, STDOUT_FILENO));
    return static_cast<int>(isWritten ? ExitStatus::kDone : ExitStatus::kRefused);
  }
  if (reply.text.empty()) {
    TellUser("the driver does not know the command '" + PrintableUtf8(CommandWord(line)) +
             "'; loka cmd help lists its commands");
  } else {
    (void)std::fputs(ForStream(reply, STDERR_FILENO).c_str(), stderr);
  }
  return static_cast<int>(ExitStatus::kRefused);
}

int RunWithoutPort(const InstanceAccess& access, const std::string& line) {
  HostOptions host;
  host.pluginFile = access.options.pluginFile;
  HostSession session(host);
  const HostResult result = session.Open();
  if (!result.IsDone()) {
    return TellFailure(access.options, result);
  }
  if (access.verbosity > 0 || !access.options.configuration.empty()) {
    TellUser("'" + CommandWord(line) + "' needs no port: none is opened, nothing is configured");
  }
  SessionConsole console(&session);
  return ShowReply(console.Run(line), line);
}

int RunOn(Instance* instance, const std::string& line) {
  const Answer answer = instance->Call({{"op", "console"}, {"line", CompactHex(line)}});
  ConsoleReply reply;
  const std::string hexReply = answer.data.value("reply", "-");
  if (!ParseHexBytes(hexReply, &reply.text)) {
    return EndOf(*instance, answer);
  }
  reply.isDone = answer.IsDone();
  reply.isCut = answer.data.value("cut", false);
  const int status = ShowReply(reply, line);
  for (const std::string& hint : answer.hints) {
    TellUser(hint);
  }
  return status;
}

// The running instance, else one of its own.
int RunWithPort(const InstanceAccess& access, const std::string& line) {
  if (access.options.portWords.empty() || access.options.configuration.empty()) {
    return Fail(ExitStatus::kUsage,
                "'" + PrintableUtf8(CommandWord(line)) +
                    "' needs a running instance, or a port; only help, info, xml, "
                    "lasterror, getmaxtm and deletetags do without");
  }
  Answer answer;
  const auto instance = BeginInstance(access, &answer);
  if (instance == nullptr) {
    return TellAnswer(answer);
  }
  if (!access.isQuiet) {
    TellUser("started for this command only");
  }
  return RunOn(instance.get(), line);
}

// No command has a slash or a sign in its first word; a path and comN=PATH do.
bool LooksLikePort(const std::string& word) {
  const std::size_t mark = word.find_first_of(" /=");
  return mark != std::string::npos && word[mark] != ' ';
}

}  // namespace

void AddCmd(CLI::App* app, CmdOptions* options) {
  CLI::App* const cmd = app->add_subcommand("cmd", "Run one console command of the driver");
  AddInstanceAccess(cmd, &options->access);
  // For the help only: CutConsoleWords takes the words away before they are parsed.
  cmd->add_option("WORD", options->words, "The command; its words end the options")
      ->type_name("")
      ->expected(-1);
  cmd->footer("Example: loka cmd /dev/ttyUSB0 -b 9600 -p none put hello world");
}

std::vector<std::string> CutConsoleWords(const CLI::App& command, std::vector<std::string>* words) {
  bool hasPort = false;
  std::size_t at = 1;
  for (; at < words->size(); ++at) {
    const std::string& word = (*words)[at];
    if (word == "--") {
      break;
    }
    if (!word.empty() && word.front() == '-') {
      const CLI::Option* const option = command.get_option_no_throw(word);
      if (option != nullptr && option->get_items_expected_max() > 0) {
        ++at;
      }
    } else if (!hasPort && LooksLikePort(word)) {
      hasPort = true;
    } else {
      break;
    }
  }
  const auto first = words->begin() + static_cast<std::ptrdiff_t>(std::min(at, words->size()));
  std::vector<std::string> cut(first, words->end());
  words->erase(first, words->end());
  if (!cut.empty() && cut.front() == "--") {
    cut.erase(cut.begin());
  }
  return cut;
}

int RunCmd(CmdOptions* options) {
  InstanceAccess& access = options->access;
  access.acknowledges = false;
  access.connects = false;
  const std::string line = JoinWords(options->words);
  if (line.empty()) {
    return Fail(ExitStatus::kUsage, "a console command is missing; loka cmd help lists them");
  }
  Answer answer;
  if (!Resolve(&access, &answer)) {
    return TellAnswer(answer);
  }
  if (!DescribesDriver(line) && !access.isAttachRefused) {
    const auto running = AttachInstance(access, &answer);
    if (running != nullptr) {
      return RunOn(running.get(), line);
    }
    if (!answer.IsDone()) {
      return TellAnswer(answer);
    }
  }
  return NeedsPort(line) ? RunWithPort(access, line) : RunWithoutPort(access, line);
}
