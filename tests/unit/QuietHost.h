// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>

#include "interfaces/IMultiTask2.h"
#include "interfaces/IPermanentStorage.h"
#include "interfaces/ISemaphore.h"
#include "interfaces/ISerialFactory.h"
#include "interfaces/ISerialPort.h"
#include "interfaces/ITask.h"
#include "interfaces/ITaskRunner.h"
#include "protlib/HostInterfaces.h"

// A host that allocates nothing, so that a test can let the driver's allocations fail one by one.
// It counts what is lent out: everything is back when Outstanding() is 0. Its line says nothing but
// the bytes of `line`; its storage holds nothing.
class QuietHost {
 public:
  QuietHost() {
    piMultiTask = &tasks_;
    piSerialFactory = &ports_;
    piPermanentStorage = &storage_;
  }
  ~QuietHost() {
    piMultiTask = nullptr;
    piSerialFactory = nullptr;
    piPermanentStorage = nullptr;
  }
  QuietHost(const QuietHost&) = delete;
  QuietHost& operator=(const QuietHost&) = delete;

  // The bytes that the line gives before it falls silent; not copied.
  void SetLine(const char* bytes, std::size_t count) {
    ports_.port.line = bytes;
    ports_.port.left = count;
  }

  int Outstanding() const { return tasks_.semaphores + tasks_.tasks + ports_.open; }
  int HeldSemaphores() const { return tasks_.first.held + tasks_.second.held; }
  int SentBytes() const { return ports_.port.sentBytes; }
  int StoredValues() const { return storage_.stored; }

 private:
  class Semaphore final : public ISemaphore {
   public:
    void* ConvertTo(const char* /*name*/) override { return nullptr; }
    int Lock() override { return ++held; }
    int Unlock() override {
      --held;
      return 1;
    }
    int held = 0;
  };

  class Task final : public ITask {
   public:
    void* ConvertTo(const char* /*name*/) override { return nullptr; }
    int IsToEnd() override { return 1; }
    void reserved4() override {}
    int Start() override { return 1; }
  };

  class Tasks final : public IMultiTask2 {
   public:
    void* ConvertTo(const char* /*name*/) override { return nullptr; }
    const char* GetImpName() const override { return "QuietTasks"; }
    int GetImpVersion() const override { return 1; }
    void reserved5() override {}
    int StopTask(ITask* /*task*/, int /*timeoutMs*/) override {
      --tasks;
      return 1;
    }
    ISemaphore* CreateSemaphore(int /*reserved*/) override {
      return semaphores++ == 0 ? &first : &second;
    }
    void DeleteSemaphore(ISemaphore* /*semaphore*/) override { --semaphores; }
    void Sleep(int /*milliseconds*/) override {}
    void reserved10() override {}
    void reserved11() override {}
    void reserved12() override {}
    ITask* CreateTask(ITaskRunner* /*runner*/, int /*taskClass*/) override {
      ++tasks;
      return &task;
    }
    Semaphore first;
    Semaphore second;
    Task task;
    int semaphores = 0;
    int tasks = 0;
  };

  class Port final : public ISerialPort {
   public:
    void* ConvertTo(const char* /*name*/) override { return nullptr; }
    void reserved3() override {}
    void reserved4() override {}
    int Setup(int /*baudrate*/, int /*parity*/, int /*dataBits*/, int /*stopBits*/,
              int /*mode*/) override {
      return 1;
    }
    int Send(const unsigned char* /*data*/, int lengthBytes, int /*timeoutMs*/) override {
      sentBytes += lengthBytes;
      return 1;
    }
    int Receive(unsigned char* byte, int /*timeoutMs*/, int /*reserved*/) override {
      if (left == 0) return 0;
      *byte = static_cast<unsigned char>(*line++);
      --left;
      return 1;
    }
    const char* line = nullptr;
    std::size_t left = 0;
    int sentBytes = 0;
  };

  class Ports final : public ISerialFactory {
   public:
    void* ConvertTo(const char* /*name*/) override { return nullptr; }
    const char* GetImpName() const override { return "QuietPorts"; }
    int GetImpVersion() const override { return 1; }
    ISerialPort* OpenPort(const char* /*name*/) override {
      ++open;
      return &port;
    }
    void ReleasePort(ISerialPort* /*port*/) override { --open; }
    Port port;
    int open = 0;
  };

  class Storage final : public IPermanentStorage {
   public:
    void* ConvertTo(const char* /*name*/) override { return nullptr; }
    const char* GetImpName() const override { return "QuietStorage"; }
    int GetImpVersion() const override { return 1; }
    void SetString(const char* /*ident*/, const char* /*key*/, const char* /*text*/) override {
      ++stored;
    }
    void SetBoolean(const char* /*ident*/, const char* /*key*/, bool /*value*/) override {
      ++stored;
    }
    void SetInteger(const char* /*ident*/, const char* /*key*/, int /*value*/) override {
      ++stored;
    }
    const char* GetString(const char* /*ident*/, const char* /*key*/) override { return nullptr; }
    bool GetBoolean(const char* /*ident*/, const char* /*key*/) override { return false; }
    int GetInteger(const char* /*ident*/, const char* /*key*/) override { return 0; }
    int Exists(const char* /*ident*/, const char* /*key*/) override { return 0; }
    int stored = 0;
  };

  Tasks tasks_;
  Ports ports_;
  Storage storage_;
};
