// The interface and class id of the small module that the activation tests
// load with dlopen (test_module.cpp).
#pragma once

#include "platform/com/unknown.h"

struct ITestValue : IUnknown {
    QN_INTERFACE_ID("5e1f0c2a-7b3d-4e59-9a61-0d2c4b8e7f10");
    virtual int Value() = 0;
};

constexpr CLSID kTestModuleClsid = MakeGuid("5e1f0c2a-7b3d-4e59-9a61-0d2c4b8e7f11");
