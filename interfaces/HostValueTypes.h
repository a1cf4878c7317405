// SPDX-License-Identifier: Apache-2.0
#pragma once

// Status of one tag of a datagram read; 1 marks a tag that was read.
using idal_error_t = int;

// Host objects that pass through operations which this driver answers without touching them.
class IAlarm;
class IAlarmProcessor;
class IEvent;
class IEventChannel;
class IEventProcessor;
class IMultiRead;
class IMultiWrite;
class IObjectString;
class ITrend;
class ITrendProcessor;
