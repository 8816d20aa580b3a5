// Clean-up helpers of the operations that change the session's I/O timeout
// for their duration (waveform transfers and measurements).
#pragma once

#include "core/node.h"
#include "io/io_manager.h"
#include "platform/com/errorinfo.h"

namespace qn {

// Keeps the thread's error information across a clean-up step: the restores
// run I/O operations, which clear it, after the failure that the caller is
// to see was reported.
class KeepErrorInfo {
public:
    KeepErrorInfo() { GetErrorInfo(0, info_.Out()); }
    ~KeepErrorInfo() {
        if (info_) SetErrorInfo(0, info_.get());
    }
    KeepErrorInfo(const KeepErrorInfo&) = delete;
    KeepErrorInfo& operator=(const KeepErrorInfo&) = delete;

private:
    ComPtr<IErrorInfo> info_;
};

// The session timeout for the duration of an operation, put back on every
// path when the scope ends.
class TimeoutScope {
public:
    explicit TimeoutScope(CDriverNode& node) : node_(node) {}
    TimeoutScope(const TimeoutScope&) = delete;
    TimeoutScope& operator=(const TimeoutScope&) = delete;
    HRESULT Set(LONG timeout) {
        CDriverIOManager io(node_);
        HRESULT hr = io.GetIOTimeout(&saved_);
        if (FAILED(hr)) return hr;
        active_ = true;
        return io.SetIOTimeout(timeout);
    }
    ~TimeoutScope() {
        if (!active_) return;
        KeepErrorInfo keep;
        CDriverIOManager(node_).SetIOTimeout(saved_);
    }

private:
    CDriverNode& node_;
    LONG saved_ = 0;
    bool active_ = false;
};

}  // namespace qn
