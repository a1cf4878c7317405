// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "interfaces/IProtocol7.h"
#include "protlib/ErrorState.h"
#include "protlib/NoThrow.h"
#include "protlib/TagList.h"

class ConsoleCommand;
class TagBase;

// The generic half of a protocol driver: a neutral answer to every operation that a driver need not
// care about, the error state, the instance identifier, the live tags, and the ways in which the
// host's many read and write operations come down to the few that a driver implements. The driver
// supplies ReadBlock, Write, CreateTagBase and its identity.
//
// Neutral answers are false, 0 or null. Where an operation leaves a reason, the source says which.
class ProtocolBase : public IProtocol7 {
 public:
  ProtocolBase() = default;
  ProtocolBase(const ProtocolBase&) = delete;
  ProtocolBase& operator=(const ProtocolBase&) = delete;

  // Destroys the tags that are still alive.
  ~ProtocolBase() override = default;

  void* ConvertTo(const char* name) override;

  // --- tags and their URIs (ProtocolBase_Tags.cpp) ---
  ITag* CreateTag(const char* uri) override;
  void FreeTag(ITag* tag) override;
  void DeleteTags();
  bool CanAddToDatagram(const ITag* const* tags, int count, const ITag* candidate) override;
  bool IsBefore(const ITag* a, const ITag* b) const override;
  bool IsAdjacent(const ITag* a, const ITag* b) const override;
  int getTagUriFieldCount() const override;
  const char* getTagUriFieldName(int index) const override;
  int getTagUriFieldPosition(const char* name) const override;
  const char* getTagUriField(const ITag* tag, int index, int* length) const override;

  // --- reads and writes (ProtocolBase_Access.cpp) ---
  int Read(const ITag* tag, unsigned char* value) override;
  int WriteBlock(const ITag* tag, const unsigned char* buffer, int lengthBytes) override;
  int ReadDatagramWithStatus(const ITag* const* tags, int count, unsigned char* buffer,
                             idal_error_t* status) override;
  int readWithTimestamp(const ITag* tag, unsigned char* value,
                        unsigned long long* timestampMs) override;
  int readBlockWithTimestamp(const ITag* tag, unsigned char* buffer, int lengthBytes,
                             unsigned long long* timestampMs) override;
  int readBitBlockWithTimestamp(const ITag* tag, unsigned char* buffer, int bitCount,
                                unsigned long long* timestampMs) override;
  int readDatagramWithTimestamp(const ITag* const* tags, int count, unsigned char* buffer,
                                idal_error_t* status, unsigned long long* timestampsMs) override;
  int readArrayItem(const ITag* tag, int index, unsigned char* item) override;
  int writeArrayItem(const ITag* tag, int index, const unsigned char* item) override;

  // --- console and information (ProtocolBase_Console.cpp) ---
  int GetInfo(char* buffer, int sizeBytes) const override;
  bool DoCommand(const char* command, char* reply, int sizeBytes) override;

  // --- error state and identity ---
  int GetLastError() const override;
  const char* GetLastErrorString() const override;
  const char* GetIdent() const override;
  void SetIdent(const char* ident) override;
  const char* GetNextInstanceName() const override;

  // --- neutral answers ---
  int Start() override;
  int Stop() override;
  int MaxDatagramItems(const ITag* tag) const override;
  int MaxDatagramLength(const ITag* tag) const override;
  bool CanCoexistInDatagram(const ITag* first, const ITag* second) const override;
  int ReadDatagram(const ITag* const* tags, int count, unsigned char* buffer) override;
  const char* GetXml() const override;
  bool IsConverted() const override;
  int Extend(int code, void* data) override;
  bool MultipleReadSupported() const override;
  int MultipleRead(IMultiRead* request) override;
  bool MultipleWriteSupported() const override;
  int MultipleWrite(IMultiWrite* request) override;
  bool CanReadBitBlock(const ITag* tag) const override;
  int ReadBitBlock(const ITag* tag, unsigned char* buffer, int bitCount) override;
  void* GetInterface(const char* name) override;
  int MaxUnusedGap(const ITag* tag) const override;
  bool NeedsReadBeforeWrite(const ITag* tag) const override;
  bool CanWriteDatagrams(const ITag* tag) const override;
  bool CanAddToWriteDatagram(const ITag* const* tags, int count,
                             const ITag* candidate) const override;
  int WriteDatagramWithStatus(const ITag* const* tags, int count, const unsigned char* buffer,
                              idal_error_t* status) override;
  bool CanWriteBitBlock(const ITag* tag) const override;
  int WriteBitBlock(const ITag* tag, const unsigned char* buffer, int bitCount) override;
  bool readObject(const ITag* tag, IObjectString* object) override;
  bool writeObject(const ITag* tag, const IObjectString* object) override;
  int vcsGetCapability() const override;
  int vcsGetComParams(char* buffer, int sizeBytes) const override;
  int vcsActivateInterleaved(unsigned short value) override;
  IEventChannel* createEventChannel(int channel) override;
  IEventChannel* createEventChannel(IEventProcessor* processor) override;
  void deleteEventChannel(IEventChannel* channel) override;
  int addEventSource(IEventChannel* channel, const char* source) override;
  int addAlarmEvents(IEventChannel* channel, IAlarm* alarm) override;
  IEvent* frontEvent(IEventChannel* channel) override;
  void popEvent(IEventChannel* channel) override;
  IAlarm* createAlarm(const char* name) override;
  void deleteAlarm(IAlarm* alarm) override;
  int listAlarms(IAlarmProcessor* processor) override;
  int quitAlarm(IAlarm* alarm) override;
  ITrend* createTrend(const char* name) override;
  void deleteTrend(ITrend* trend) override;
  int readTrend(ITrend* trend, unsigned long long from, unsigned long long to,
                unsigned long long& last, unsigned int count, bool backward,
                ITrendProcessor* processor) override;
  bool hasPlcTimestamp(const ITag* tag) override;

  // --- what only a driver has; these three continue the interface's slots ---

  // slot 82. Builds the driver's own tag from a URI, owned by the caller; null, with the reason in
  // the error state, when the URI is not valid. May throw std::bad_alloc. Called by CreateTag.
  virtual TagBase* CreateTagBase(const char* uri) = 0;

  // slot 83. Longest expected duration of one access in ms. `tag` may be null. Any thread.
  virtual int GetMaxTm(const ITag* tag) const = 0;

  // slot 84. The names of the URI fields, ended by a null entry. Any thread.
  virtual const char* const* tagUriNames() const;

 protected:
  // Records an error. Never throws. Any thread.
  void SetError(int code, const char* text) const;

  // Records why a tag is not valid: "Tag URI error: " + name + " - " + the tag's own text.
  void SetTagError(const TagBase* tag) const;

  // Records that the host passed something that no operation can work with (a missing tag or
  // buffer, a negative length), or that memory ran out.
  void SetArgumentError() const;
  void SetMemoryError() const;

  // Runs the body of an interface operation. When memory runs out on the way, records that as an
  // error and returns `onFailure`.
  template <typename Result, typename Body>
  Result Guarded(Result onFailure, Body&& body) const {
    bool finished = false;
    const Result result = NoThrow(onFailure, [&] {
      const Result value = body();
      finished = true;
      return value;
    });
    if (!finished) {
      SetMemoryError();
    }
    return result;
  }

 private:
  class CommandTag;

  bool RunCommand(const ConsoleCommand& command);
  void CommandInfo(const ConsoleCommand& command) const;
  void CommandRead(const ConsoleCommand& command);
  void CommandWrite(const ConsoleCommand& command);
  bool FindArrayItem(const ITag* tag, int index) const;
  template <typename Use>
  int WithArrayItem(const ITag* tag, int index, Use use);

  TagList tags_;
  mutable ErrorState error_;
  std::string ident_;
};
