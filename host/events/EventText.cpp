// SPDX-License-Identifier: Apache-2.0
#include "host/events/EventText.h"

#include "host/text/ByteText.h"

namespace {

std::string Quoted(const std::string& bytes) { return "\"" + EscapeBytes(bytes) + "\""; }

struct DetailText {
  std::string operator()(const BytesReceived& detail) const {
    return "rx " + HexBytes(detail.bytes) + "  " + Quoted(detail.bytes);
  }

  std::string operator()(const BytesSent& detail) const {
    std::string text = "tx " + HexBytes(detail.bytes) + "  " + Quoted(detail.bytes);
    if (detail.takenBytes < detail.bytes.size()) {
      text += "  lost: the line took " + std::to_string(detail.takenBytes) + " of " +
              std::to_string(detail.bytes.size()) + " bytes";
    }
    return text;
  }

  std::string operator()(const BytesLabelled& detail) const {
    return HexBytes(detail.bytes) + " " + detail.role;
  }

  std::string operator()(const TokenReceived& detail) const {
    return "token " + std::to_string(detail.number) + "  " + Quoted(detail.bytes) +
           (detail.isCut ? "..." : "") + "  " + std::to_string(detail.lengthBytes) + " bytes";
  }

  std::string operator()(const BytesDropped& detail) const {
    std::string text = "drop " + detail.reason;
    if (detail.afterMs > 0) {
      text += " after " + std::to_string(detail.afterMs) + " ms";
    }
    return text + ": " + HexBytes(detail.bytes) + "  " + Quoted(detail.bytes);
  }

  std::string operator()(const PortChanged& detail) const {
    return detail.text.empty() ? "port " + detail.state : EscapeBytes(detail.text);
  }

  std::string operator()(const SettingChanged& detail) const {
    std::string text = detail.state + ": " + detail.key + " " + detail.value;
    if (!detail.previous.empty()) {
      text += (detail.state == "staged" ? " (active " : " (was ") + detail.previous + ")";
    }
    return text;
  }

  std::string operator()(const ConsoleReplied& detail) const {
    return "console " + Quoted(detail.command) + (detail.isDone ? ": " : " refused: ") +
           EscapeBytes(detail.reply);
  }

  std::string operator()(const NoteMade& detail) const { return EscapeBytes(detail.text); }

  std::string operator()(const FindingMade& detail) const {
    return "finding: " + EscapeBytes(detail.text) + "; driver " + Quoted(detail.driverBytes) +
           ", expected " + Quoted(detail.modelBytes);
  }
};

}  // namespace

std::string EventText(const HostEvent& event) { return std::visit(DetailText(), event.detail); }
