// Event server without sink and source: the driver raises no events, so every
// operation accepts its arguments and succeeds without effect.
#pragma once

#include "platform/com/types.h"

struct IUnknown;

namespace qn {

class CEventServerNoSink {
  public:
    HRESULT Advise(IUnknown* /*sink*/, DWORD* cookie) {
        if (cookie) *cookie = 0;
        return S_OK;
    }
    HRESULT Unadvise(DWORD /*cookie*/) { return S_OK; }
};

class CEventServerNoSource {
  public:
    HRESULT Fire(LONG /*eventId*/) { return S_OK; }
};

template <class Sink = CEventServerNoSink, class Source = CEventServerNoSource>
class CEventServerManager : public Sink, public Source {
  public:
    HRESULT Start() { return S_OK; }
    HRESULT Stop() { return S_OK; }
};

// Performance monitor: a named service with nothing to measure in this driver.
class CPerfMonManager {};

}  // namespace qn
