// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <memory>
#include <mutex>
#include <set>
#include <string>
#include <vector>

#include "host/port/ModemLines.h"
#include "host/port/PortCounters.h"
#include "host/port/PortMap.h"
#include "host/port/PortObserver.h"
#include "host/port/PortProblem.h"
#include "host/port/TerminalCalls.h"
#include "interfaces/ISerialFactory.h"

class PosixSerialPort;

// Opens the ports of a port map. Owns every port until it is released. Any thread.
class PosixSerialFactory final : public ISerialFactory {
 public:
  // The observer may be null; otherwise it must outlive the factory, and so must `calls`.
  PosixSerialFactory(PortMap ports, PortObserver* observer,
                     const TerminalCalls& calls = TerminalCalls::System());
  ~PosixSerialFactory() override;

  PosixSerialFactory(const PosixSerialFactory&) = delete;
  PosixSerialFactory& operator=(const PosixSerialFactory&) = delete;

  // Answers "PosixSerialFactory" and "ISerialFactory".
  void* ConvertTo(const char* name) override;
  const char* GetImpName() const override { return "PosixSerialFactory"; }
  int GetImpVersion() const override { return 100; }

  // Opens the path that the map gives for the name, with its options. Null when there is none or it
  // cannot be opened; LastProblem then says why.
  ISerialPort* OpenPort(const char* name) override;

  // Closes a port; a call that is still waiting inside it is ended first. A pointer that is none of
  // ours is ignored.
  void ReleasePort(ISerialPort* port) override;

  // Ends the waits on all ports that are open (see PosixSerialPort::Cancel).
  void CancelAll();

  // Why the last OpenPort failed or, when a port was released after its Setup had failed, why that
  // did. Kind kNone when the last port opened was fine.
  PortProblem LastProblem() const;

  // The counts of all ports that were opened under this name, together.
  PortCounters CountersFor(const std::string& portName) const;

  // The modem lines of the open port of this name; not known without one.
  ModemLines LinesOf(const std::string& portName) const;

  // Whether the port of this name is lost for good (reconnect=off).
  bool IsGone(const std::string& portName) const;

  // Number of ports that were not released.
  std::size_t PortCount() const;

 private:
  struct OpenPortEntry {
    std::unique_ptr<PosixSerialPort> port;
    std::string name;
    std::string path;
  };

  std::unique_ptr<PosixSerialPort> TryOpen(const std::string& name, const PortOptions& options,
                                           PortProblem* problem) const;
  void NoteStableName(const std::string& path);

  const PortMap ports_;
  PortObserver* const observer_;
  const TerminalCalls& calls_;

  mutable std::mutex mutex_;
  std::vector<OpenPortEntry> open_;
  std::map<std::string, PortCounters> releasedCounters_;
  std::set<std::string> notedPaths_;
  PortProblem lastProblem_;
};
