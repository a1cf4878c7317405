// SPDX-License-Identifier: Apache-2.0
#include "driver/SerialSettings.h"

#include <algorithm>
#include <array>
#include <tuple>

#include "interfaces/ISerialPort.h"

namespace {

// Indexed by code; the configuration accepts the first ones only.
constexpr std::array<const char*, 5> kParityNames = {"none", "even", "odd", "mark", "space"};
constexpr std::array<const char*, 4> kModeNames = {"RS-232", "RS-485", "RS-422", "RS-485P"};
constexpr int kConfigurableParities = kParityMark + 1;
constexpr int kConfigurableModes = kModeRs422 + 1;

constexpr std::array<int, 11> kBaudrates = {150,  300,   600,   1200,  2400,  4800,
                                            9600, 19200, 38400, 57600, 115200};

template <std::size_t Size>
std::optional<int> FindWord(const std::array<const char*, Size>& names, int count,
                            const std::string& word) {
  const auto end = names.begin() + count;
  const auto found = std::find(names.begin(), end, word);
  return found == end ? std::nullopt : std::optional<int>(static_cast<int>(found - names.begin()));
}

template <std::size_t Size>
const char* NameOf(const std::array<const char*, Size>& names, int code) {
  return code >= 0 && code < static_cast<int>(Size) ? names[static_cast<std::size_t>(code)]
                                                    : names.front();
}

}  // namespace

bool operator==(const SerialSettings& a, const SerialSettings& b) {
  return std::tie(a.baudrate, a.parity, a.dataBits, a.stopBits, a.mode) ==
         std::tie(b.baudrate, b.parity, b.dataBits, b.stopBits, b.mode);
}

std::optional<int> ParityFromConfig(const std::string& word) {
  return FindWord(kParityNames, kConfigurableParities, word);
}

std::optional<int> ModeFromConfig(const std::string& word) {
  return FindWord(kModeNames, kConfigurableModes, word);
}

const char* ParityName(int parity) { return NameOf(kParityNames, parity); }

const char* ModeName(int mode) { return NameOf(kModeNames, mode); }

bool IsListedBaudrate(int baudrate) {
  return std::find(kBaudrates.begin(), kBaudrates.end(), baudrate) != kBaudrates.end();
}

bool IsParityCode(int parity) { return parity >= kParityNone && parity <= kParitySpace; }

bool IsDataBits(int dataBits) { return dataBits == 7 || dataBits == 8; }

bool IsStopBits(int stopBits) { return stopBits == 1 || stopBits == 2; }

bool IsSettableMode(int mode) { return mode >= kModeRs232 && mode <= kModeRs422; }
