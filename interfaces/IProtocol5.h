// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/IProtocol4.h"

// Fifth version: objects, communication parameters, events, alarms, trends. This driver implements
// the communication parameters; the others fail with error -1 and a text where they ask for an
// object, and answer zero elsewhere. Host threads.
class IProtocol5 : public IProtocol4 {
 public:
  // slots 52, 53
  virtual bool readObject(const ITag* tag, IObjectString* object) = 0;
  virtual bool writeObject(const ITag* tag, const IObjectString* object) = 0;

  // slot 54
  virtual int vcsGetCapability() const = 0;

  // slot 55. Writes port, baud rate, parity, data bits, stop bits and mode in effect, joined by
  // ",", at most sizeBytes characters, not terminated when the text fills the buffer. Returns 1, or
  // 0 without a buffer.
  virtual int vcsGetComParams(char* buffer, int sizeBytes) const = 0;

  // slot 56
  virtual int vcsActivateInterleaved(unsigned short value) = 0;

  // slots 57 to 63
  virtual IEventChannel* createEventChannel(int channel) = 0;
  virtual IEventChannel* createEventChannel(IEventProcessor* processor) = 0;
  virtual void deleteEventChannel(IEventChannel* channel) = 0;
  virtual int addEventSource(IEventChannel* channel, const char* source) = 0;
  virtual int addAlarmEvents(IEventChannel* channel, IAlarm* alarm) = 0;
  virtual IEvent* frontEvent(IEventChannel* channel) = 0;
  virtual void popEvent(IEventChannel* channel) = 0;

  // slots 64 to 67
  virtual IAlarm* createAlarm(const char* name) = 0;
  virtual void deleteAlarm(IAlarm* alarm) = 0;
  virtual int listAlarms(IAlarmProcessor* processor) = 0;
  virtual int quitAlarm(IAlarm* alarm) = 0;

  // slots 68 to 70
  virtual ITrend* createTrend(const char* name) = 0;
  virtual void deleteTrend(ITrend* trend) = 0;
  virtual int readTrend(ITrend* trend, unsigned long long from, unsigned long long to,
                        unsigned long long& last, unsigned int count, bool backward,
                        ITrendProcessor* processor) = 0;
};
