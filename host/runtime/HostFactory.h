// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "host/runtime/HostCdsBuffer.h"
#include "host/runtime/HostSocketFactory.h"
#include "interfaces/IInterfaceFactory.h"

class PosixMultiTask;
class PosixSerialFactory;
class SqliteStorage;

// The factory through which the plug-in finds the host's services: IMultiTask2, ISerialFactory,
// ISocketFactory, ICDSBuffer and, where there is a storage, IPermanentStorage. Any other name gives
// null. It only lends: nothing is created or freed here. Loading thread.
class HostFactory final : public IInterfaceFactory {
 public:
  // The services must outlive the factory. The storage may be null.
  HostFactory(PosixMultiTask* multiTask, PosixSerialFactory* serialFactory, SqliteStorage* storage);

  IInterface* CreateInterface(const char* name) override;
  void ReleaseInterface(IInterface* interface) override;

  // Services given out and not taken back yet.
  int LentCount() const { return lentCount_; }

 private:
  PosixMultiTask* const multiTask_;
  PosixSerialFactory* const serialFactory_;
  SqliteStorage* const storage_;
  HostSocketFactory socketFactory_;
  HostCdsBuffer cdsBuffer_;
  int lentCount_ = 0;
};
