// SPDX-License-Identifier: Apache-2.0
#include "host/sim/DeviceCatalogue.h"

#include "host/sim/BarcodeDevice.h"
#include "host/sim/GaugeDevice.h"
#include "host/sim/ModemDevice.h"
#include "host/sim/PrinterDevice.h"
#include "host/sim/RfidDevice.h"
#include "host/sim/ScaleDevice.h"
#include "host/text/ByteText.h"
#include "interfaces/ISerialPort.h"

namespace {

template <typename Kind>
std::unique_ptr<Device> Make(const DeviceSettings& settings) {
  return std::make_unique<Kind>(settings);
}

constexpr int kEven = kParityEven;
constexpr int kGaugeGapMs = 50;
constexpr const char* kCrLf = "\r\n";

std::vector<DeviceKind> MakeKinds() {
  return {
      {"scale",
       "Weights, ten a second; answers R, SI, Z and T",
       "Sends STX \"ST,GS+  5.12kg\" ETX: ST stable, US moving, GS gross, NT net.\n"
       "R or SI asks for the weight, Z sets zero, T tares (both answered \"OK\");\n"
       "anything else is not answered. A command ends with CR, LF, ETX or 100 ms of\n"
       "silence.",
       {"\x02", "\x03"},
       100,
       {9600, kEven, 7, 1, kModeRs232},
       {"", kCrLf},
       0,
       Make<ScaleDevice>},
      {"barcode",
       "Codes with CR LF, one every two seconds",
       "Codes of a short list in turn: the same one twice in a row, and a GS1 code\n"
       "with GS (1D) inside. T triggers the next scan.",
       {"", kCrLf},
       2000,
       {9600, kParityNone, 8, 1, kModeRs232},
       {"", "\r"},
       0,
       Make<BarcodeDevice>},
      {"rfid",
       "Card numbers between 02 and 0D 0A 03, one every two seconds",
       "The number of a card is five bytes and their exclusive or, as hexadecimal\n"
       "digits; with --binary the bytes themselves, and a host then needs hex tokens.\n"
       "--prefix none --suffix CRLF makes plain lines of it. Takes no commands.",
       {"\x02", "\r\n\x03"},
       2000,
       {9600, kParityNone, 8, 1, kModeRs232},
       {"", ""},
       0,
       Make<RfidDevice>},
      {"printer",
       "Takes labels and answers status requests",
       "Takes label data up to FF (0C), ETX or ^XZ and prints each label, escaped, on\n"
       "stdout. ENQ (05) asks for the status: STX \"READY,n\" ETX, n labels so far.\n"
       "Says nothing by itself.",
       {"\x02", "\x03"},
       0,
       {19200, kParityNone, 8, 1, kModeRs232},
       {"", ""},
       0,
       Make<PrinterDevice>},
      {"gauge",
       "Values with a unit, two a second, with nothing but silence in between",
       "Sends \"+12.345 mm\" without prefix and suffix: only the silence ends a value.\n"
       "M? or ? asks for one. A command ends with CR, LF, ETX or 100 ms of silence.",
       {"", ""},
       500,
       {9600, kEven, 7, 2, kModeRs485},
       {"", "\r"},
       kGaugeGapMs,
       Make<GaugeDevice>},
      {"modem",
       "Answers AT commands with echo; a report every ten seconds",
       "Knows AT, ATE0, ATE1, ATI, ATZ, ATH, AT+CSQ and AT+CREG?, each ended by CR,\n"
       "and answers CR LF OK CR LF or ERROR. Echoes until ATE0. Reports RING and the\n"
       "like by itself.",
       {kCrLf, kCrLf},
       10000,
       {115200, kParityNone, 8, 1, kModeRs232},
       {"", "\r"},
       0,
       Make<ModemDevice>},
  };
}

const char* ParityName(int parity) { return parity == kParityEven ? "even" : "none"; }

const char* ModeName(int mode) { return mode == kModeRs485 ? "RS-485" : "RS-232"; }

// A key or flag with the bytes as hexadecimal text, or nothing.
void AppendHex(const std::string& key, const std::string& bytes, std::string* text) {
  if (!bytes.empty()) {
    *text += key + CompactHex(bytes);
  }
}

}  // namespace

const std::vector<DeviceKind>& DeviceKinds() {
  static const std::vector<DeviceKind> kKinds = MakeKinds();
  return kKinds;
}

std::string ConfigurationFor(const DeviceKind& kind, const DeviceSettings& settings) {
  std::string text =
      "CfgVer=1 model=1 port=com1 baudrate=" + std::to_string(kind.line.baudrate) +
      " parity=" + ParityName(kind.line.parity) + " bits=" + std::to_string(kind.line.dataBits) +
      " stopbits=" + std::to_string(kind.line.stopBits) + " mode=" + ModeName(kind.line.mode);
  AppendHex(" rx_prefix=", settings.framing.prefix, &text);
  AppendHex(" rx_suffix=", settings.framing.suffix, &text);
  text += kind.gapMs > 0 ? " gap=" + std::to_string(kind.gapMs) : "";
  AppendHex(" tx_prefix=", kind.commands.prefix, &text);
  AppendHex(" tx_suffix=", kind.commands.suffix, &text);
  text += settings.isBinary ? " hex_tokens=true" : "";
  return text;
}

std::string ConfigArgumentsFor(const DeviceKind& kind, const DeviceSettings& settings) {
  std::string text = "-b " + std::to_string(kind.line.baudrate) + " -p " +
                     ParityName(kind.line.parity) + " -d " + std::to_string(kind.line.dataBits) +
                     " -s " + std::to_string(kind.line.stopBits);
  text += kind.line.mode == kModeRs232 ? "" : std::string(" --mode ") + ModeName(kind.line.mode);
  AppendHex(" --rx-prefix ", settings.framing.prefix, &text);
  AppendHex(" --rx-suffix ", settings.framing.suffix, &text);
  AppendHex(" --tx-prefix ", kind.commands.prefix, &text);
  AppendHex(" --tx-suffix ", kind.commands.suffix, &text);
  text += kind.gapMs > 0 ? " --gap " + std::to_string(kind.gapMs) : "";
  text += settings.isBinary ? " --hex" : "";
  return text;
}
