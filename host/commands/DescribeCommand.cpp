// SPDX-License-Identifier: Apache-2.0
#include "host/commands/DescribeCommand.h"

#include <CLI/CLI.hpp>
#include <cstdio>

#include "host/base/ExitStatus.h"
#include "host/commands/CommandFailure.h"
#include "host/document/DescriptionBlock.h"
#include "host/document/DescriptionDocument.h"
#include "host/document/DescriptionForm.h"
#include "host/document/DescriptionReport.h"
#include "host/document/DescriptionSchema.h"
#include "host/framing/ConfigKeyTable.h"
#include "host/instance/SettingTable.h"
#include "host/runtime/HostSession.h"
#include "host/text/Output.h"
#include "interfaces/IProtocol.h"

namespace {

// Asks the plug-in. The platform stays empty: the driver's interface does not tell it.
HostResult LoadDescription(const std::string& pluginFile, DescriptionBlock* block) {
  HostOptions host;
  host.pluginFile = pluginFile;
  HostSession session(host);
  HostResult result = session.Open();
  if (!result.IsDone()) {
    result.text += " (loka describe FILE reads a library without loading it)";
    return result;
  }
  const IProtocol* const protocol = session.Protocol();
  const char* const lengthLine = protocol->GetXml();
  std::string reason = "the driver has no description";
  if (lengthLine == nullptr || !ReadDescriptionAt(lengthLine, block, &reason)) {
    result.status = ExitStatus::kPlugin;
    result.text = session.PluginPath() + ": " + reason;
    return result;
  }
  const char* const fullName = protocol->GetProtocolName();
  block->fullName = fullName == nullptr ? "" : fullName;
  block->version = protocol->GetProtocolVersion();
  return result;
}

HostResult FetchDescription(const DescribeOptions& options, DescriptionBlock* block) {
  if (options.libraryFile.empty()) {
    return LoadDescription(options.pluginFile, block);
  }
  HostResult result;
  if (!FindDescriptionInFile(options.libraryFile, block, &result.text)) {
    result.status = ExitStatus::kPlugin;
  }
  return result;
}

ParameterNotes MakeNotes() {
  ParameterNotes notes;
  for (const ConfigKey& key : ConfigKeys()) {
    ParameterNotes::Note& note = notes.byKey[std::string(key.key)];
    note.meaning = key.meaning;
    note.also = key.alsoAccepted;
    if (key.alsoAccepted.find(' ') == std::string_view::npos) {
      note.extraEntry = key.alsoAccepted;
    }
    if (key.kind == ConfigKey::Kind::kHexText) {
      note.pattern = "([0-9A-Fa-f]{2})*|none";
    }
  }
  for (const SettingEntry& setting : kSettingTable) {
    notes.settings.push_back(
        {setting.key, setting.configKey, TagUri(setting), AllowedValues(setting)});
  }
  return notes;
}

std::string TextFor(const DescribeOptions& options, const DescriptionBlock& block,
                    const DescriptionDocument& document) {
  if (options.asXml) {
    return block.xml;
  }
  if (options.asJson) {
    return DescribeAsJson(block, document);
  }
  if (options.asForm) {
    return DescribeAsForm(block, document, MakeNotes());
  }
  return options.asSchema ? DescribeAsSchema(block, document, MakeNotes())
                          : DescribeAsText(block, document);
}

}  // namespace

void AddDescribe(CLI::App* app, DescribeOptions* options) {
  CLI::App* const describe =
      app->add_subcommand("describe", "Print what a driver says about itself");
  CLI::Option* const file = describe
                                ->add_option("FILE", options->libraryFile,
                                             "Library to search, of any machine; it is not loaded")
                                ->type_name("");
  describe->add_option("--plugin", options->pluginFile, "Driver to load instead")
      ->type_name("FILE")
      ->excludes(file);
  CLI::Option* const xml =
      describe->add_flag("--xml", options->asXml, "The document as it stands, XML in UTF-8");
  CLI::Option* const json =
      describe->add_flag("-j,--json", options->asJson, "The same as JSON")->excludes(xml);
  CLI::Option* const form =
      describe->add_flag("--html", options->asForm, "A page with a form that writes configurations")
          ->excludes(xml)
          ->excludes(json);
  describe->add_flag("--schema", options->asSchema, "A JSON Schema of the configuration")
      ->excludes(xml)
      ->excludes(json)
      ->excludes(form);
  describe->footer("Example: loka describe libLOKA.so --json");
}

int RunDescribe(const DescribeOptions& options) {
  DescriptionBlock block;
  const HostResult result = FetchDescription(options, &block);
  if (!result.IsDone()) {
    return Fail(result.status, result.text);
  }
  // Checked for every form of output, so that what --xml prints is a description, too.
  DescriptionDocument document;
  std::string error;
  if (!ParseDescription(block.xml, &document, &error)) {
    return Fail(ExitStatus::kPlugin, "the description cannot be read: " + error);
  }
  if (block.name.empty()) {
    block.name = document.Property("name");
  }
  const bool isWritten = WriteResult(TextFor(options, block, document));
  return static_cast<int>(isWritten ? ExitStatus::kDone : ExitStatus::kRefused);
}
