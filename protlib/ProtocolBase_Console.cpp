// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <memory>

#include "interfaces/IMultiTask2.h"
#include "interfaces/ISerialFactory.h"
#include "interfaces/ISocketFactory.h"
#include "interfaces/ITag.h"
#include "protlib/ConsoleCommand.h"
#include "protlib/ConsoleTexts.h"
#include "protlib/HostInterfaces.h"
#include "protlib/ProtUtilsN.h"
#include "protlib/ProtocolBase.h"
#include "protlib/WorkBuffer.h"

namespace {

constexpr int kProtocolBaseVersion = 100;
constexpr std::size_t kStackBytes = 64;

// --- information text ---

// Appends "prefix + name + open + version + close + line end". False when the name is null, which
// ends the whole text behind the prefix.
bool AppendVersionLine(std::string& text, const char* prefix, const char* name, int version) {
  text += prefix;
  if (name == nullptr) {
    return false;
  }
  text.append(name).append(" v.").append(std::to_string(version)).append("\n");
  return true;
}

bool AppendService(std::string& text, const INamedInterface* service) {
  return service == nullptr ||
         AppendVersionLine(text, "", service->GetImpName(), service->GetImpVersion());
}

std::string InfoText(const ProtocolBase& protocol) {
  std::string text = "Protocol: ";
  const char* const name = protocol.GetName();
  if (name == nullptr) {
    return text;
  }
  text.append(name).append(" (").append(std::to_string(protocol.GetProtocolType()));
  text.append(") v.").append(std::to_string(protocol.GetProtocolVersion())).append("\n");
  if (!AppendVersionLine(text, "Implementation: ", protocol.GetImpName(),
                         protocol.GetImpVersion())) {
    return text;
  }
  AppendVersionLine(text, "", "ProtocolBase", kProtocolBaseVersion);
  text.append("ProtLib v.").append(std::to_string(ProtUtilsN::GetVersion())).append("\n");
  if (!protocol.IsConverted() && AppendService(text, piMultiTask) &&
      AppendService(text, piSerialFactory)) {
    AppendService(text, piSocketFactory);
  }
  return text;
}

// --- hexadecimal data ---

// Writes the bytes as hexadecimal text, a line feed and a zero into the reply, in place. A byte
// takes two characters and is written only while more than four are left; nothing is written past
// the end.
void ReplyHex(const ConsoleCommand& command, const unsigned char* bytes, int lengthBytes) {
  constexpr const char* kDigits = "0123456789abcdef";
  constexpr int kRoomToKeep = 4;
  char* out = command.Reply();
  int room = command.Reply() == nullptr ? 0 : command.ReplyBytes();
  for (int i = 0; i < lengthBytes && room > kRoomToKeep; ++i) {
    *out++ = kDigits[bytes[i] >> 4U];
    *out++ = kDigits[bytes[i] & 0x0FU];
    room -= 2;
  }
  if (room > 0) {
    *out++ = '\n';
  }
  if (room > 1) {
    *out = '\0';
  }
}

// The value of a hexadecimal digit, or -1.
int DigitValue(char c) {
  if (c >= '0' && c <= '9') {
    return c - '0';
  }
  if (c >= 'a' && c <= 'f') {
    return c - 'a' + 10;
  }
  return c >= 'A' && c <= 'F' ? c - 'A' + 10 : -1;
}

// False at the first character that is no digit. `bytes` has room for half the text's length.
bool DecodeHex(const std::string& text, unsigned char* bytes) {
  for (std::size_t i = 0; i < text.size(); i += 2) {
    const int high = DigitValue(text[i]);
    const int low = DigitValue(text[i + 1]);
    if (high < 0 || low < 0) {
      return false;
    }
    bytes[i / 2] = static_cast<unsigned char>(high * 16 + low);
  }
  return true;
}

}  // namespace

int ProtocolBase::GetInfo(char* buffer, int sizeBytes) const {
  if (buffer == nullptr || sizeBytes < 0) {
    SetArgumentError();
    return 0;
  }
  return Guarded(0, [&] {
    const std::string text = InfoText(*this);
    const std::size_t length = std::min(text.size(), static_cast<std::size_t>(sizeBytes));
    std::copy_n(text.data(), length, buffer);  // no terminating zero is wanted
    return static_cast<int>(length);
  });
}

bool ProtocolBase::DoCommand(const char* command, char* reply, int sizeBytes) {
  if (command == nullptr) {
    return false;
  }
  return Guarded(false, [&] {
    const ConsoleCommand parsed(command, reply, sizeBytes);
    return RunCommand(parsed);
  });
}

bool ProtocolBase::RunCommand(const ConsoleCommand& command) {
  const std::string& name = command.Name();
  if (name == "help") {
    return command.Answer(ConsoleTexts::kHelp, true);
  }
  if (name == "info") {
    CommandInfo(command);
    return true;
  }
  if (name == "xml") {
    const char* const document = GetXml();
    return command.Answer(document == nullptr ? "" : document, true);
  }
  if (name == "lasterror") {
    return command.Answer(error_.Text(), true);
  }
  if (name == "read") {
    CommandRead(command);
    return true;
  }
  if (name == "write") {
    CommandWrite(command);
    return true;
  }
  if (name == "getmaxtm") {
    return command.Answer("maxtm = " + std::to_string(GetMaxTm(nullptr)) + " ms\n", true);
  }
  if (name == "deletetags") {
    DeleteTags();
    return true;
  }
  return false;
}

// A tag for the length of one command. It joins the tag list and leaves it again on every path.
class ProtocolBase::CommandTag {
 public:
  CommandTag(ProtocolBase& owner, const std::string& uri)
      : owner_(owner), tag_(owner.CreateTag(uri.c_str())) {}
  ~CommandTag() { owner_.FreeTag(tag_); }
  CommandTag(const CommandTag&) = delete;
  CommandTag& operator=(const CommandTag&) = delete;

  const ITag* Get() const { return tag_; }

 private:
  ProtocolBase& owner_;
  ITag* tag_;
};

void ProtocolBase::CommandInfo(const ConsoleCommand& command) const {
  if (command.Reply() == nullptr || command.ReplyBytes() <= 0) {
    return;
  }
  const int length = GetInfo(command.Reply(), command.ReplyBytes());
  if (length < command.ReplyBytes()) {
    std::memset(command.Reply() + length, 0,
                static_cast<std::size_t>(command.ReplyBytes() - length));
  }
}

void ProtocolBase::CommandRead(const ConsoleCommand& command) {
  constexpr std::size_t kWords = 2;
  if (command.WordCount() != kWords) {
    command.Answer(ConsoleTexts::kReadWithoutUri, true);
    return;
  }
  const CommandTag tag(*this, command.Argument());
  if (tag.Get() == nullptr) {
    command.Answer(error_.Text(), true);
    return;
  }
  WorkBuffer<kStackBytes> value(tag.Get()->GetVarLength());
  if (!value.IsValid()) {
    SetMemoryError();
  }
  if (!value.IsValid() || Read(tag.Get(), value.Data()) == 0) {
    command.Answer(error_.Text(), true);
    return;
  }
  ReplyHex(command, value.Data(), tag.Get()->GetVarLength());
}

void ProtocolBase::CommandWrite(const ConsoleCommand& command) {
  constexpr std::size_t kWords = 3;
  if (command.WordCount() != kWords) {
    command.Answer(ConsoleTexts::kWriteWithoutData, true);
    return;
  }
  const CommandTag tag(*this, command.Argument());
  if (tag.Get() == nullptr) {
    command.Answer(error_.Text(), true);
    return;
  }
  const std::string& hexData = command.Word(2);
  const long long lengthBytes = tag.Get()->GetVarLength();
  if (static_cast<long long>(hexData.size()) != 2 * lengthBytes) {
    command.Answer(ConsoleTexts::kWrongDataLength, true);
    return;
  }
  WorkBuffer<kStackBytes> value(lengthBytes);
  if (value.IsValid() && !DecodeHex(hexData, value.Data())) {
    command.Answer(ConsoleTexts::kWrongHexData, true);
    return;
  }
  if (!value.IsValid()) {
    SetMemoryError();
  }
  const bool isWritten = value.IsValid() && Write(tag.Get(), value.Data()) != 0;
  command.Answer(isWritten ? std::string(ConsoleTexts::kWritten) : error_.Text(), true);
}
