// SPDX-License-Identifier: MIT
#pragma once
// JexRT.hpp - the C++ class interface of libJexJtag, for hosts that link
// against it as a class library.  Everything here is in namespace JexRT
// (Jex_Exception aside).  The C API (jexjtag.h) is the primary interface;
// this header adds the session listener, the device-database classes and
// the scoped target lock.

#include "jexjtag.h"
#include "rt/Jex_Exception.hpp"
#include "rt/JexJtagTargetLock.hpp"
#include "rt/SessionMessageListener.hpp"
#include "rt/Sessions.hpp"
#include "rt/IDCode.hpp"
#include "rt/Jex_OneDeviceData.hpp"
#include "rt/Jex_DeviceData.hpp"
#include "rt/DeviceRecord.hpp"
#include "rt/DeviceDB.hpp"
#include "rt/Devices.hpp"
