// SPDX-License-Identifier: Apache-2.0
#include "host/events/EventJson.h"

#include <nlohmann/json.hpp>
#include <stdexcept>
#include <utility>

#include "host/events/JsonLine.h"
#include "host/events/WallClock.h"
#include "host/text/ByteText.h"

namespace {

using OrderedJson = nlohmann::ordered_json;

// Writes the keys of one event behind those that all events have.
class DetailWriter {
 public:
  explicit DetailWriter(OrderedJson* json) : json_(json) {}

  void operator()(const BytesReceived& detail) { Set("hex", CompactHex(detail.bytes)); }

  void operator()(const BytesSent& detail) {
    Set("hex", CompactHex(detail.bytes));
    Set("sent", detail.takenBytes);
  }

  void operator()(const BytesLabelled& detail) {
    Set("role", detail.role);
    Set("hex", CompactHex(detail.bytes));
  }

  void operator()(const TokenReceived& detail) {
    Set("n", detail.number);
    Set("len", detail.lengthBytes);
    Set("text", detail.bytes);
    Set("hex", CompactHex(detail.bytes));
    Set("waiting", detail.waiting);
    if (detail.durationUs >= 0) {
      Set("dur_us", detail.durationUs);
    }
    if (detail.isCut) {
      Set("cut", true);
    }
    if (!detail.frame.empty()) {
      Set("frame", CompactHex(detail.frame));
      Set("prefix_len", detail.prefixBytes);
      Set("suffix_len", detail.suffixBytes);
    }
  }

  void operator()(const BytesDropped& detail) {
    Set("why", detail.reason);
    if (detail.afterMs > 0) {
      Set("after_ms", detail.afterMs);
    }
    Set("hex", CompactHex(detail.bytes));
  }

  void operator()(const PortChanged& detail) {
    Set("state", detail.state);
    if (!detail.errorName.empty()) {
      Set("errno", detail.errorName);
    }
    Set("text", detail.text);
  }

  void operator()(const SettingChanged& detail) {
    Set("state", detail.state);
    Set("key", detail.key);
    Set("value", detail.value);
    if (!detail.previous.empty()) {
      Set("previous", detail.previous);
    }
  }

  void operator()(const ConsoleReplied& detail) {
    Set("command", detail.command);
    Set("ok", detail.isDone);
    Set("text", detail.reply);
  }

  void operator()(const NoteMade& detail) {
    Set("text", detail.text);
    if (detail.missedBytes > 0) {
      Set("missed", detail.missedBytes);
    }
  }

  void operator()(const FindingMade& detail) {
    Set("text", detail.text);
    Set("driver", CompactHex(detail.driverBytes));
    Set("model", CompactHex(detail.modelBytes));
  }

 private:
  template <typename Value>
  void Set(const char* key, const Value& value) {
    (*json_)[key] = value;
  }

  OrderedJson* const json_;
};

struct KindName {
  const char* operator()(const BytesReceived& /*detail*/) const { return "rx"; }
  const char* operator()(const BytesSent& /*detail*/) const { return "tx"; }
  const char* operator()(const BytesLabelled& /*detail*/) const { return "label"; }
  const char* operator()(const TokenReceived& /*detail*/) const { return "token"; }
  const char* operator()(const BytesDropped& /*detail*/) const { return "drop"; }
  const char* operator()(const PortChanged& /*detail*/) const { return "port"; }
  const char* operator()(const SettingChanged& /*detail*/) const { return "setting"; }
  const char* operator()(const ConsoleReplied& /*detail*/) const { return "console"; }
  const char* operator()(const NoteMade& /*detail*/) const { return "note"; }
  const char* operator()(const FindingMade& /*detail*/) const { return "finding"; }
};

OrderedJson ToOrderedJson(const HostEvent& event) {
  OrderedJson json;
  json["t"] = UtcText(event.timeUs);
  json["ev"] = std::visit(KindName(), event.detail);
  json["port"] = event.port;
  std::visit(DetailWriter(&json), event.detail);
  return json;
}

std::string BytesOf(const nlohmann::json& json, const char* key) {
  std::string bytes;
  if (!ParseHexBytes(json.at(key).get<std::string>(), &bytes)) {
    throw std::invalid_argument("no hexadecimal text");
  }
  return bytes;
}

HostEvent::Detail DetailOf(const std::string& kind, const nlohmann::json& json) {
  const auto text = [&json](const char* key) { return json.value(key, std::string()); };
  if (kind == "rx") {
    return BytesReceived{BytesOf(json, "hex")};
  }
  if (kind == "tx") {
    return BytesSent{BytesOf(json, "hex"), json.at("sent").get<std::uint64_t>()};
  }
  if (kind == "token") {
    return TokenReceived{json.at("n").get<std::uint64_t>(),
                         BytesOf(json, "hex"),
                         json.at("len").get<unsigned int>(),
                         json.at("waiting").get<unsigned>(),
                         json.value("dur_us", std::int64_t{-1}),
                         json.value("cut", false),
                         json.contains("frame") ? BytesOf(json, "frame") : "",
                         json.value("prefix_len", std::uint64_t{0}),
                         json.value("suffix_len", std::uint64_t{0})};
  }
  if (kind == "label") {
    return BytesLabelled{text("role"), BytesOf(json, "hex")};
  }
  if (kind == "drop") {
    return BytesDropped{text("why"), BytesOf(json, "hex"), json.value("after_ms", 0)};
  }
  if (kind == "port") {
    return PortChanged{text("state"), text("errno"), text("text")};
  }
  if (kind == "setting") {
    return SettingChanged{text("state"), text("key"), text("value"), text("previous")};
  }
  if (kind == "console") {
    return ConsoleReplied{text("command"), json.at("ok").get<bool>(), text("text")};
  }
  if (kind == "finding") {
    return FindingMade{text("text"), BytesOf(json, "driver"), BytesOf(json, "model")};
  }
  if (kind == "note") {
    return NoteMade{text("text"), json.value("missed", std::uint64_t{0})};
  }
  throw std::invalid_argument("no kind of event: " + kind);
}

}  // namespace

nlohmann::json ToJson(const HostEvent& event) { return ToOrderedJson(event); }

std::string ToJsonLine(const HostEvent& event) { return JsonLine(ToOrderedJson(event)); }

bool FromJson(const nlohmann::json& json, HostEvent* event) {
  try {
    HostEvent read;
    if (!ParseUtcText(json.at("t").get<std::string>(), &read.timeUs)) {
      return false;
    }
    read.port = json.at("port").get<std::string>();
    read.detail = DetailOf(json.at("ev").get<std::string>(), json);
    *event = std::move(read);
    return true;
  } catch (const std::exception&) {
    return false;  // a key is missing, or its value is not what it must be
  }
}
