// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string>

// How the serial line runs.
struct SerialSettings {
  int baudrate = 0;  // bits a second
  int parity = 0;    // a SerialParity code
  int dataBits = 0;
  int stopBits = 0;
  int mode = 0;  // a SerialMode code
};

bool operator==(const SerialSettings& a, const SerialSettings& b);

// The code of a word of the configuration; nothing when the configuration does not accept it. Space
// parity and the mode RS-485P cannot be configured.
std::optional<int> ParityFromConfig(const std::string& word);
std::optional<int> ModeFromConfig(const std::string& word);

// The word for a code: "none" for an unknown parity, "RS-232" for an unknown mode.
const char* ParityName(int parity);
const char* ModeName(int mode);

// What may be written at run time: the eleven listed baud rates, parity 0 to 4, 7 or 8 data bits, 1
// or 2 stop bits, mode 0 to 2.
bool IsListedBaudrate(int baudrate);
bool IsParityCode(int parity);
bool IsDataBits(int dataBits);
bool IsStopBits(int stopBits);
bool IsSettableMode(int mode);
