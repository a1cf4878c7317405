// SPDX-License-Identifier: Apache-2.0
#include "host/SerialDevice.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <termios.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <system_error>

#include "host/Deadline.h"
#include "host/LinuxRs485.h"

namespace {

constexpr int kDrainLimitMs = 2000;
constexpr int kDrainStepMs = 5;

std::string ErrorText(int errorNumber) { return std::generic_category().message(errorNumber); }

void SetProblem(PortProblem* problem, PortProblem::Kind kind, const std::string& text) {
  problem->kind = kind;
  problem->text = text;
}

void SetBusy(PortProblem* problem) {
  problem->holders = FindPortHolders(problem->path);
  SetProblem(problem, PortProblem::Kind::kBusy, "in use");
}

void SetOpenProblem(int errorNumber, PortProblem* problem) {
  switch (errorNumber) {
    case ENOENT:
    case ENOTDIR:
      SetProblem(problem, PortProblem::Kind::kAbsent, "no such port");
      break;
    case ENXIO:
    case ENODEV:
      SetProblem(problem, PortProblem::Kind::kAbsent, "no device behind this name");
      break;
    case EIO:
      SetProblem(problem, PortProblem::Kind::kAbsent, "nothing at the other end");
      break;
    case EACCES:
    case EPERM:
      SetProblem(problem, PortProblem::Kind::kNoRights, "you are not allowed to open it");
      break;
    case EBUSY:
      SetBusy(problem);
      break;
    default:
      SetProblem(problem, PortProblem::Kind::kOther, ErrorText(errorNumber));
  }
}

// Opening a pipe or a file by mistake could block or do harm, so the kind is asked for first.
bool IsCharacterDevice(const std::string& path, PortProblem* problem) {
  struct stat status {};
  if (stat(path.c_str(), &status) != 0) {
    SetOpenProblem(errno, problem);
    return false;
  }
  if (!S_ISCHR(status.st_mode)) {
    SetProblem(problem, PortProblem::Kind::kNotSerial, "not a serial port");
    return false;
  }
  return true;
}

bool IsPseudoTerminal(int fileDescriptor) {
  // Major numbers 136 to 143 (the kernel's devices.txt).
  constexpr unsigned int kFirstMajor = 136;
  constexpr unsigned int kLastMajor = 143;
  struct stat status {};
  return fstat(fileDescriptor, &status) == 0 && major(status.st_rdev) >= kFirstMajor &&
         major(status.st_rdev) <= kLastMajor;
}

// tcsetattr(3), made to succeed where a pseudo-terminal can have neither 7 bits nor parity: the C
// library answers EINVAL there when nothing else was to be changed.
bool SetLine(int fileDescriptor, const termios& line) {
  return tcsetattr(fileDescriptor, TCSANOW, &line) == 0 ||
         (errno == EINVAL && IsPseudoTerminal(fileDescriptor));
}

bool MakeExclusive(int fileDescriptor) {
  if (flock(fileDescriptor, LOCK_EX | LOCK_NB) != 0) {
    return false;
  }
  // The lock above is the one that counts; a device without this request is still ours.
  (void)ioctl(fileDescriptor, TIOCEXCL);
  return true;
}

bool MakeRaw(int fileDescriptor) {
  termios line{};
  if (tcgetattr(fileDescriptor, &line) != 0) {
    return false;
  }
  BuildRawMode(&line);
  return SetLine(fileDescriptor, line);
}

}  // namespace

std::shared_ptr<SerialDevice> SerialDevice::Open(const std::string& path, PortProblem* problem) {
  problem->path = path;
  if (!IsCharacterDevice(path, problem)) {
    return nullptr;
  }
  const int fileDescriptor = open(path.c_str(), O_RDWR | O_NOCTTY | O_NONBLOCK | O_CLOEXEC);
  if (fileDescriptor < 0) {
    SetOpenProblem(errno, problem);
    return nullptr;
  }
  if (isatty(fileDescriptor) == 0) {
    close(fileDescriptor);
    SetProblem(problem, PortProblem::Kind::kNotSerial, "not a serial port");
    return nullptr;
  }
  if (!MakeExclusive(fileDescriptor)) {
    // Closed first, so that the search for the holder does not find this process.
    close(fileDescriptor);
    SetBusy(problem);
    return nullptr;
  }
  auto device = std::shared_ptr<SerialDevice>(new SerialDevice(fileDescriptor));
  if (!MakeRaw(fileDescriptor)) {
    SetOpenProblem(errno, problem);
    return nullptr;
  }
  return device;
}

SerialDevice::~SerialDevice() {
  if (!isLost_) {
    DrainForAWhile();
  }
  // The mark would outlive this process on a device that somebody else keeps open.
  (void)ioctl(fileDescriptor_, TIOCNXCL);
  (void)close(fileDescriptor_);
}

bool SerialDevice::Apply(const LineSettings& settings, std::string* why, std::string* note) const {
  *why = WhyInvalid(settings);
  if (!why->empty()) {
    return false;
  }
  termios line{};
  if (tcgetattr(fileDescriptor_, &line) != 0 || !BuildTermios(settings, &line) ||
      !SetLine(fileDescriptor_, line)) {
    *why = "the device refuses " + DescribeLine(settings) + ": " + ErrorText(errno);
    return false;
  }
  switch (ApplyRs485(fileDescriptor_, settings.mode)) {
    case Rs485Outcome::kNotSupported:
      *note =
          "the kernel cannot control the RS-485 direction of this port; "
          "going on, as adapters that turn around on their own need";
      return true;
    case Rs485Outcome::kFailed:
      *why = "the device refuses RS-485: " + ErrorText(errno);
      return false;
    default:
      return true;
  }
}

int SerialDevice::PendingBytes() const {
  int pending = 0;
  return ioctl(fileDescriptor_, TIOCOUTQ, &pending) == 0 ? pending : 0;
}

void SerialDevice::DrainForAWhile() const {
  const Deadline deadline = Deadline::After(kDrainLimitMs);
  while (PendingBytes() > 0) {
    if (deadline.HasPassed()) {
      // What is left would make close(2) wait, for half a minute on some drivers.
      (void)tcflush(fileDescriptor_, TCOFLUSH);
      return;
    }
    Deadline::Earlier(deadline, Deadline::After(kDrainStepMs)).Sleep();
  }
}
