// Binding a driver object to the IVI-C session handle of the C API, so that
// the object's NativeCHandle and AttachToExistingCSession see the session.
#pragma once

#include "platform/com/unknown.h"

namespace qn {

// Links the driver object behind `driver` (any of its interfaces, or the
// controlling unknown of an aggregate) to handle `vi`. An object that is not
// this driver's root is left alone.
void LinkCSession(IUnknown* driver, LONG vi);
// Removes the link when it is still to `vi` (an object attached to a second
// session keeps that one when the first is closed).
void UnlinkCSession(IUnknown* driver, LONG vi);

}  // namespace qn
