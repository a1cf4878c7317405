// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <optional>
#include <string>

// The keys of `term`, each behind a ctrl-t. The only place that lists them.

enum class TermKey {
  kList,
  kQuit,
  kSettings,
  kOutputMode,
  kInputMode,
  kTime,
  kLog,
  kStatistics,
  kAcknowledge,
  kAcknowledgeAll,
  kDone,
  kModemLines,
  kSendPrefix,
};

inline constexpr char kTermKeyPrefix = '\x14';  // ctrl-t

struct TermKeyEntry {
  TermKey key;
  char typed;  // behind the ctrl-t
  const char* name;
  const char* text;
};

inline constexpr std::array<TermKeyEntry, 13> kTermKeyTable = {{
    {TermKey::kList, '?', "?", "list these keys"},
    {TermKey::kQuit, 'q', "q", "quit"},
    {TermKey::kSettings, 'c', "c", "settings: configured, active, staged, stored"},
    {TermKey::kOutputMode, 'o', "o", "next output mode: text, hex, dump, raw"},
    {TermKey::kInputMode, 'i', "i", "next input mode: text, hex, console"},
    {TermKey::kTime, 't', "t", "time stamps on or off"},
    {TermKey::kLog, 'L', "L", "log on or off"},
    {TermKey::kStatistics, 's', "s", "statistics"},
    {TermKey::kAcknowledge, 'a', "a", "acknowledge the oldest token"},
    {TermKey::kAcknowledgeAll, 'A', "A", "acknowledge all tokens"},
    {TermKey::kDone, 'd', "d", "done: apply and store what is staged"},
    {TermKey::kModemLines, 'm', "m", "modem lines"},
    {TermKey::kSendPrefix, kTermKeyPrefix, "ctrl-t", "send a ctrl-t"},
}};

// Both functions: any thread.

// The key behind a ctrl-t; nothing when it is none.
std::optional<TermKey> FindTermKey(char typed);

// "ctrl-t ?       list these keys" and so on, one line a key, each with its line end.
std::string TermKeyList();
