// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/types.h>

#include <string>

// A whole panel under emulation: ARM processor, kernel, disk, and a UART whose line ends here. Its
// console runs commands. Operations throw std::runtime_error when the panel does not answer in
// time. One thread.
class EmulatedPanel {
 public:
  struct Reply {
    int status = -1;
    std::string output;  // without line ends behind it
  };

  // Switches on and waits until the panel obeys. The folder holds vmlinuz and initramfs.gz; the
  // disk image keeps what the panel writes on /data.
  EmulatedPanel(const std::string& imageFolder, const std::string& diskImage);
  // Cuts the power.
  ~EmulatedPanel();
  EmulatedPanel(const EmulatedPanel&) = delete;
  EmulatedPanel& operator=(const EmulatedPanel&) = delete;

  // The panel's process ends at once, without a word to what runs in it.
  void CutPower();

  // Runs one shell command line in the panel.
  Reply Run(const std::string& command, int timeoutMs = 120000);

  // The line's other end: what a device sends and sees.
  void SendOnLine(const std::string& bytes);
  // Sends no faster than the line would at this many bits a second (10 a byte).
  void SendAtRate(const std::string& bytes, int bitsPerSecond);
  // Bytes that the panel has sent: waits until there are `count`, or until the time is over.
  std::string TakeFromLine(std::size_t count, int timeoutMs = 20000);

  // Milliseconds from switching on until the panel obeyed, on this machine.
  long long StartMs() const { return startMs_; }

 private:
  void StartEmulator(const std::string& imageFolder, const std::string& diskImage);
  void ConnectLine();
  // The next line of the console without its end.
  std::string ConsoleLine(long long deadlineMs);

  pid_t emulator_ = -1;
  int consoleIn_ = -1;
  int consoleOut_ = -1;
  int line_ = -1;
  std::string folder_;
  std::string consolePending_;
  std::string linePending_;
  long long startMs_ = 0;
};
