// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/HostValueTypes.h"
#include "interfaces/IInterface.h"

class ITag;

// A protocol instance, first version of the interface. Versions 2 to 7 extend it one after the
// other and share its address; ask for them with ConvertTo.
//
// Errors: where an operation reports failure, GetLastError and GetLastErrorString give the reason
// unless the comment says otherwise. Life: Config, then CreateTag, then Start; reads and writes
// between Start and Stop.
class IProtocol : public IInterface {
 public:
  // slots 0, 1: destructor; slot 2: ConvertTo

  // slots 3, 4. Name and version of the implementation. Any thread.
  virtual const char* GetImpName() const = 0;
  virtual int GetImpVersion() const = 0;

  // slot 5. Takes the configuration text. Non-zero when it is accepted. Host thread, before Start.
  virtual int Config(const char* configuration) = 0;

  // slot 6. Makes a tag from its URI; null when the URI is not valid. The protocol owns the tag
  // until FreeTag or its own end. Host threads.
  virtual ITag* CreateTag(const char* uri) = 0;

  // slot 7. Destroys a tag. Null is ignored. Host threads, while nobody uses the tag.
  virtual void FreeTag(ITag* tag) = 0;

  // slot 8. Whether `second` can be read in one block with `first`. Never for writing. Any thread.
  virtual bool CanBeOptimized(const ITag* first, const ITag* second, bool forWrite) const = 0;

  // slot 9. Opens the port (when the configuration says so) and starts the receive task. Non-zero
  // on success, also when already started. Host thread.
  virtual int Start() = 0;

  // slot 10. Stops the receive task (waits up to 1000 ms) and closes the port. Always non-zero.
  // Host thread.
  virtual int Stop() = 0;

  // slot 11. Reads a tag's host value (GetVarLength bytes) into `value`. Non-zero on success. Host
  // threads.
  virtual int Read(const ITag* tag, unsigned char* value) = 0;

  // slot 12. Writes a tag's host value (GetVarLength bytes). Non-zero on success. Host threads.
  virtual int Write(const ITag* tag, const unsigned char* value) = 0;

  // slot 13. Reads lengthBytes bytes of the tag's device image. Non-zero on success. Host threads.
  virtual int ReadBlock(const ITag* tag, unsigned char* buffer, int lengthBytes) = 0;

  // slot 14. Writes a device image. Not supported here: 0, error -3. Host threads.
  virtual int WriteBlock(const ITag* tag, const unsigned char* buffer, int lengthBytes) = 0;

  // slots 15 to 18. Datagram reads, for drivers that group tags. Any thread.
  virtual int MaxDatagramItems(const ITag* tag) const = 0;
  virtual int MaxDatagramLength(const ITag* tag) const = 0;
  virtual bool CanCoexistInDatagram(const ITag* first, const ITag* second) const = 0;
  virtual int ReadDatagram(const ITag* const* tags, int count, unsigned char* buffer) = 0;

  // slots 19, 20. Short name of the driver. Any thread.
  virtual const char* GetName() const = 0;
  virtual const char* GetNextInstanceName() const = 0;

  // slots 21, 22. Code and text of the most recent error: 1 and empty before the first one; never
  // cleared, only overwritten. The text stays readable at least until the next error. Any thread.
  virtual int GetLastError() const = 0;
  virtual const char* GetLastErrorString() const = 0;

  // slots 23 to 25. Version, type number and display name of the driver. Any thread.
  virtual int GetProtocolVersion() const = 0;
  virtual int GetProtocolType() const = 0;
  virtual const char* GetProtocolName() const = 0;

  // slot 26. Writes at most sizeBytes characters of identification text, without a terminating
  // zero. Returns the number written. Any thread.
  virtual int GetInfo(char* buffer, int sizeBytes) const = 0;

  // slot 27. The compressed description document, starting with its length line; may be null. Any
  // thread.
  virtual const char* GetXml() const = 0;

  // slot 28. Any thread.
  virtual bool IsConverted() const = 0;

  // slot 29. The instance identifier, or the driver's name while none is set. Valid until SetIdent.
  virtual const char* GetIdent() const = 0;

  // slot 30. Sets the instance identifier, the key space in permanent storage. Host thread, before
  // Start.
  virtual void SetIdent(const char* ident) = 0;

  // slot 31. Runs one text command. The reply is copied with at most sizeBytes characters and is
  // not terminated when it is that long or longer. Console thread.
  virtual bool DoCommand(const char* command, char* reply, int sizeBytes) = 0;

  // slot 32. Extension by number; 0 for a number that is not known. Any thread.
  virtual int Extend(int code, void* data) = 0;
};
