// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <functional>
#include <utility>

#include "host/framing/LineScript.h"
#include "host/runtime/HostCdsBuffer.h"
#include "host/runtime/HostSocketFactory.h"
#include "interfaces/IInterfaceFactory.h"
#include "interfaces/IMultiTask2.h"
#include "interfaces/ISemaphore.h"
#include "interfaces/ISerialFactory.h"
#include "interfaces/ISerialPort.h"
#include "interfaces/ITask.h"

// The services that a plug-in needs, for a single thread and a line that plays a script. All of
// them: that thread.

// Plays the script. A receive that waits at least as long as a silence lasts moves on behind it.
class ReplayPort final : public ISerialPort {
 public:
  explicit ReplayPort(const LineScript* script) : script_(script) {}

  void* ConvertTo(const char* name) override;
  void reserved3() override {}
  void reserved4() override {}
  int Setup(int baudrate, int parity, int dataBits, int stopBits, int mode) override;
  int Send(const unsigned char* data, int lengthBytes, int timeoutMs) override;
  int Receive(unsigned char* byte, int timeoutMs, int reserved) override;

  // True once a receive has found nothing behind the script's end.
  bool IsPlayed() const { return isPlayed_; }

  // Bytes that the driver has taken.
  std::size_t BytesPlayed() const { return bytesPlayed_; }

  // Called in front of each byte with its number, from 1 on.
  void SetBeforeByte(std::function<void(std::size_t)> action) { beforeByte_ = std::move(action); }

 private:
  const LineScript* const script_;
  std::size_t event_ = 0;
  std::size_t position_ = 0;  // of the next byte in the event, or ms of the silence gone by
  bool isPlayed_ = false;
  std::size_t bytesPlayed_ = 0;
  std::function<void(std::size_t)> beforeByte_;
};

class ReplaySerialFactory final : public ISerialFactory {
 public:
  explicit ReplaySerialFactory(ReplayPort* port) : port_(port) {}

  void* ConvertTo(const char* name) override;
  const char* GetImpName() const override { return "ReplaySerialFactory"; }
  int GetImpVersion() const override { return 100; }
  ISerialPort* OpenPort(const char* name) override;
  void ReleasePort(ISerialPort* port) override;

 private:
  ReplayPort* const port_;
};

// Never blocks: there is one thread, and one semaphore stands for all that the driver makes.
class ReplaySemaphore final : public ISemaphore {
 public:
  void* ConvertTo(const char* name) override;
  int Lock() override;
  int Unlock() override;

  // Called each time the driver holds none any more: where a host may call into it.
  void SetWhenFree(std::function<void()> action) { whenFree_ = std::move(action); }

 private:
  int held_ = 0;
  std::function<void()> whenFree_;
};

// Keeps the runner; whoever owns the host lets it run.
class ReplayTask final : public ITask {
 public:
  explicit ReplayTask(const ReplayPort* port) : port_(port) {}

  void* ConvertTo(const char* name) override;
  int IsToEnd() override { return port_->IsPlayed() ? 1 : 0; }
  void reserved4() override {}
  int Start() override { return 1; }

  void SetRunner(ITaskRunner* runner) { runner_ = runner; }
  // Receive passes until the script is played.
  void Run();

 private:
  const ReplayPort* const port_;
  ITaskRunner* runner_ = nullptr;
};

class ReplayMultiTask final : public IMultiTask2 {
 public:
  explicit ReplayMultiTask(ReplayTask* task) : task_(task) {}

  void* ConvertTo(const char* name) override;
  const char* GetImpName() const override { return "ReplayMultiTask"; }
  int GetImpVersion() const override { return 100; }
  void reserved5() override {}
  int StopTask(ITask* task, int timeoutMs) override;
  ISemaphore* CreateSemaphore(int reserved) override;
  void DeleteSemaphore(ISemaphore* semaphore) override;
  void Sleep(int milliseconds) override;
  void reserved10() override {}
  void reserved11() override {}
  void reserved12() override {}
  ITask* CreateTask(ITaskRunner* runner, int taskClass) override;

  ReplaySemaphore& Semaphore() { return semaphore_; }

  // Called between two passes.
  void SetBetweenPasses(std::function<void()> action) { betweenPasses_ = std::move(action); }

 private:
  ReplayTask* const task_;
  ReplaySemaphore semaphore_;
  std::function<void()> betweenPasses_;
};

// The factory that a plug-in's module is bound to.
class ReplayHost final : public IInterfaceFactory {
 public:
  // The script must outlive the host.
  explicit ReplayHost(const LineScript* script)
      : port_(script), serialFactory_(&port_), task_(&port_), multiTask_(&task_) {}

  IInterface* CreateInterface(const char* name) override;
  void ReleaseInterface(IInterface* interface) override;

  ReplayPort& Port() { return port_; }
  ReplayTask& Task() { return task_; }
  ReplayMultiTask& MultiTask() { return multiTask_; }

 private:
  ReplayPort port_;
  ReplaySerialFactory serialFactory_;
  ReplayTask task_;
  ReplayMultiTask multiTask_;
  HostSocketFactory socketFactory_;
  HostCdsBuffer cdsBuffer_;
};
