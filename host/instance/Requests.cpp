// SPDX-License-Identifier: Apache-2.0
#include "host/instance/Requests.h"

#include <unistd.h>

#include <algorithm>
#include <array>
#include <optional>
#include <utility>

#include "host/events/EventStream.h"
#include "host/events/Statistics.h"
#include "host/instance/TagValue.h"
#include "host/instance/TrapHints.h"
#include "host/port/PortAdvice.h"
#include "host/runtime/HostSession.h"
#include "host/runtime/HostTag.h"
#include "host/runtime/SessionConsole.h"
#include "host/text/ByteText.h"
#include "host/text/FirstWord.h"
#include "interfaces/IProtocol.h"

namespace {

using Json = nlohmann::json;

constexpr const char* kConnectUri = "0?connect?boolean";
constexpr const char* kDoneUri = "0?SP_Done?boolean";
constexpr const char* kWaitingUri = "0?tokens_available?unsignedInt";
constexpr const char* kAcknowledgeUri = "0?token_ack?boolean";
constexpr const char* kCannotOpen = "Can't open serial port";

// Every memory type with the data type to show it with, in the order of the driver's catalogue.
struct CatalogueEntry {
  const char* memoryType;
  const char* tagType;
  const char* access;
};
constexpr std::array<CatalogueEntry, 19> kCatalogue = {{
    {"tx_token", "string-1024", "write"},
    {"rx_token", "string-4096", "read"},
    {"rx_token_len", "unsignedInt", "read"},
    {"tokens_available", "unsignedInt", "read"},
    {"token_ack", "boolean", "write"},
    {"connect", "boolean", "read, write"},
    {"SP_Baud", "unsignedInt", "read, write"},
    {"SP_Bits", "unsignedByte", "read, write"},
    {"SP_Stop", "unsignedByte", "read, write"},
    {"SP_Par", "unsignedByte", "read, write"},
    {"SP_Mode", "unsignedByte", "read, write"},
    {"SP_RxPrefix", "string-4096", "read, write"},
    {"SP_RxSuffix", "string-4096", "read, write"},
    {"SP_Gap", "unsignedInt", "read, write"},
    {"SP_TxPrefix", "string-4096", "read, write"},
    {"SP_TxSuffix", "string-4096", "read, write"},
    {"SP_HexTokens", "boolean", "read, write"},
    {"SP_TokenQueueSize", "unsignedInt", "read, write"},
    {"SP_Done", "boolean", "read, write"},
}};

// The memory type of "0?SP_Baud?unsignedInt". The driver allows blanks around it.
std::string MemoryTypeOf(const std::string& uri) {
  const std::size_t begin = uri.find('?');
  if (begin == std::string::npos) {
    return "";
  }
  const std::string field = uri.substr(begin + 1, uri.find('?', begin + 1) - begin - 1);
  const std::size_t first = field.find_first_not_of(" \t");
  return first == std::string::npos
             ? ""
             : field.substr(first, field.find_last_not_of(" \t") - first + 1);
}

// Refused by the driver without a word when the value is out of range.
bool RefusesSilently(const std::string& memoryType) {
  return memoryType == "SP_Par" || memoryType == "SP_Bits" || memoryType == "SP_Stop" ||
         memoryType == "SP_Mode";
}

Answer DriverRefusal(const HostTag& tag) {
  Answer answer = Refusal(tag.Error());
  answer.errorCode = tag.ErrorCode();
  return answer;
}

// A text of the request; the empty text when it is not there.
std::string TextOf(const Json& request, const char* key) {
  const auto found = request.find(key);
  return found != request.end() && found->is_string() ? found->get<std::string>() : std::string();
}

// Names of the keys that a request must have as texts, and of those that must be hexadecimal.
struct RequestKeys {
  std::vector<const char*> texts;
  std::vector<const char*> hexTexts;
};

bool HasKeys(const Json& request, const RequestKeys& keys, std::string* error) {
  for (const char* const key : keys.texts) {
    if (!request.contains(key) || !request[key].is_string()) {
      *error = std::string("expected a text under \"") + key + "\"";
      return false;
    }
  }
  for (const char* const key : keys.hexTexts) {
    std::string bytes;
    if (!request.contains(key) || !request[key].is_string() ||
        !ParseHexBytes(request[key].get_ref<const std::string&>(), &bytes)) {
      *error = std::string("expected hexadecimal digits under \"") + key + "\"";
      return false;
    }
  }
  return true;
}

// Console commands that change neither the settings nor the queue.
bool OnlyLooks(const std::string& command) {
  constexpr std::array<const char*, 10> kCommands = {
      "help",     "info",     "xml", "lasterror",        "read",
      "getmaxtm", "get_stat", "get", "tokens_available", "get_token_length"};
  return command == "put" ||
         std::find(kCommands.begin(), kCommands.end(), command) != kCommands.end();
}

// Texts travel as hexadecimal digits where they may hold any byte.
std::string BytesOf(const Json& request, const char* key) {
  std::string bytes;
  (void)ParseHexBytes(TextOf(request, key), &bytes);
  return bytes;
}

}  // namespace

Requests::Requests(HostSession* session, EventStream* events, const Statistics* statistics,
                   Info info)
    : session_(session),
      events_(events),
      statistics_(statistics),
      info_(std::move(info)),
      settings_(info_.configuration) {}

Requests::~Requests() = default;

void Requests::ReadActiveSettings() {
  const std::lock_guard<std::mutex> lock(driverMutex_);
  NoteActiveSettings();
}

void Requests::NoteActiveSettings() {
  for (const SettingEntry& setting : kSettingTable) {
    const Answer answer = Read(TagUri(setting));
    if (answer.IsDone()) {
      settings_.Of(setting).active = ShowSetting(setting, BytesOf(answer.data, "value"));
      settings_.Of(setting).staged.reset();
    }
  }
  framing_.OnApplied(settings_);
}

Answer Requests::Handle(const Json& request) {
  if (!request.is_object()) {
    return Refusal("expected a JSON object with the key \"op\"", ExitStatus::kUsage);
  }
  ++waitingRequests_;
  const std::lock_guard<std::mutex> lock(driverMutex_);
  --waitingRequests_;
  return Dispatch(TextOf(request, "op"), request);
}

Answer Requests::Dispatch(const std::string& op, const Json& request) {
  using Handler = Answer (Requests::*)(const Json&);
  struct Operation {
    const char* name = nullptr;
    Handler handler = nullptr;
    RequestKeys keys;
  };
  static const std::array<Operation, 14> kOperations = {{
      {"info", &Requests::HandleInfo, {}},
      {"read", &Requests::HandleRead, {{"uri"}, {}}},
      {"write", &Requests::HandleWrite, {{"uri"}, {"value"}}},
      {"console", &Requests::HandleConsole, {{}, {"line"}}},
      {"send", &Requests::HandleSend, {{}, {"hex"}}},
      {"ack", &Requests::HandleAcknowledge, {}},
      {"waiting", &Requests::HandleWaiting, {}},
      {"tags", &Requests::HandleTags, {}},
      {"settings", &Requests::HandleSettings, {}},
      {"stage", &Requests::HandleStage, {{"key", "value"}, {}}},
      {"done", &Requests::HandleDone, {}},
      {"connect", &Requests::HandleConnect, {{"state"}, {}}},
      {"stats", &Requests::HandleStats, {}},
      {"lines", &Requests::HandleLines, {}},
  }};
  for (const Operation& operation : kOperations) {
    if (op != operation.name) {
      continue;
    }
    std::string error;
    return HasKeys(request, operation.keys, &error) ? (this->*operation.handler)(request)
                                                    : Refusal(error, ExitStatus::kUsage);
  }
  return Refusal("no operation \"" + EscapeBytes(op) + "\"", ExitStatus::kUsage);
}

std::unique_ptr<HostTag> Requests::MakeTag(const std::string& uri, Answer* answer) {
  auto tag = session_->CreateTag(uri, &answer->text);
  if (tag == nullptr) {
    answer->status = ExitStatus::kRefused;
    answer->errorCode = session_->Protocol()->GetLastError();
    answer->hints = HintsForUri(uri);
  }
  return tag;
}

Answer Requests::Read(const std::string& uri) {
  Answer answer;
  const auto tag = MakeTag(uri, &answer);
  if (tag == nullptr) {
    return answer;
  }
  std::string bytes;
  if (!tag->ReadBytes(&bytes)) {
    return DriverRefusal(*tag);
  }
  answer.data["value"] = CompactHex(ShowTagValue(tag->Tag(), bytes));
  answer.data["isText"] = IsTextTag(tag->Tag());
  return answer;
}

Answer Requests::Write(const std::string& uri, const std::string& value) {
  Answer answer;
  const auto tag = MakeTag(uri, &answer);
  if (tag == nullptr) {
    return answer;
  }
  std::string bytes;
  std::string error;
  if (!ParseTagValue(tag->Tag(), value, &bytes, &error)) {
    return Refusal(error, ExitStatus::kUsage);
  }
  const std::string memoryType = MemoryTypeOf(uri);
  const std::string textBefore = tag->Error();
  if (!tag->WriteBytes(bytes)) {
    answer = DriverRefusal(*tag);
    // Where the driver says nothing, what stands there belongs to an earlier call.
    if (RefusesSilently(memoryType) && answer.text == textBefore) {
      answer = Refusal("the driver refuses the value");
    }
    const SettingEntry* const setting = FindSettingOfMemoryType(memoryType);
    if (setting != nullptr) {
      answer.hints.push_back(std::string(setting->key) + " is " + AllowedValues(*setting));
    }
  }
  if (!tag->StoreError().empty()) {
    answer.data["storeError"] = tag->StoreError();
  }
  return answer;
}

unsigned int Requests::ReadNumber(const std::string& uri) {
  Answer answer;
  unsigned int number = 0;
  const auto tag = MakeTag(uri, &answer);
  return tag != nullptr && tag->ReadNumber(&number) ? number : 0;
}

Answer Requests::HandleInfo(const Json& /*request*/) {
  Answer answer;
  answer.data = {
      {"port", events_->Port()},          {"path", info_.path},       {"pid", getpid()},
      {"config", info_.configuration},    {"store", info_.storeFile}, {"ident", session_->Ident()},
      {"plugin", session_->PluginPath()}, {"ack", info_.acknowledges}};
  return answer;
}

Answer Requests::HandleRead(const Json& request) {
  const std::string uri = TextOf(request, "uri");
  Answer answer = Read(uri);
  const std::string memoryType = MemoryTypeOf(uri);
  if (memoryType == "rx_token") {
    const unsigned int length = ReadNumber("0?rx_token_len?unsignedInt");
    if (!answer.IsDone()) {
      answer.hints = HintsForLongToken(answer.text, length);
    } else if (answer.data["isText"] == true) {
      answer.hints = HintsForCutToken(BytesOf(answer.data, "value").size(), length);
    }
  }
  return answer;
}

Answer Requests::HandleWrite(const Json& request) {
  const std::string uri = TextOf(request, "uri");
  const std::string value = BytesOf(request, "value");
  const std::string memoryType = MemoryTypeOf(uri);
  if (memoryType == "SP_Done") {
    return Done(uri, value);
  }
  const bool wasConnected = IsConnected();
  const SettingEntry* const setting = FindSettingOfMemoryType(memoryType);
  Answer answer = Write(uri, value);
  if (memoryType == "token_ack" || memoryType == "connect") {
    ++headVersion_;
    ++settingsVersion_;
  }
  if (answer.IsDone() && setting != nullptr) {
    NoteStaged(*setting, &answer);
  }
  if (memoryType == "connect") {
    // The driver takes what is no change of the state as a token to send.
    if (answer.IsDone() && wasConnected && IsConnected()) {
      answer.hints.emplace_back(kHintConnectTwice);
    }
    ExplainConnect(wasConnected, &answer);
    NoteConnection(wasConnected);
  }
  return answer;
}

bool Requests::IsConnected() { return ReadNumber(kConnectUri) != 0; }

void Requests::NoteConnection(bool wasConnected) {
  const bool isConnected = IsConnected();
  if (isConnected != wasConnected) {
    ++settingsVersion_;
    events_->Publish(PortChanged{isConnected ? "open" : "closed", "", ""});
  }
}

void Requests::ExplainConnect(bool wasConnected, Answer* answer) const {
  if (answer->status != ExitStatus::kRefused) {
    return;
  }
  if (answer->text != kCannotOpen) {
    answer->hints = HintsForConnectAgain(wasConnected);
    return;
  }
  const PortProblem problem = session_->LastPortProblem();
  if (problem.kind != PortProblem::Kind::kNone) {
    answer->status = ExitStatus::kPort;
    answer->hints = AdviceFor(problem);
  }
}

// Reads back what the driver holds as staged now.
void Requests::NoteStaged(const SettingEntry& setting, Answer* answer) {
  const Answer read = Read(TagUri(setting));
  SettingsBook::Row& row = settings_.Of(setting);
  const std::string staged = ShowSetting(setting, BytesOf(read.data, "value"));
  row.staged = staged;
  answer->data["key"] = setting.key;
  answer->data["value"] = staged;
  answer->data["active"] = row.active;
  events_->Publish(SettingChanged{"staged", setting.key, staged, row.active});
}

Answer Requests::HandleStage(const Json& request) {
  const std::string key = TextOf(request, "key");
  const SettingEntry* const setting = FindSetting(key);
  if (setting == nullptr) {
    return Refusal("no setting \"" + EscapeBytes(key) + "\"; there are " + SettingNames(),
                   ExitStatus::kUsage);
  }
  std::string tagValue;
  std::string error;
  if (!ParseSetting(*setting, TextOf(request, "value"), &tagValue, &error)) {
    return Refusal(error, ExitStatus::kUsage);
  }
  Answer answer = Write(TagUri(*setting), tagValue);
  if (answer.IsDone()) {
    NoteStaged(*setting, &answer);
  }
  return answer;
}

Answer Requests::HandleDone(const Json& /*request*/) { return Done(kDoneUri, "1"); }

Answer Requests::Done(const std::string& uri, const std::string& value) {
  const unsigned int waiting = ReadNumber(kWaitingUri);
  Answer answer = Write(uri, value);
  if (!answer.IsDone()) {
    return answer;
  }
  ++headVersion_;
  // A copy on the disk that cannot be made does not undo what is applied.
  const std::string storeError = answer.data.value("storeError", "");
  const bool isStored = session_->Storage() != nullptr && storeError.empty();
  Json applied = Json::array();
  for (const SettingEntry& setting : kSettingTable) {
    const SettingsBook::Row row = settings_.Of(setting);
    if (row.staged) {
      applied.push_back({{"key", setting.key}, {"value", *row.staged}, {"previous", row.active}});
      events_->Publish(SettingChanged{"applied", setting.key, *row.staged, row.active});
      if (isStored) {
        events_->Publish(SettingChanged{"stored", setting.key, *row.staged, ""});
      }
    }
  }
  NoteActiveSettings();
  ++settingsVersion_;
  answer.data["applied"] = applied;
  answer.data["stored"] = isStored;
  answer.data["cleared"] = waiting;
  if (waiting > 0) {
    answer.hints.push_back(HintForClearedTokens(waiting));
  }
  if (!storeError.empty()) {
    answer.hints.push_back("not stored: " + storeError);
  }
  return answer;
}

Answer Requests::HandleConsole(const Json& request) {
  const std::string line = BytesOf(request, "line");
  if (FirstWord(line) == "deletetags" && giveTagsBack_) {
    giveTagsBack_();
  }
  const bool wasConnected = IsConnected();
  SessionConsole console(session_);
  const ConsoleReply reply = console.Run(line);
  framing_.OnConsole(line, reply.text);
  if (!OnlyLooks(FirstWord(line))) {
    ++settingsVersion_;
    ++headVersion_;
  }
  events_->Publish(ConsoleReplied{line, reply.isDone, reply.text});
  NoteConnection(wasConnected);
  Answer answer;
  answer.status = reply.isDone ? ExitStatus::kDone : ExitStatus::kRefused;
  answer.text = reply.isDone ? "" : reply.text;
  answer.data["reply"] = CompactHex(reply.text);
  answer.data["cut"] = reply.isCut;
  answer.hints = HintsForConsole(line, reply.text);
  return answer;
}

// Sends through the tag, as the panel does.
Answer Requests::HandleSend(const Json& request) {
  const std::string bytes = BytesOf(request, "hex");
  std::string value = bytes;
  // What is in effect, not the tag: that one shows what is staged.
  if (Framing().isHex) {
    value = CompactHex(bytes);
  } else if (bytes.find('\0') != std::string::npos) {
    Answer answer = Refusal("a plain token ends at its first zero byte", ExitStatus::kUsage);
    answer.hints.emplace_back(kHintHexTokens);
    return answer;
  }
  const std::uint64_t lostBefore = session_->CountersFor(events_->Port()).lostSends;
  Answer answer = Write("0?tx_token?string-" + std::to_string(value.size() + 1), value);
  // The driver does not look at what the line took.
  if (answer.IsDone() && session_->CountersFor(events_->Port()).lostSends != lostBefore) {
    answer = Refusal("the line did not take the token: it is lost, or the device does not read");
  }
  answer.data["length"] = bytes.size();
  return answer;
}

Answer Requests::HandleAcknowledge(const Json& request) {
  const bool isAll = request.contains("all") && request["all"] == true;
  unsigned int left = isAll ? ReadNumber(kWaitingUri) : 1;
  Answer answer;
  unsigned int dropped = 0;
  const unsigned int before = ReadNumber(kWaitingUri);
  for (; left > 0 && answer.IsDone(); --left) {
    answer = Write(kAcknowledgeUri, "1");
    dropped += answer.IsDone() ? 1U : 0U;
  }
  ++headVersion_;
  ++settingsVersion_;
  answer.data["dropped"] = std::min(dropped, before);
  return answer;
}

Answer Requests::HandleWaiting(const Json& /*request*/) {
  Answer answer;
  answer.data["count"] = ReadNumber(kWaitingUri);
  return answer;
}

Answer Requests::HandleTags(const Json& /*request*/) {
  Answer answer;
  Json rows = Json::array();
  for (const CatalogueEntry& entry : kCatalogue) {
    const std::string uri = std::string("0?") + entry.memoryType + "?" + entry.tagType;
    Json row = {{"uri", uri}, {"name", entry.memoryType}, {"access", entry.access}};
    if (std::string(entry.access) != "write") {
      const Answer read = Read(uri);
      row["value"] = read.IsDone() ? read.data["value"] : Json(nullptr);
      row["refusal"] = read.text;
    }
    rows.push_back(std::move(row));
  }
  answer.data["rows"] = std::move(rows);
  return answer;
}

Answer Requests::HandleSettings(const Json& /*request*/) {
  Answer answer;
  Json rows = Json::array();
  const SqliteFile::Values stored = session_->Storage() == nullptr
                                        ? SqliteFile::Values()
                                        : session_->Storage()->All(session_->Ident());
  for (const SettingEntry& setting : kSettingTable) {
    const SettingsBook::Row& row = settings_.Of(setting);
    Json line = {{"key", setting.key}, {"configured", row.configured}, {"active", row.active}};
    if (row.staged) {
      line["staged"] = *row.staged;
    }
    const std::string console = ConsoleValue(setting);
    if (console != row.active && !console.empty()) {
      line["console"] = console;
    }
    const auto found = stored.find(StoredKey(session_->Ident(), setting.key));
    if (found != stored.end()) {
      line["stored"] = ShowStored(setting, found->second);
    }
    rows.push_back(std::move(line));
  }
  answer.data["rows"] = std::move(rows);
  return answer;
}

// What the console has put in the place of the setting's active value; empty for settings that it
// does not reach.
std::string Requests::ConsoleValue(const SettingEntry& setting) const {
  const std::string key = setting.key;
  const FramingSettings& framing = Framing();
  if (key == "gap") {
    // As the tag shows it.
    return std::to_string(static_cast<unsigned int>(framing.gapMs));
  }
  if (key == "hex_tokens") {
    return framing.isHex ? "true" : "false";
  }
  const std::array<std::pair<const char*, const std::string*>, 4> texts = {
      {{"rx_prefix", &framing.rxPrefix},
       {"rx_suffix", &framing.rxSuffix},
       {"tx_prefix", &framing.txPrefix},
       {"tx_suffix", &framing.txSuffix}}};
  for (const auto& [name, bytes] : texts) {
    if (key == name) {
      return ShowSetting(setting, CompactHex(*bytes));
    }
  }
  return "";
}

Answer Requests::HandleConnect(const Json& request) {
  const std::string state = TextOf(request, "state");
  const bool isConnected = IsConnected();
  Answer answer;
  if (state == "on" && !isConnected) {
    answer = Write(kConnectUri, "1");
  } else if (state == "off" && isConnected) {
    answer = Write(kConnectUri, "0");
  } else if (state != "on" && state != "off" && state != "status") {
    return Refusal("connect takes on, off or status", ExitStatus::kUsage);
  }
  ExplainConnect(isConnected, &answer);
  NoteConnection(isConnected);
  const bool isNow = IsConnected();
  answer.data["connected"] = isNow;
  answer.data["changed"] = isNow != isConnected;
  return answer;
}

Answer Requests::HandleStats(const Json& /*request*/) {
  Answer answer;
  answer.data = statistics_->ToJson();
  const PortCounters counters = session_->CountersFor(events_->Port());
  answer.data["lost_send_bytes"] = counters.lostSendBytes;
  answer.data["lost_ms"] = counters.lostMs;
  answer.data["echo_mismatches"] = counters.echoMismatches;
  if (counters.lineErrors.areKnown) {
    answer.data["line_errors"] = {{"framing", counters.lineErrors.framing},
                                  {"parity", counters.lineErrors.parity},
                                  {"overruns", counters.lineErrors.overruns},
                                  {"breaks", counters.lineErrors.breaks},
                                  {"buffer_overruns", counters.lineErrors.bufferOverruns}};
  }
  return answer;
}

Answer Requests::HandleLines(const Json& /*request*/) {
  Answer answer;
  const ModemLines lines = session_->LinesOf(events_->Port());
  if (lines.areKnown) {
    answer.data = {{"dtr", lines.dtr}, {"rts", lines.rts}, {"cts", lines.cts},
                   {"dsr", lines.dsr}, {"dcd", lines.dcd}, {"ri", lines.ri}};
  }
  return answer;
}
