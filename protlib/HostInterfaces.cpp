// SPDX-License-Identifier: Apache-2.0
#include "protlib/HostInterfaces.h"

IMultiTask2* piMultiTask = nullptr;
ISerialFactory* piSerialFactory = nullptr;
ISocketFactory* piSocketFactory = nullptr;
ICDSBuffer* piCDSBuffer = nullptr;

IDiag* piDiag = nullptr;
IPermanentStorage* piPermanentStorage = nullptr;
IDriverInterface* piDriverInterface = nullptr;
ISmux* piSmux = nullptr;
IFastTimer* piFastTimer = nullptr;
