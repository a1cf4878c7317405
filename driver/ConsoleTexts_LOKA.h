// SPDX-License-Identifier: Apache-2.0
#pragma once

// Replies of the driver's own console commands.
namespace ConsoleTexts_LOKA {

inline constexpr const char* kHelp =
    "connect cmd - set connect ON or OFF\n"
    "get_stat - get status of connection\n"
    "put str - put the token to send\n"
    "get - get the received token\n"
    "get_token_length - get the length of the received token\n"
    "tokens_available - get number of tokens received\n"
    "token_ack - acknowledge reading token - \"token_ack all\" clears the queue\n"
    "set_hexToken ON/OFF - set the hexToken mode\n"
    "set_rxGap value - set the rx gap in ms\n"
    "set_rxPrefix string - set the rx prefix\n"
    "set_rxSuffix string - set the rx suffix\n"
    "set_txPrefix string - set the tx prefix\n"
    "set_txSuffix string - set the tx suffix\n";

inline constexpr const char* kOn = "ON";
inline constexpr const char* kOff = "OFF";
inline constexpr const char* kAll = "all";
inline constexpr const char* kOk = "OK";
inline constexpr const char* kConnected = "Connected";
inline constexpr const char* kDisconnected = "Disconnected";
inline constexpr const char* kWrongValue = "ERROR: wrong value";
inline constexpr const char* kNewValueMissing = "ERROR: new value is missing";
inline constexpr const char* kConnectStateMissing = "ERROR: new connect state is missing";
inline constexpr const char* kStringMissing = "ERROR: string to send is missing";
inline constexpr const char* kTokenNotHex = "ERROR: token to send must be in hex format";
inline constexpr const char* kNotActive = "ERROR: serial port is not active for sending";

}  // namespace ConsoleTexts_LOKA
