// SPDX-License-Identifier: Apache-2.0
#include "host/port/PortReport.h"

#include <algorithm>
#include <nlohmann/json.hpp>

#include "host/text/ByteText.h"

namespace {

std::string WordFor(const ListedPort& port) { return "com1=" + port.path; }

std::string StateText(const ListedPort& port) {
  switch (port.state) {
    case ListedPort::State::kBusy: {
      const PortHolder& holder = port.holders.front();
      return "in use by process " + std::to_string(holder.processId) + " (" + holder.command + ")";
    }
    case ListedPort::State::kNoRights:
      return "you are not allowed to open it";
    default:
      return "free";
  }
}

const char* StateName(ListedPort::State state) {
  switch (state) {
    case ListedPort::State::kBusy:
      return "busy";
    case ListedPort::State::kNoRights:
      return "no-rights";
    default:
      return "free";
  }
}

std::string Padded(std::string text, std::size_t width) {
  text.resize(std::max(text.size(), width), ' ');
  return text;
}

void AddDetail(const std::string& name, const std::string& text, std::vector<std::string>* lines) {
  constexpr std::size_t kNameWidth = 10;
  if (!text.empty()) {
    lines->push_back("  " + Padded(name, kNameWidth) + text);
  }
}

void AddBlock(const ListedPort& port, std::vector<std::string>* lines) {
  lines->push_back(port.path);
  AddDetail("device", port.alias, lines);
  AddDetail("maker", EscapeBytes(port.manufacturer), lines);
  AddDetail("product", EscapeBytes(port.product), lines);
  AddDetail("serial", EscapeBytes(port.serialNumber), lines);
  AddDetail("driver", EscapeBytes(port.driver), lines);
  if (port.latencyMs >= 0) {
    AddDetail("latency", std::to_string(port.latencyMs) + " ms", lines);
  }
  AddDetail("state", StateText(port), lines);
  AddDetail("use", "--port " + WordFor(port), lines);
}

void AddText(const char* key, const std::string& text, nlohmann::ordered_json* object) {
  if (!text.empty()) {
    (*object)[key] = text;
  }
}

nlohmann::ordered_json ToJson(const ListedPort& port) {
  nlohmann::ordered_json object;
  object["path"] = port.path;
  object["device"] = port.Device();
  AddText("manufacturer", port.manufacturer, &object);
  AddText("product", port.product, &object);
  AddText("serial", port.serialNumber, &object);
  AddText("driver", port.driver, &object);
  if (port.latencyMs >= 0) {
    object["latency_ms"] = port.latencyMs;
  }
  object["state"] = StateName(port.state);
  for (const PortHolder& holder : port.holders) {
    object["holders"].push_back({{"pid", holder.processId}, {"command", holder.command}});
  }
  object["word"] = WordFor(port);
  return object;
}

}  // namespace

std::vector<std::string> DescribePorts(const std::vector<ListedPort>& ports, bool isLong) {
  std::vector<std::string> lines;
  std::size_t pathWidth = 0;
  std::size_t driverWidth = 0;
  for (const ListedPort& port : ports) {
    pathWidth = std::max(pathWidth, port.path.size());
    driverWidth = std::max(driverWidth, EscapeBytes(port.driver).size());
  }
  for (const ListedPort& port : ports) {
    if (isLong) {
      AddBlock(port, &lines);
      continue;
    }
    lines.push_back(Padded(port.path, pathWidth) + "  " +
                    Padded(EscapeBytes(port.driver), driverWidth) + "  " + StateText(port));
  }
  return lines;
}

std::vector<std::string> PortsAsJson(const std::vector<ListedPort>& ports) {
  std::vector<std::string> lines;
  lines.reserve(ports.size());
  for (const ListedPort& port : ports) {
    // An adapter may call itself anything; what is not UTF-8 is replaced.
    lines.push_back(
        ToJson(port).dump(-1, ' ', true, nlohmann::ordered_json::error_handler_t::replace));
  }
  return lines;
}
