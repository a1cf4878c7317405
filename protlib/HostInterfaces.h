// SPDX-License-Identifier: Apache-2.0
#pragma once

class ICDSBuffer;
class IDiag;
class IDriverInterface;
class IFastTimer;
class IMultiTask2;
class IPermanentStorage;
class ISerialFactory;
class ISmux;
class ISocketFactory;

// The host's services, one pointer each for the whole process. The module fills them at its first
// Init and clears them at its last Close, both on the loading thread; protocols exist only in
// between, so they read the pointers without a lock. Null while absent.
extern IMultiTask2* piMultiTask;
extern ISerialFactory* piSerialFactory;
extern ISocketFactory* piSocketFactory;
extern ICDSBuffer* piCDSBuffer;

// Services that a host may lack.
extern IDiag* piDiag;
extern IPermanentStorage* piPermanentStorage;
extern IDriverInterface* piDriverInterface;
extern ISmux* piSmux;
extern IFastTimer* piFastTimer;
