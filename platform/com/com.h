// The COM / OLE Automation substitute in one include.
#pragma once

#include "platform/com/bstr.h"
#include "platform/com/errorinfo.h"
#include "platform/com/lock.h"
#include "platform/com/safearray.h"
#include "platform/com/types.h"
#include "platform/com/unknown.h"
#include "platform/com/variant.h"
