// The entry points of the driver module as an in-process server. They are
// exported with C linkage; activation (CoCreateInstance) finds them by name.
#pragma once

#include "platform/com/types.h"

#define QN_MODULE_EXPORT extern "C" __attribute__((visibility("default")))

// The class factory of CLSID_Quorlen731XX (IClassFactory or IUnknown);
// CLASS_E_CLASSNOTAVAILABLE for any other class.
QN_MODULE_EXPORT HRESULT DllGetClassObject(REFCLSID clsid, REFIID riid, void** ppv);
// S_OK when no object of the process's COM layer is alive and no server lock
// is held, else S_FALSE.
QN_MODULE_EXPORT HRESULT DllCanUnloadNow();
// Writes the class, its ProgIDs, the AppID, the categories and the type
// information into the registry store (RegistryFilePath()); idempotent.
QN_MODULE_EXPORT HRESULT DllRegisterServer();
// Removes everything DllRegisterServer writes; S_OK when nothing was there.
QN_MODULE_EXPORT HRESULT DllUnregisterServer();
