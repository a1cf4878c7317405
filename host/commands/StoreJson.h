// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "host/store/SqliteFile.h"

// Stored settings as a JSON text, for `loka store export` and `import`:
//
//   {"com1": {"baud": 19200, "hex_tokens": true, "rx_suffix": "0D0A"}}
//
// Key spaces hold keys; numbers, booleans and texts keep their kind. A text that is no UTF-8 stands
// as {"hex": "FF..."}. Any thread.
std::string StoreJson(const SqliteFile::Values& values);

// Reads what StoreJson writes. False, with `values` untouched and the reason in `error`, for
// anything else, and for a value of a known setting that has another kind: the driver would read 0
// in its place.
bool ParseStoreJson(const std::string& text, SqliteFile::Values* values, std::string* error);
