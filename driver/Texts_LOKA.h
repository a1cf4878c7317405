// SPDX-License-Identifier: Apache-2.0
#pragma once

// The driver's own error texts. Hosts show them and integrators search for them, so they do not
// change.
namespace Texts_LOKA {

// configuration
inline constexpr const char* kUnknownFormat = "Parser: unknown format";
inline constexpr const char* kBadParity = "Parser: parameter 'parity' has invalid value";
inline constexpr const char* kBadMode = "Parser: parameter 'mode' has invalid value";
inline constexpr const char* kBadQueueSize = "parameter 'token_queue_size' out of range";
inline constexpr const char* kConfigRxPrefixNotHex = "rx_prefix not in hex format";
inline constexpr const char* kConfigRxSuffixNotHex = "rx_suffix not in hex format";
inline constexpr const char* kConfigTxPrefixNotHex = "tx_prefix not in hex format";
inline constexpr const char* kConfigTxSuffixNotHex = "tx_suffix not in hex format";

// tag URIs
inline constexpr const char* kNotThreeFields = "there must be 3 tag specification fields";
inline constexpr const char* kNoMemoryTypeField = "memorytype field missing";
inline constexpr const char* kNoDataTypeField = "vadoType field missing";
inline constexpr const char* kNoCommonParams = "Can't access protocol common parameters";
inline constexpr const char* kNoNodeParams = "Can't access protocol node parameters";
inline constexpr const char* kNoModel = "Can't access model";
inline constexpr const char* kNoMemoryType = "Can't access memory type";
inline constexpr const char* kUnknownDataType = ": data type unknown";  // behind the field
inline constexpr const char* kDataTypeNotAllowed = "not allowed vado type";
inline constexpr const char* kBadNaturalType = "invalid natural data type for this memory type";

// reads and writes
inline constexpr const char* kNotStarted = "Protocol not started";
inline constexpr const char* kCannotOpenPort = "Can't open serial port";
inline constexpr const char* kTokenTooLong = "token too long";
inline constexpr const char* kRxPrefixTooLong = "rx prefix too long to read";
inline constexpr const char* kRxSuffixTooLong = "rx suffix too long to read";
inline constexpr const char* kTxPrefixTooLong = "tx prefix too long to read";
inline constexpr const char* kTxSuffixTooLong = "tx suffix too long to read";
inline constexpr const char* kIllegalRead = "illegal memtype to read";
inline constexpr const char* kReadOnly = "writing to read_only type";
inline constexpr const char* kBehindEnd = "writing after the end of memory type";
inline constexpr const char* kWriteConversion = "write conversion error";
inline constexpr const char* kBadBaudrate = "illegal baudrate intValue";
inline constexpr const char* kRxPrefixNotHex = "Rx prefix value is not hex format";
inline constexpr const char* kRxSuffixNotHex = "Rx suffix value is not hex format";
inline constexpr const char* kTxPrefixNotHex = "Tx prefix value is not hex format";
inline constexpr const char* kTxSuffixNotHex = "Tx suffix value is not hex format";
inline constexpr const char* kTokenNotHex = "token to send must be in hex format";
inline constexpr const char* kNotActive = "Serial port not active for sending";
inline constexpr const char* kIllegalWrite = "illegal memtype to write";

}  // namespace Texts_LOKA
