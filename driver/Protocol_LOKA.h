// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <mutex>
#include <string>
#include <string_view>

#include "driver/ParamManager.h"
#include "driver/ReadTarget.h"
#include "driver/RunningSettings.h"
#include "driver/SerialLink.h"
#include "driver/TaskRunner_LOKA.h"
#include "driver/TokenFramer.h"
#include "driver/TokenQueue.h"
#include "model/GroupParameterReplacer.h"
#include "model/MemoryManager.h"
#include "model/ParameterReplacer.h"
#include "protlib/ProtocolBase.h"

class IMultiTask2;
class ISemaphore;
class Tag_LOKA;
struct BlockAccess;

// The driver: one object per protocol instance of the host. The way of a received token leads
// through Task (a byte, a frame, the queue) and doReadBlock (the tag); the way of a sent one
// through Write and doWrite.
//
// Two semaphores of the host order what the host can see. The queue semaphore is held around each
// change and read of the token queue by the receive task and the token memory types, while a token
// is sent, and while settings are applied. The port semaphore is held around each received byte and
// around opening and releasing the port on request. Where both are needed the queue semaphore comes
// first; the receive task never holds both. Apart from them every member keeps itself whole.
class Protocol_LOKA : public ProtocolBase {
 public:
  // Copies the host's services, builds the memory model, creates the semaphores. The module must
  // have been initialised; a missing service makes the operations fail that need it. May throw
  // std::bad_alloc.
  Protocol_LOKA();
  Protocol_LOKA(const Protocol_LOKA&) = delete;
  Protocol_LOKA& operator=(const Protocol_LOKA&) = delete;
  ~Protocol_LOKA() override;

  // --- identity (Protocol_LOKA.cpp) ---
  void* ConvertTo(const char* name) override;
  const char* GetImpName() const override;
  int GetImpVersion() const override;
  const char* GetName() const override;
  const char* GetProtocolName() const override;
  int GetProtocolVersion() const override;
  int GetProtocolType() const override;
  int GetMaxTm(const ITag* tag) const override;
  const char* const* tagUriNames() const override;
  int vcsGetCapability() const override;
  int vcsGetComParams(char* buffer, int sizeBytes) const override;
  int Extend(int code, void* data) override;

  // --- tags (Protocol_LOKA.cpp) ---
  TagBase* CreateTagBase(const char* uri) override;
  int GetNodeID(const ITag* tag) const override;
  bool CanBeOptimized(const ITag* first, const ITag* second, bool forWrite) const override;

  // --- life (Protocol_LOKA_Lifecycle.cpp) ---
  int Config(const char* configuration) override;
  int Start() override;
  int Stop() override;

  // --- access (Protocol_LOKA_Read.cpp, Protocol_LOKA_Write.cpp) ---
  int ReadBlock(const ITag* tag, unsigned char* buffer, int lengthBytes) override;
  int Write(const ITag* tag, const unsigned char* value) override;

  // --- console and description (Protocol_LOKA_Console.cpp, Xml_LOKA.cpp) ---
  bool DoCommand(const char* command, char* reply, int sizeBytes) override;
  const char* GetXml() const override;

  // --- receive task (Protocol_LOKA_Task.cpp) ---
  // One receive pass: at most one token, or several back to back when only a prefix frames them.
  void Task();

  // What the tags look up when they are made.
  const _LOKA::ParamManager& Params() const { return params_; }
  const MemoryManager& Memory() const { return memory_; }

 private:
  struct ConsoleHandler;
  enum class SendResult { kSent, kNotHex, kNotActive };

  // receiving
  void ReceivePass();
  // Part of its caller: what it costs is paid for every byte.
  inline SerialLink::ReceiveResult ReceiveByte(unsigned char& byte, int timeoutMs);
  void QueueToken(std::string_view token);
  void addToken(std::string_view token);

  // life
  void LoadSettings();
  bool OpenPort();
  bool OpenPortUnderSemaphore();
  void ClosePortUnderSemaphore();

  // reading
  int ReadItems(const Tag_LOKA& tag, unsigned char* buffer, int lengthBytes);
  bool doReadBlock(const Tag_LOKA& tag, ReadTarget target);
  bool ReadSerialParam(const Tag_LOKA& tag, ReadTarget target);
  bool ReadTokenType(const Tag_LOKA& tag, ReadTarget target);
  bool ReadToken(const Tag_LOKA& tag, ReadTarget target);
  bool ReadFramingText(const Tag_LOKA& tag, ReadTarget target, const char* name, FramingText which,
                       const char* tooLong);

  // The staged value of a setting, or else its active one (`running` where it was never looked up).
  template <typename T>
  T StagedOrActive(const GroupParameterReplacer& staged, const char* name, const T& running) {
    T value{};
    if (!staged.get(name, kNoNode, value)) {
      active_.get(name, kNoNode, running, value);
    }
    return value;
  }

  // writing
  int WriteItems(const Tag_LOKA& tag, const unsigned char* value);
  bool ReadCoveredItems(const Tag_LOKA& tag, const BlockAccess& access, unsigned char* buffer,
                        std::size_t bufferBytes);
  bool doWrite(const Tag_LOKA& tag, const unsigned char* data);
  bool WriteSerialParam(const Tag_LOKA& tag, const unsigned char* data);
  bool WriteTokenType(const Tag_LOKA& tag, const unsigned char* data);
  bool WriteConnect(const unsigned char* data);
  bool StageInteger(const char* name, int value, bool isAllowed);
  bool StageFramingText(const char* name, const char* text, const char* notHex);
  bool SendToken(const std::string& text);
  SendResult TrySend(const std::string& text);
  std::string FrameForSending(const std::string& text, bool hexTokens) const;
  bool ApplyStagedSettings();
  void ApplySerialSettings(const GroupParameterReplacer& staged);
  void ApplyTokenSettings(const GroupParameterReplacer& staged);

  // console
  bool CommandHelp(const ConsoleCommand& command);
  bool CommandConnect(const ConsoleCommand& command);
  bool CommandGetStat(const ConsoleCommand& command);
  bool CommandPut(const ConsoleCommand& command);
  bool CommandGet(const ConsoleCommand& command);
  bool CommandTokensAvailable(const ConsoleCommand& command);
  bool CommandGetTokenLength(const ConsoleCommand& command);
  bool CommandTokenAck(const ConsoleCommand& command);
  bool CommandSetHexToken(const ConsoleCommand& command);
  bool CommandSetRxGap(const ConsoleCommand& command);
  template <FramingText Which>
  bool CommandSetFraming(const ConsoleCommand& command);

  // Constant after Config.
  _LOKA::ParamManager params_;
  MemoryManager memory_;
  std::string portName_;

  // The host's objects, constant after construction; each may be null.
  IMultiTask2* const multiTask_;
  ISemaphore* queueSemaphore_ = nullptr;
  ISemaphore* portSemaphore_ = nullptr;

  // Whole by themselves, on any thread.
  std::atomic<bool> started_{false};
  ParameterReplacer active_;
  GroupParameterReplacer staged_;
  RunningSettings settings_;
  TokenQueue tokens_;
  SerialLink link_;

  // Receive task only.
  RxFramingSnapshot rxFraming_;
  TokenFramer framer_;

  TaskRunner_LOKA taskRunner_;

  // Lets Start and Stop of several host threads run one after the other. Outermost of all locks; no
  // other operation and no task takes it.
  std::mutex lifeMutex_;
};
