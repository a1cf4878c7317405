// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <nlohmann/json_fwd.hpp>
#include <string>

#include "host/instance/Answer.h"
#include "host/instance/FramingInEffect.h"
#include "host/instance/SettingsBook.h"

class EventStream;
class HostSession;
class HostTag;
class Statistics;

// Carries out what commands ask of a running driver. Every way to the driver goes through here, so
// that the control socket, the terminal and the command line cannot differ.
//
//   op         further keys              data
//   info                                 port, path, pid, config, store, ident, plugin, ack
//   read       uri                       value, isText
//   write      uri, value                key, value, active when it staged a setting
//   console    line                      reply, cut
//   send       hex                       length
//   ack        all (optional)            dropped
//   waiting                              count
//   tags                                 rows of uri, name, access, value, refusal
//   settings                             rows of key, configured, active, staged, stored, console
//                                        (the last three only where there is one)
//   stage      key, value                key, value, active
//   done                                 applied (key, value, previous), stored, cleared, as does
//                                        a write to SP_Done
//   stats                                as Statistics writes them; lost_send_bytes, lost_ms,
//                                        echo_mismatches, line_errors (where the line counts)
//   lines                                dtr, rts, cts, dsr, dcd, ri (where the line has them)
//   connect    state: on, off or status  connected, changed
//
// Values, lines and replies may hold any byte and travel as hexadecimal digits, except the values
// of settings, which are texts for people. A request that lacks one of its keys, or has something
// else than a text there, is refused and changes nothing.
//
// Any thread; requests are carried out one after the other, since the driver's error text belongs
// to the last call of all threads.
class Requests {
 public:
  struct Info {
    std::string path;
    std::string configuration;
    std::string storeFile;      // empty: none
    bool acknowledges = false;  // tokens are acknowledged by the one who owns the instance
  };

  // The session must be configured; all must outlive this.
  Requests(HostSession* session, EventStream* events, const Statistics* statistics, Info info);
  ~Requests();

  Requests(const Requests&) = delete;
  Requests& operator=(const Requests&) = delete;

  Answer Handle(const nlohmann::json& request);

  // Learns the settings in effect; once, when the session has been started.
  void ReadActiveSettings();

  // Held by whoever else calls the driver.
  std::mutex& DriverMutex() { return driverMutex_; }

  // A request of another thread waits for that mutex.
  bool IsAnybodyWaiting() const { return waitingRequests_.load() > 0; }

  // The framing in effect; with the driver's mutex held.
  const FramingSettings& Framing() const { return framing_.Settings(); }

  // Called in front of a console command that destroys every tag of the driver, with the driver's
  // mutex held. Whoever keeps tags must give them back there.
  void OnDeleteTags(std::function<void()> giveBack) { giveTagsBack_ = std::move(giveBack); }

  // Grows with everything that may change which token is the oldest one.
  std::uint64_t HeadVersion() const { return headVersion_.load(); }

  // Grows with everything that may change how the driver frames what it receives, or take tokens
  // out of its queue.
  std::uint64_t SettingsVersion() const { return settingsVersion_.load(); }

 private:
  Answer Dispatch(const std::string& op, const nlohmann::json& request);
  Answer HandleInfo(const nlohmann::json& request);
  Answer HandleRead(const nlohmann::json& request);
  Answer HandleWrite(const nlohmann::json& request);
  Answer HandleConsole(const nlohmann::json& request);
  Answer HandleSend(const nlohmann::json& request);
  Answer HandleAcknowledge(const nlohmann::json& request);
  Answer HandleWaiting(const nlohmann::json& request);
  Answer HandleTags(const nlohmann::json& request);
  Answer HandleSettings(const nlohmann::json& request);
  Answer HandleStage(const nlohmann::json& request);
  Answer HandleDone(const nlohmann::json& request);
  Answer HandleConnect(const nlohmann::json& request);
  Answer HandleStats(const nlohmann::json& request);
  Answer HandleLines(const nlohmann::json& request);

  std::unique_ptr<HostTag> MakeTag(const std::string& uri, Answer* answer);
  Answer Read(const std::string& uri);
  Answer Write(const std::string& uri, const std::string& value);
  unsigned int ReadNumber(const std::string& uri);
  bool IsConnected();
  void NoteConnection(bool wasConnected);
  Answer Done(const std::string& uri, const std::string& value);
  void NoteActiveSettings();
  void NoteStaged(const SettingEntry& setting, Answer* answer);
  void ExplainConnect(bool wasConnected, Answer* answer) const;
  std::string ConsoleValue(const SettingEntry& setting) const;

  HostSession* const session_;
  EventStream* const events_;
  const Statistics* const statistics_;
  const Info info_;
  std::mutex driverMutex_;
  SettingsBook settings_;    // guarded by driverMutex_
  FramingInEffect framing_;  // guarded by driverMutex_
  std::function<void()> giveTagsBack_;
  std::atomic<int> waitingRequests_{0};
  std::atomic<std::uint64_t> settingsVersion_{0};
  std::atomic<std::uint64_t> headVersion_{0};
};
