// SPDX-License-Identifier: Apache-2.0
#include "host/commands/StoreCommand.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <set>
#include <system_error>

#include "host/base/ExitStatus.h"
#include "host/commands/SettingWord.h"
#include "host/commands/StoreJson.h"
#include "host/control/AttachedInstance.h"
#include "host/control/ControlPath.h"
#include "host/events/JsonLine.h"
#include "host/store/SqliteFile.h"
#include "host/store/StorePath.h"
#include "host/text/Output.h"
#include "host/text/Utf8Text.h"

namespace {

using Values = SqliteFile::Values;
using Action = StoreOptions::Action;

constexpr const char* kKeepsText =
    "the running driver keeps its cached values until it is restarted";
// Unless an identifier is given, the driver's instance has the name of its port.
constexpr const char* kUsualIdent = "com1";
constexpr std::size_t kMaxImportBytes = std::size_t{1024} * 1024;

struct Failure {
  ExitStatus status = ExitStatus::kDone;
  std::string text;
};

int Tell(const Failure& failure) {
  TellUser(PrintableUtf8(failure.text));
  return static_cast<int>(failure.status);
}

int Refuse(const std::string& text) { return Tell({ExitStatus::kRefused, text}); }
int StoreUsage(const std::string& text) { return Tell({ExitStatus::kUsage, text}); }

int Finish(const std::string& result) {
  const bool isWritten = result.empty() || WriteResult(result);
  return static_cast<int>(isWritten ? ExitStatus::kDone : ExitStatus::kRefused);
}

// The file that the command works on, and which running instances use it.
class Store {
 public:
  explicit Store(const StoreOptions& options) : options_(options) {}

  // Finds the file and reads all of it. A file that is not there yet is an empty one.
  bool Open(Failure* failure) {
    if (!FindFile(failure)) {
      return false;
    }
    std::error_code ignored;
    if (!std::filesystem::exists(path_, ignored)) {
      return true;
    }
    failure->status = ExitStatus::kRefused;
    file_ = SqliteFile::Open(path_, &failure->text);
    return file_ != nullptr && file_->ReadAll(&values_, &failure->text);
  }

  // The key space that is meant; false when that is not clear.
  bool FindIdent(std::string* ident, Failure* failure) const {
    const std::set<std::string> idents = Idents();
    if (!options_.ident.empty() || idents.size() <= 1) {
      *ident = !options_.ident.empty() ? options_.ident
               : idents.empty()        ? runningIdent_
                                       : *idents.begin();
      return true;
    }
    std::string names;
    for (const std::string& name : idents) {
      names += (names.empty() ? "" : ", ") + name;
    }
    *failure = {ExitStatus::kUsage,
                path_ + " holds settings of " + names + "; say whose with --ident"};
    return false;
  }

  std::set<std::string> Idents() const {
    std::set<std::string> idents;
    for (const auto& [key, value] : values_) {
      idents.insert(key.first);
    }
    return idents;
  }

  bool Write(const Values& values, std::string* error) {
    if (file_ == nullptr) {
      file_ = SqliteFile::Open(path_, error);
    }
    return file_ != nullptr && file_->Store(values, error);
  }

  bool Remove(const std::vector<StoredKey>& keys, std::string* error) {
    return file_ == nullptr || file_->Remove(keys, error);
  }

  const Values& All() const { return values_; }
  const std::string& Path() const { return path_; }

  // A driver runs that has read this file.
  bool IsInUse() const { return isInUse_; }

 private:
  bool FindFile(Failure* failure) {
    path_ = options_.storeFile;
    std::set<std::string> runningFiles;
    std::vector<std::string> names = ControlNames();
    if (!options_.instanceName.empty()) {
      names = {options_.instanceName};
    }
    for (const std::string& name : names) {
      std::string error;
      const auto instance = AttachedInstance::Connect(name, &error);
      if (instance != nullptr) {
        runningFiles.insert(instance->Info().value("store", ""));
        runningIdent_ = instance->Info().value("ident", runningIdent_);
      } else if (!options_.instanceName.empty()) {
        *failure = {ExitStatus::kPort, error};
        return false;
      }
    }
    runningFiles.erase("");
    if (path_.empty() && runningFiles.size() == 1) {
      path_ = *runningFiles.begin();
    }
    if (path_.empty()) {
      path_ = DefaultStorePath();
    }
    if (path_.empty()) {
      *failure = {ExitStatus::kUsage, "no home folder for the store; name one with --store FILE"};
      return false;
    }
    isInUse_ = std::any_of(runningFiles.begin(), runningFiles.end(), [&](const std::string& file) {
      std::error_code error;
      return file == path_ || std::filesystem::equivalent(file, path_, error);
    });
    return true;
  }

  const StoreOptions& options_;
  std::string path_;
  std::string runningIdent_ = kUsualIdent;
  bool isInUse_ = false;
  std::unique_ptr<SqliteFile> file_;
  Values values_;
};

std::string Show(const std::string& key, const StoredValue& value) {
  const SettingEntry* const setting = FindSetting(key);
  if (setting != nullptr && key == setting->key) {
    return ShowStored(*setting, value);
  }
  if (const auto* const text = std::get_if<std::string>(&value)) {
    return *text;
  }
  const auto* const flag = std::get_if<bool>(&value);
  return flag == nullptr ? std::to_string(std::get<int>(value)) : *flag ? "true" : "false";
}

// Settings in the order of kSettingTable, then what else there is.
std::vector<std::string> KeysOf(const Values& values, const std::string& ident) {
  std::vector<std::string> keys;
  for (const SettingEntry& setting : kSettingTable) {
    if (values.find({ident, setting.key}) != values.end()) {
      keys.emplace_back(setting.key);
    }
  }
  for (const auto& [key, value] : values) {
    if (key.first == ident && std::find(keys.begin(), keys.end(), key.second) == keys.end()) {
      keys.push_back(key.second);
    }
  }
  return keys;
}

std::string LineOf(const Values& values, const std::string& ident) {
  std::string line;
  for (const std::string& key : KeysOf(values, ident)) {
    line += (line.empty() ? "" : "  ") + key + " " + Show(key, values.at({ident, key}));
  }
  return PrintableUtf8(line) + "   (override the configuration)\n";
}

std::string JsonLinesOf(const Values& values, const std::string& ident) {
  std::string lines;
  for (const std::string& key : KeysOf(values, ident)) {
    const nlohmann::ordered_json line = {
        {"ident", ident}, {"key", key}, {"value", Show(key, values.at({ident, key}))}};
    lines += JsonLine(line) + "\n";
  }
  return lines;
}

int List(const StoreOptions& options, const Store& store) {
  std::set<std::string> idents = store.Idents();
  if (!options.ident.empty()) {
    idents = idents.contains(options.ident) ? std::set<std::string>{options.ident}
                                            : std::set<std::string>();
  }
  if (idents.empty()) {
    TellUser("nothing is stored in " + store.Path());
  }
  std::string text;
  for (const std::string& ident : idents) {
    const bool isNamed = idents.size() > 1;
    text += options.isJson
                ? JsonLinesOf(store.All(), ident)
                : (isNamed ? PrintableUtf8(ident) + ": " : "") + LineOf(store.All(), ident);
  }
  return Finish(text);
}

// The keys under their stored names; false when one of them is not stored.
bool FindKeys(const StoreOptions& options, const Store& store, const std::string& ident,
              std::vector<StoredKey>* keys, std::string* error) {
  for (const std::string& word : options.words) {
    const SettingEntry* const setting = FindSetting(word);
    const StoredKey plain = {ident, word};
    const bool isPlain = store.All().contains(plain);
    const StoredKey key = isPlain || setting == nullptr ? plain : StoredKey(ident, setting->key);
    if (!store.All().contains(key)) {
      *error = word + " is not stored";
      return false;
    }
    keys->push_back(key);
  }
  return true;
}

int Get(const StoreOptions& options, const Store& store, const std::string& ident) {
  std::vector<StoredKey> keys;
  std::string error;
  if (!FindKeys(options, store, ident, &keys, &error)) {
    return Refuse(error);
  }
  std::string text;
  for (const StoredKey& key : keys) {
    text += PrintableUtf8(Show(key.second, store.All().at(key))) + "\n";
  }
  return Finish(text);
}

// What has been done to the file, and what it does not do.
int FinishChange(const Store& store, const std::string& done) {
  return Finish(PrintableUtf8(done) + (store.IsInUse() ? std::string("; ") + kKeepsText : "") +
                "\n");
}

int Remove(const StoreOptions& options, Store* store, const std::string& ident) {
  std::vector<StoredKey> keys;
  std::string error;
  if (options.isAll) {
    for (const std::string& key : KeysOf(store->All(), ident)) {
      keys.emplace_back(ident, key);
    }
  } else if (!FindKeys(options, *store, ident, &keys, &error)) {
    return Refuse(error + "; nothing is removed");
  }
  const std::set<StoredKey> different(keys.begin(), keys.end());
  if (!store->Remove(keys, &error)) {
    return Refuse(error);
  }
  if (store->IsInUse() && !keys.empty()) {
    TellUser("a later loka set there stores again what was set since its start");
  }
  return FinishChange(*store, std::to_string(different.size()) + " removed");
}

// Writes values and says which of them were there before: nothing goes without a word.
int Write(Store* store, const Values& values) {
  std::size_t newCount = 0;
  std::size_t sameCount = 0;
  std::string changed;
  for (const auto& [key, value] : values) {
    const auto former = store->All().find(key);
    if (former == store->All().end()) {
      ++newCount;
    } else if (former->second == value) {
      ++sameCount;
    } else {
      changed += (changed.empty() ? "" : ", ") + key.second + " " + Show(key.second, value) +
                 " (was " + Show(key.second, former->second) + ")";
    }
  }
  std::string error;
  if (!store->Write(values, &error)) {
    return Refuse(error);
  }
  std::string text = std::to_string(values.size()) + " stored: " + std::to_string(newCount) +
                     " new, " + std::to_string(sameCount) + " as before";
  text += changed.empty() ? "" : ", changed: " + changed;
  return FinishChange(*store, text);
}

int Set(const StoreOptions& options, Store* store, const std::string& ident) {
  Values values;
  for (const std::string& word : options.words) {
    SettingWord setting;
    std::string error;
    if (!ParseSettingWord(word, &setting, &error)) {
      return StoreUsage(error);
    }
    if (!values.emplace(StoredKey(ident, setting.entry->key), StoredValueOf(setting)).second) {
      return StoreUsage(std::string(setting.entry->key) + " is given twice");
    }
  }
  return Write(store, values);
}

int Export(const StoreOptions& options, const Store& store) {
  Values values = store.All();
  if (!options.ident.empty()) {
    for (auto entry = values.begin(); entry != values.end();) {
      entry = entry->first.first == options.ident ? std::next(entry) : values.erase(entry);
    }
  }
  return Finish(StoreJson(values));
}

bool ReadImport(const std::string& path, std::string* text, std::string* error) {
  std::ifstream file;
  if (path != "-") {
    file.open(path, std::ios::binary);
    if (!file || std::filesystem::is_directory(path)) {
      *error = path + " cannot be read";
      return false;
    }
  }
  std::istream& stream = path == "-" ? std::cin : file;
  text->assign(std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>());
  if (text->size() > kMaxImportBytes) {
    *error = path + " is longer than " + std::to_string(kMaxImportBytes) + " bytes";
    return false;
  }
  return true;
}

int Import(const StoreOptions& options, Store* store) {
  std::string text;
  std::string error;
  Values values;
  if (!ReadImport(options.importFile, &text, &error) || !ParseStoreJson(text, &values, &error)) {
    return StoreUsage(error + "; nothing is stored");
  }
  if (!options.ident.empty()) {
    Values renamed;
    for (auto& [key, value] : values) {
      if (!renamed.emplace(StoredKey(options.ident, key.second), value).second) {
        return StoreUsage("several key spaces hold " + key.second +
                          ", so --ident cannot take them all");
      }
    }
    values = std::move(renamed);
  }
  return Write(store, values);
}

void AddFile(CLI::App* command, StoreOptions* options) {
  command->add_option("--store", options->storeFile, "File (else that of the running instance)")
      ->type_name("FILE");
  command->add_option("--ident", options->ident, "Whose settings (else the only ones)")
      ->type_name("NAME");
  command->add_option("--instance", options->instanceName, "Running instance, by its port")
      ->type_name("NAME");
}

CLI::App* AddAction(CLI::App* store, StoreOptions* options, Action action, const char* name,
                    const char* help) {
  CLI::App* const command = store->add_subcommand(name, help);
  command->callback([options, action] { options->action = action; });
  AddFile(command, options);
  return command;
}

}  // namespace

void AddStore(CLI::App* app, StoreOptions* options) {
  CLI::App* const store = app->add_subcommand("store", "Look at and change the stored settings");
  store->require_subcommand(1);
  CLI::App* const list = AddAction(store, options, Action::kList, "ls", "List them");
  list->add_flag("-j,--json", options->isJson, "One JSON object a setting");
  list->footer("Example: loka store ls");
  CLI::App* const get = AddAction(store, options, Action::kGet, "get", "Print values");
  get->add_option("KEY", options->words, "Settings")->type_name("")->required();
  get->footer("Example: loka store get baud");
  CLI::App* const set = AddAction(store, options, Action::kSet, "set", "Store values");
  set->add_option("KEY=VALUE", options->words, "Settings")->type_name("")->required();
  set->footer("Example: loka store set baud=19200 rx_suffix=CRLF");
  CLI::App* const remove = AddAction(store, options, Action::kRemove, "rm", "Remove values");
  CLI::Option* const keys = remove->add_option("KEY", options->words, "Settings")->type_name("");
  remove->add_flag("--all", options->isAll, "All of them")->excludes(keys);
  remove->footer("Example: loka store rm baud rx_suffix");
  AddAction(store, options, Action::kExport, "export", "Print all of them as JSON")
      ->footer("Example: loka store export > settings.json");
  CLI::App* const import =
      AddAction(store, options, Action::kImport, "import", "Store what export printed");
  import->add_option("FILE", options->importFile, "File; - is standard input")
      ->type_name("")
      ->required();
  import->footer("Example: loka store import settings.json");
  store->footer("Example: loka store ls");
}

int RunStore(const StoreOptions& options) {
  if (options.action == Action::kRemove && options.words.empty() && !options.isAll) {
    return StoreUsage("say which settings, or --all");
  }
  Store store(options);
  Failure failure;
  if (!store.Open(&failure)) {
    return Tell(failure);
  }
  switch (options.action) {
    case Action::kList:
      return List(options, store);
    case Action::kExport:
      return Export(options, store);
    case Action::kImport:
      return Import(options, &store);
    default:
      break;
  }
  std::string ident;
  if (!store.FindIdent(&ident, &failure)) {
    return Tell(failure);
  }
  switch (options.action) {
    case Action::kGet:
      return Get(options, store, ident);
    case Action::kSet:
      return Set(options, &store, ident);
    default:
      return Remove(options, &store, ident);
  }
}
