// The method frame's trace record: opened after the argument checks, closed
// when the body has returned. When the session's tracer is not recording it
// costs one test and builds nothing.
#pragma once

#include <array>
#include <optional>
#include <span>
#include <type_traits>

#include "core/session_core.h"
#include "services/tracer.h"

namespace qn {

struct MemberInfo;

// The VARIANT type a parameter is traced as. VARIANT_BOOL shares its C++
// type with SHORT, so boolean parameters are marked at the call site
// (in_bool / out_bool) through the VT argument of In / Out.
template <class T>
constexpr VARTYPE DefaultTraceVt() {
    if constexpr (std::is_same_v<T, double>) return VT_R8;
    else if constexpr (std::is_same_v<T, float>) return VT_R4;
    else if constexpr (std::is_same_v<T, SHORT>) return VT_I2;
    else if constexpr (std::is_same_v<T, BSTR>) return VT_BSTR;
    else if constexpr (std::is_same_v<T, SAFEARRAY*>) return VT_ARRAY;
    else if constexpr (std::is_same_v<T, VARIANT>) return VT_VARIANT;
    else if constexpr (std::is_pointer_v<T>) return VT_UNKNOWN;
    else if constexpr (std::is_same_v<T, BYTE>) return VT_UI1;
    else return VT_I4;  // LONG and enumerations
}

class FrameTrace {
public:
    template <class... Args>
    FrameTrace(SessionCore& core, const char* interface_name, const char* entry,
               const std::array<std::string_view, 8>& names, Args&... args) noexcept {
        CTraceOwner* tracer = &core.tracer;
        if (!tracer->IsRecording()) return;
        std::size_t n = 0;
        (Add(names, n, args), ...);
        trace_.emplace(tracer, interface_name, entry, std::span<const TraceParam>(params_.data(), n));
    }
    // Closes the record: out-values are read now.
    void End() noexcept { trace_.reset(); }

private:
    template <class A>
    void Add(const std::array<std::string_view, 8>& names, std::size_t& n, A& a) noexcept {
        if (n >= params_.size()) return;
        const char* name = names[n].empty() ? "" : names[n].data();
        if constexpr (A::kIsOut)
            params_[n] = TraceParam{name, TraceDirection::Out, A::kVt, a.ptr};
        else
            params_[n] = TraceParam{name, TraceDirection::In, A::kVt, &a.value};
        ++n;
    }

    std::array<TraceParam, 8> params_{};
    std::optional<CMethodTrace> trace_;
};

}  // namespace qn
