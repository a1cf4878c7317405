// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "bench/reader/ObligedHost.h"
#include "interfaces/IMultiTask2.h"
#include "interfaces/IPermanentStorage.h"
#include "interfaces/ISerialFactory.h"
#include "interfaces/ISerialPort.h"
#include "interfaces/ITask.h"
#include "protlib/HostInterfaces.h"

// A line that repeats the same bytes for ever, with a silence behind each round when asked for.
class EndlessPort final : public ISerialPort {
 public:
  void* ConvertTo(const char* /*name*/) override { return nullptr; }
  void reserved3() override {}
  void reserved4() override {}
  int Setup(int /*baudrate*/, int /*parity*/, int /*dataBits*/, int /*stopBits*/,
            int /*mode*/) override {
    return 1;
  }
  int Send(const unsigned char* /*data*/, int lengthBytes, int /*timeoutMs*/) override {
    return lengthBytes;
  }
  // A real port stands in another file; without the attribute the loops would have it for nothing.
  [[gnu::noinline]] int Receive(unsigned char* byte, int /*timeoutMs*/, int /*reserved*/) override {
    if (next_ == round_.size()) {
      next_ = 0;
      if (hasSilence_) {
        return 0;
      }
    }
    *byte = static_cast<unsigned char>(round_[next_++]);
    return 1;
  }

  void Play(std::string round, bool hasSilence) {
    round_ = std::move(round);
    hasSilence_ = hasSilence;
    next_ = 0;
  }

 private:
  std::string round_ = "x";
  std::size_t next_ = 0;
  bool hasSilence_ = false;
};

// A host in memory whose semaphores are mutexes and whose task never runs: the receive passes are
// called by whoever measures them. It is the process's host while it lives. One thread.
class MemoryHost {
 public:
  MemoryHost() {
    piMultiTask = &tasks_;
    piSerialFactory = &ports_;
    piPermanentStorage = &storage_;
  }
  ~MemoryHost() {
    piMultiTask = nullptr;
    piSerialFactory = nullptr;
    piPermanentStorage = nullptr;
  }
  MemoryHost(const MemoryHost&) = delete;
  MemoryHost& operator=(const MemoryHost&) = delete;

  EndlessPort& Line() { return ports_.port; }

 private:
  class IdleTask final : public ITask {
   public:
    void* ConvertTo(const char* /*name*/) override { return nullptr; }
    int IsToEnd() override { return 1; }
    void reserved4() override {}
    int Start() override { return 1; }
  };

  class Tasks final : public IMultiTask2 {
   public:
    void* ConvertTo(const char* /*name*/) override { return nullptr; }
    const char* GetImpName() const override { return "MemoryTasks"; }
    int GetImpVersion() const override { return 1; }
    void reserved5() override {}
    int StopTask(ITask* /*task*/, int /*timeoutMs*/) override { return 1; }
    ISemaphore* CreateSemaphore(int /*reserved*/) override {
      semaphores_.push_back(MakeMutexSemaphore());
      return semaphores_.back().get();
    }
    void DeleteSemaphore(ISemaphore* /*semaphore*/) override {}
    void Sleep(int /*milliseconds*/) override {}
    void reserved10() override {}
    void reserved11() override {}
    void reserved12() override {}
    ITask* CreateTask(ITaskRunner* /*runner*/, int /*taskClass*/) override { return &task_; }

   private:
    std::vector<std::unique_ptr<ISemaphore>> semaphores_;
    IdleTask task_;
  };

  class Ports final : public ISerialFactory {
   public:
    void* ConvertTo(const char* /*name*/) override { return nullptr; }
    const char* GetImpName() const override { return "MemoryPorts"; }
    int GetImpVersion() const override { return 1; }
    ISerialPort* OpenPort(const char* /*name*/) override { return &port; }
    void ReleasePort(ISerialPort* /*port*/) override {}
    EndlessPort port;
  };

  // Takes everything and finds nothing.
  class Storage final : public IPermanentStorage {
   public:
    void* ConvertTo(const char* /*name*/) override { return nullptr; }
    const char* GetImpName() const override { return "MemoryStorage"; }
    int GetImpVersion() const override { return 1; }
    void SetString(const char* /*ident*/, const char* /*key*/, const char* /*text*/) override {}
    void SetBoolean(const char* /*ident*/, const char* /*key*/, bool /*value*/) override {}
    void SetInteger(const char* /*ident*/, const char* /*key*/, int /*value*/) override {}
    const char* GetString(const char* /*ident*/, const char* /*key*/) override { return nullptr; }
    bool GetBoolean(const char* /*ident*/, const char* /*key*/) override { return false; }
    int GetInteger(const char* /*ident*/, const char* /*key*/) override { return 0; }
    int Exists(const char* /*ident*/, const char* /*key*/) override { return 0; }
  };

  Tasks tasks_;
  Ports ports_;
  Storage storage_;
};
