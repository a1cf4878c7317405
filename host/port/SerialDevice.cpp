// SPDX-License-Identifier: Apache-2.0
#include "host/port/SerialDevice.h"

#include <fcntl.h>
#include <linux/serial.h>
#include <sys/file.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <termios.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <system_error>

#include "host/base/Deadline.h"
#include "host/base/SystemError.h"
#include "host/port/LinuxRs485.h"

namespace {

constexpr int kDrainLimitMs = 2000;
constexpr int kDrainStepMs = 5;

// ASYNC_LOW_LATENCY is an unsigned number, the flags are not.
constexpr int kLowLatency = static_cast<int>(ASYNC_LOW_LATENCY);

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
      SetProblem(problem, PortProblem::Kind::kOther, SystemErrorText(errorNumber));
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

bool MakeExclusive(int fileDescriptor) {
  if (flock(fileDescriptor, LOCK_EX | LOCK_NB) != 0) {
    return false;
  }
  // The lock above is the one that counts; a device without this request is still ours.
  (void)ioctl(fileDescriptor, TIOCEXCL);
  return true;
}

// The kernel counts in 32 bits and from the start of the machine.
std::uint64_t Since(std::uint64_t now, std::uint64_t first) {
  return static_cast<std::uint32_t>(now - first);
}

}  // namespace

std::shared_ptr<SerialDevice> SerialDevice::Open(const PortOptions& options, PortProblem* problem,
                                                 const TerminalCalls& calls) {
  problem->path = options.path;
  if (!IsCharacterDevice(options.path, problem)) {
    return nullptr;
  }
  const int fileDescriptor = open(options.path.c_str(), O_RDWR | O_NOCTTY | O_NONBLOCK | O_CLOEXEC);
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
  auto device = std::shared_ptr<SerialDevice>(new SerialDevice(fileDescriptor, options, calls));
  if (!device->MakeRaw()) {
    SetOpenProblem(errno, problem);
    return nullptr;
  }
  device->ApplyOpeningOptions();
  return device;
}

SerialDevice::~SerialDevice() {
  if (!isLost_) {
    DrainForAWhile();
    RestoreLatency();
  }
  // The mark would outlive this process on a device that somebody else keeps open.
  (void)ioctl(fileDescriptor_, TIOCNXCL);
  (void)close(fileDescriptor_);
}

// tcsetattr(3), made to succeed where a pseudo-terminal can have neither 7 bits nor parity: the C
// library answers EINVAL there when nothing else was to be changed.
bool SerialDevice::SetLine(const termios& line) const {
  return calls_.SetLine(fileDescriptor_, line) == 0 ||
         (errno == EINVAL && IsPseudoTerminal(fileDescriptor_));
}

bool SerialDevice::MakeRaw() const {
  termios line{};
  if (calls_.GetLine(fileDescriptor_, &line) != 0) {
    return false;
  }
  BuildRawMode(&line);
  AddLineOptions(options_, &line);
  return SetLine(line);
}

void SerialDevice::ApplyOpeningOptions() {
  SetModemLine("dtr", options_.dtr, TIOCM_DTR);
  SetModemLine("rts", options_.rts, TIOCM_RTS);
  if (options_.isLowLatency) {
    LowerLatency();
  }
  if (options_.flushesOnOpen) {
    (void)calls_.Flush(fileDescriptor_, TCIOFLUSH);
  }
  firstErrors_ = ReadErrors();
}

void SerialDevice::SetModemLine(const char* name, PortOptions::Level level, int bit) {
  if (level == PortOptions::Level::kKeep) {
    return;
  }
  const bool isOn = level == PortOptions::Level::kOn;
  if (calls_.Ioctl(fileDescriptor_, isOn ? TIOCMBIS : TIOCMBIC, &bit) != 0) {
    openingNotes_.push_back(std::string(name) + (isOn ? "=on" : "=off") +
                            " has no effect, the line answers: " + SystemErrorText(errno));
  }
}

// Best effort: many lines have no such setting, and they work without it.
void SerialDevice::LowerLatency() {
  serial_struct settings{};
  if (calls_.Ioctl(fileDescriptor_, TIOCGSERIAL, &settings) != 0 ||
      (settings.flags & kLowLatency) != 0) {
    return;
  }
  settings.flags |= kLowLatency;
  hasLoweredLatency_ = calls_.Ioctl(fileDescriptor_, TIOCSSERIAL, &settings) == 0;
}

void SerialDevice::RestoreLatency() const {
  serial_struct settings{};
  if (hasLoweredLatency_ && calls_.Ioctl(fileDescriptor_, TIOCGSERIAL, &settings) == 0) {
    settings.flags &= ~kLowLatency;
    (void)calls_.Ioctl(fileDescriptor_, TIOCSSERIAL, &settings);
  }
}

bool SerialDevice::Apply(const LineSettings& settings, std::string* why, std::string* note) {
  *why = WhyInvalid(settings);
  if (!why->empty()) {
    return false;
  }
  termios line{};
  if (calls_.GetLine(fileDescriptor_, &line) != 0 || !BuildTermios(settings, &line)) {
    *why = "the device refuses " + DescribeLine(settings) + ": " + SystemErrorText(errno);
    return false;
  }
  AddLineOptions(options_, &line);
  if (!SetLine(line)) {
    *why = "the device refuses " + DescribeLine(settings) + ": " + SystemErrorText(errno);
    return false;
  }
  return ApplyDirection(settings.mode, why, note);
}

bool SerialDevice::ApplyDirection(int mode, std::string* why, std::string* note) {
  const PortOptions::Rs485 policy = options_.rs485;
  needsRts_ = policy == PortOptions::Rs485::kRts && NeedsDirection(mode);
  if (policy == PortOptions::Rs485::kOff) {
    return true;
  }
  if (policy == PortOptions::Rs485::kRts) {
    if (needsRts_ && !SetRts(false)) {
      needsRts_ = false;
      *why = "rs485=rts: the line cannot switch RTS: " + SystemErrorText(errno);
      return false;
    }
    return true;
  }
  const Rs485Outcome outcome = ApplyRs485(calls_, fileDescriptor_, mode);
  if (outcome == Rs485Outcome::kDone) {
    return true;
  }
  if (outcome == Rs485Outcome::kNotSupported && policy == PortOptions::Rs485::kAuto) {
    *note =
        "the kernel cannot control the RS-485 direction of this port; "
        "going on, as adapters that turn around on their own need";
    return true;
  }
  *why = outcome == Rs485Outcome::kNotSupported
             ? "rs485=ioctl: the kernel cannot control the RS-485 direction of this port"
             : "the device refuses RS-485: " + SystemErrorText(errno);
  return false;
}

bool SerialDevice::SetRts(bool isOn) const {
  int bit = TIOCM_RTS;
  return calls_.Ioctl(fileDescriptor_, isOn ? TIOCMBIS : TIOCMBIC, &bit) == 0;
}

ModemLines SerialDevice::Lines() const {
  ModemLines lines;
  int bits = 0;
  if (calls_.Ioctl(fileDescriptor_, TIOCMGET, &bits) != 0) {
    return lines;
  }
  lines.areKnown = true;
  lines.dtr = (bits & TIOCM_DTR) != 0;
  lines.rts = (bits & TIOCM_RTS) != 0;
  lines.cts = (bits & TIOCM_CTS) != 0;
  lines.dsr = (bits & TIOCM_DSR) != 0;
  lines.dcd = (bits & TIOCM_CAR) != 0;
  lines.ri = (bits & TIOCM_RNG) != 0;
  return lines;
}

int SerialDevice::PendingBytes() const {
  int pending = 0;
  return calls_.Ioctl(fileDescriptor_, TIOCOUTQ, &pending) == 0 ? pending : 0;
}

int SerialDevice::ErrorNumber() const {
  int pending = 0;
  return calls_.Ioctl(fileDescriptor_, TIOCOUTQ, &pending) == 0 ? 0 : errno;
}

LineErrors SerialDevice::ReadErrors() const {
  serial_icounter_struct counts{};
  LineErrors errors;
  if (calls_.Ioctl(fileDescriptor_, TIOCGICOUNT, &counts) != 0) {
    return errors;
  }
  const auto count = [](int value) { return static_cast<std::uint32_t>(value); };
  errors.areKnown = true;
  errors.framing = count(counts.frame);
  errors.parity = count(counts.parity);
  errors.overruns = count(counts.overrun);
  errors.breaks = count(counts.brk);
  errors.bufferOverruns = count(counts.buf_overrun);
  return errors;
}

LineErrors SerialDevice::Errors() const {
  LineErrors errors = ReadErrors();
  const std::lock_guard<std::mutex> lock(errorsMutex_);
  if (!errors.areKnown || !firstErrors_.areKnown) {
    return lastErrors_;
  }
  errors.framing = Since(errors.framing, firstErrors_.framing);
  errors.parity = Since(errors.parity, firstErrors_.parity);
  errors.overruns = Since(errors.overruns, firstErrors_.overruns);
  errors.breaks = Since(errors.breaks, firstErrors_.breaks);
  errors.bufferOverruns = Since(errors.bufferOverruns, firstErrors_.bufferOverruns);
  lastErrors_ = errors;
  return errors;
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
