// SPDX-License-Identifier: Apache-2.0
#include "host/CmdCommand.h"

#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <string_view>

#include "host/ByteText.h"
#include "host/ExitStatus.h"
#include "host/HostEvents.h"
#include "host/Output.h"
#include "host/SessionConsole.h"
#include "host/Utf8Text.h"
#include "host/commands/InstanceAccess.h"

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

std::string Join(const std::vector<std::string>& words) {
  std::string line;
  for (const std::string& word : words) {
    line += (line.empty() ? "" : " ") + word;
  }
  return line;
}

int UsageError(const std::string& text) {
  TellUser(text);
  return static_cast<int>(ExitStatus::kUsage);
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

int RunWithoutPort(const InstanceOptions& options, const std::string& line) {
  HostOptions host;
  host.pluginFile = options.pluginFile;
  HostSession session(host);
  const HostResult result = session.Open();
  if (!result.IsDone()) {
    return TellFailure(options, result);
  }
  if (options.isVerbose || !options.portWords.empty() || !options.configuration.empty()) {
    TellUser("'" + CommandWord(line) + "' needs no port: none is opened, nothing is configured");
  }
  SessionConsole console(&session);
  return ShowReply(console.Run(line), line);
}

// The command goes to the driver of another process; what it does there is told as well.
int RunAttached(Instance* instance, const std::string& line) {
  Answer answer = instance->Call({{"op", "console"}, {"line", CompactHex(line)}});
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

// Null when there is none; then `answer` says whether that is a failure.
std::unique_ptr<Instance> FindRunning(const CmdOptions& options, Answer* answer) {
  InstanceAccess access;
  access.options = options.instance;
  access.configSource = options.instance.configuration;
  access.instanceName = options.instanceName;
  access.isAttachWanted = !options.instanceName.empty();
  return AttachInstance(access, answer);
}

int RunOnPort(const InstanceOptions& options, const std::string& line) {
  HostOptions host;
  std::string error;
  if (!MakeHostOptions(options, &host, &error)) {
    return UsageError(error);
  }
  HostEvents events(TellUser);
  host.observer = &events;
  HostSession session(host);
  HostResult result = session.Open();
  if (result.IsDone()) {
    if (options.isVerbose) {
      TellFiles(session, host);
    }
    result = session.Configure(options.configuration);
  }
  if (result.IsDone()) {
    result = session.Start();
  }
  if (!result.IsDone()) {
    return TellFailure(options, result);
  }
  TellUser("started for this command only:");
  TellSettings(options, host, &session);
  SessionConsole console(&session);
  return ShowReply(console.Run(line), line);
}

}  // namespace

int RunCmd(const CmdOptions& options) {
  const std::string line = Join(options.words);
  if (line.empty()) {
    return UsageError("a console command is missing; loka cmd help lists them");
  }
  if (options.isAttachRefused && !options.instanceName.empty()) {
    return UsageError("--instance and --no-attach contradict each other");
  }
  if (!DescribesDriver(line) && !options.isAttachRefused) {
    Answer answer;
    const auto running = FindRunning(options, &answer);
    if (running != nullptr) {
      return RunAttached(running.get(), line);
    }
    if (!answer.IsDone()) {
      return TellAnswer(answer);
    }
  }
  if (!NeedsPort(line)) {
    return RunWithoutPort(options.instance, line);
  }
  if (options.instance.portWords.empty() || options.instance.configuration.empty()) {
    return UsageError("'" + PrintableUtf8(CommandWord(line)) +
                      "' needs a running instance, or a port and --config; only help, info, xml, "
                      "lasterror, getmaxtm and "
                      "deletetags do without");
  }
  return RunOnPort(options.instance, line);
}
