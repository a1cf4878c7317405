// SPDX-License-Identifier: Apache-2.0
#include "host/DescribeCommand.h"

#include <cstdio>

#include "host/DescriptionBlock.h"
#include "host/DescriptionDocument.h"
#include "host/DescriptionReport.h"
#include "host/ExitStatus.h"
#include "host/HostSession.h"
#include "host/Output.h"
#include "interfaces/IProtocol.h"

namespace {

int Fail(ExitStatus status, const std::string& text) {
  TellUser(text);
  return static_cast<int>(status);
}

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

}  // namespace

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
  const std::string text = options.asXml    ? block.xml
                           : options.asJson ? DescribeAsJson(block, document)
                                            : DescribeAsText(block, document);
  return static_cast<int>(WriteResult(text) ? ExitStatus::kDone : ExitStatus::kRefused);
}
