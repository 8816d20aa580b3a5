// The method frame: every member of every interface of the driver runs its
// body inside RunFrame, which does the same steps in the same order:
//
//   1 lock the session           2 push the call context
//   3 set the error-context IID  4 check the session is initialized (not variant A)
//   5 clear the thread's error information
//   6 check out-pointers, preset the out-values
//   7 open the trace record      8 fetch the model string
//   8b check the in-values: enumerations within their sets, texts free of
//      line feeds and NULs (see CheckIn)
//   9 simulate (members with a simulation key, while Simulate is on)
//  10 push the formatted command, run the body, pop the command
//  11 close the trace record     12 restore the IID, pop the context, unlock
//
// A member is described by a MemberInfo row (data); its parameters are passed
// as In/Out wrappers so the frame knows their direction. No exception leaves
// RunFrame.
#pragma once

#include <array>
#include <mutex>
#include <string_view>
#include <type_traits>

#include "core/enum_values.h"
#include "core/frame_trace.h"
#include "core/node.h"
#include "io/command_format.h"
#include "platform/com/com.h"
#include "services/simulation.h"

namespace qn {

enum class FrameVariant : std::uint8_t {
    A,  // no session needed
    B,  // method without out-parameters
    C,  // method with out-parameters
    D,  // property get without simulation key
    E,  // property put without simulation key
    F,  // property get with simulation key
    G,  // property put with simulation key
};

inline constexpr std::size_t kMaxFrameParams = 8;

struct MemberInfo {
    std::string_view entry;           // IDL entry name: "get_Range", "Initialize"
    std::string_view interface_name;  // "IQuorlen731XXChannel"
    const GUID* iid;                  // IID of that interface
    FrameVariant variant;
    std::string_view sim_key;  // "Interface.Property" for variants F and G
    SimValue sim;              // simulated value before the first write
    std::string_view command;  // command format ("" = none); filled with the
                               // object's command number, then the in-values
    std::array<std::string_view, kMaxFrameParams> params;  // IDL parameter names
};

// Parameter wrappers: the frame learns each parameter's direction and how it
// is traced from them.
template <class T, VARTYPE VT = DefaultTraceVt<T>()>
struct In {
    using type = T;
    static constexpr bool kIsOut = false;
    static constexpr VARTYPE kVt = VT;
    T value;
};
template <class T, VARTYPE VT = DefaultTraceVt<T>()>
struct Out {
    using type = T;
    static constexpr bool kIsOut = true;
    static constexpr VARTYPE kVt = VT;
    T* ptr;
};
template <class T>
In<T> in(T v) {
    return In<T>{v};
}
template <class T>
Out<T> out(T* p) {
    return Out<T>{p};
}
inline In<VARIANT_BOOL, VT_BOOL> in_bool(VARIANT_BOOL v) { return {v}; }
inline Out<VARIANT_BOOL, VT_BOOL> out_bool(VARIANT_BOOL* p) { return {p}; }

namespace frame_detail {

template <class A>
struct IsOut : std::bool_constant<A::kIsOut> {};
template <class A>
struct IsIn : std::bool_constant<!A::kIsOut> {};

template <class T>
inline constexpr bool kSimulatable =
    std::is_arithmetic_v<T> || std::is_enum_v<T> || std::is_same_v<T, BSTR>;

// Type under which a value is simulated and cached.
template <class T>
using SimType = std::conditional_t<
    std::is_same_v<T, BSTR> || std::is_same_v<T, double>, T,
    std::conditional_t<std::is_same_v<T, SHORT>, SHORT, LONG>>;

template <class T>
T SimDefault(const SimValue& v) {
    if constexpr (std::is_same_v<T, BSTR>) {
        BSTR s = com::Utf8ToBstr(v.text ? v.text : "");
        if (!s) throw std::bad_alloc();
        return s;
    } else if constexpr (std::is_same_v<T, double>) {
        return v.kind == SimValue::Kind::Double ? v.real : static_cast<double>(v.integer);
    } else {
        return v.kind == SimValue::Kind::Double ? static_cast<T>(v.real)
                                                : static_cast<T>(v.integer);
    }
}

template <class T>
void Preset(T* p) {
    *p = T{};
}
// An output array is left as the caller passed it: the waveform members
// reuse an array of the right type and size instead of replacing it.
inline void Preset(SAFEARRAY** /*p*/) {}

HRESULT CheckOut(CDriverNode& node, const MemberInfo& m, std::size_t index, const void* p);
// The text with line feeds and NULs shown as \n and \0, for error messages.
std::string VisibleText(std::string_view text);
HRESULT InternalError(CDriverNode& node, const char* what);
HRESULT OutOfMemory(CDriverNode& node);

// Checks one in-value before anything is stored or sent, with or without
// simulation: an enumeration value must be in its set, and a text that a
// property stores or a command carries must hold no line feed or NUL (it
// would end the message and start another command). Texts of other members
// are names looked up by their bodies.
template <class T>
HRESULT CheckIn(CDriverNode& node, const MemberInfo& m, std::size_t index, const T& v) {
    if constexpr (std::is_enum_v<T>) {
        if (!InEnumSet(v))
            return node.Errors().InvalidValue(m.entry, m.params[index],
                                              std::int32_t{static_cast<LONG>(v)});
    } else if constexpr (std::is_same_v<T, BSTR>) {
        const bool sent_or_stored = !m.command.empty() || m.variant == FrameVariant::E ||
                                    m.variant == FrameVariant::G;
        if (sent_or_stored) {
            const std::string text = com::BstrToUtf8(v);
            if (text.find('\n') != std::string::npos || text.find('\0') != std::string::npos)
                return node.Errors().InvalidValue(m.entry, m.params[index], VisibleText(text));
        }
    }
    return S_OK;
}

// Adds one (already checked) in-value to the command arguments.
template <VARTYPE Vt, class T>
HRESULT AddCommandArg(CDriverNode& /*node*/, const MemberInfo& /*m*/, std::size_t /*index*/,
                      const T& v, CommandArgList& list) {
    if constexpr (Vt == VT_BOOL) {
        list.Add(CommandArg(std::string_view(v != VARIANT_FALSE ? "1" : "0")));
    } else if constexpr (std::is_same_v<T, BSTR>) {
        list.AddText(com::BstrToUtf8(v));
    } else if constexpr (std::is_floating_point_v<T>) {
        list.Add(CommandArg(static_cast<double>(v)));
    } else if constexpr (std::is_integral_v<T> || std::is_enum_v<T>) {
        list.Add(CommandArg(static_cast<std::int64_t>(v)));
    }
    return S_OK;
}

}  // namespace frame_detail

// The frame's steps; RunFrame below is the entry every member uses.
template <class Body, class... Args>
HRESULT RunFrameSteps(CDriverNode& node, const MemberInfo& m, Body&& body, Args&... args) {
    using namespace frame_detail;
    SessionCore& core = node.Core();
    std::lock_guard<com::CriticalSection> lock(core.lock);                        // 1
    CallContextScope context(node.CallContexts(),
                             {node.ComponentName(), m.interface_name, m.entry});  // 2
    struct IidScope {
        CErrorManagerBase& e;
        GUID old;
        ~IidScope() { e.SetErrorIid(old); }
    } iid{node.Errors(), node.Errors().SetErrorIid(*m.iid)};                      // 3
    try {
        if (m.variant != FrameVariant::A && !core.Initialized())                  // 4
            return node.Errors().Error(Msg::E_IVI_NOT_INITIALIZED);
        SetErrorInfo(0, nullptr);                                                 // 5
        HRESULT hr = S_OK;
        std::size_t index = 0;                                                    // 6
        auto check = [&](auto& a) {
            if constexpr (IsOut<std::decay_t<decltype(a)>>::value) {
                if (SUCCEEDED(hr)) hr = CheckOut(node, m, index, a.ptr);
                if (SUCCEEDED(hr)) Preset(a.ptr);
            }
            ++index;
        };
        (check(args), ...);
        (void)check;
        if (FAILED(hr)) return hr;

        FrameTrace trace(core, m.interface_name.data(), m.entry.data(), m.params,  // 7
                         args...);
        const std::string& model = core.Model();                                  // 8
        index = 0;                                                                // 8b
        auto check_in = [&](auto& a) {
            if constexpr (IsIn<std::decay_t<decltype(a)>>::value)
                if (SUCCEEDED(hr)) hr = CheckIn(node, m, index, a.value);
            ++index;
        };
        (check_in(args), ...);
        (void)check_in;
        if (FAILED(hr)) return hr;

        if (core.Simulating() &&                                                  // 9
            (m.variant == FrameVariant::F || m.variant == FrameVariant::G)) {
            auto simulate = [&](auto& a) {
                using A = std::decay_t<decltype(a)>;
                if constexpr (IsOut<A>::value && kSimulatable<typename A::type>) {
                    using T = typename A::type;
                    using S = SimType<T>;
                    auto* entry = node.Cache().template GetCacheEntry<S>(m.sim_key);
                    S v{};
                    if (!entry || !entry->Get(&v)) v = SimDefault<S>(m.sim);
                    *a.ptr = static_cast<T>(v);
                } else if constexpr (IsIn<A>::value && kSimulatable<typename A::type>) {
                    using T = typename A::type;
                    using S = SimType<T>;
                    if (auto* entry = node.Cache().template GetCacheEntry<S>(m.sim_key))
                        entry->Set(static_cast<S>(a.value));
                }
            };
            (simulate(args), ...);
            (void)simulate;
            (void)model;
            trace.End();
            return S_OK;
        }

        CommandArgList cmd_args;                                                  // 10
        if (!m.command.empty()) {
            if (node.CommandNumber() >= 0)
                cmd_args.Add(CommandArg(static_cast<std::int64_t>(node.CommandNumber())));
            index = 0;
            auto add = [&](auto& a) {
                using A = std::decay_t<decltype(a)>;
                if constexpr (IsIn<A>::value)
                    if (SUCCEEDED(hr))
                        hr = AddCommandArg<A::kVt>(node, m, index, a.value, cmd_args);
                ++index;
            };
            (add(args), ...);
            (void)add;
            if (FAILED(hr)) return hr;
        }
        struct CommandScope {
            CInstrumentCommandManager& c;
            ~CommandScope() { c.PopCommand(); }
        } command{node.Commands()};
        node.Commands().PushCommand(m.command.empty() ? std::string()
                                                      : cmd_args.Format(m.command));
        hr = body();
        trace.End();                                                              // 11
        return hr;
    } catch (const std::bad_alloc&) {
        return OutOfMemory(node);
    } catch (const std::exception& e) {
        return InternalError(node, e.what());
    } catch (...) {
        return InternalError(node, "unknown exception");
    }
}                                                                                 // 12

// Runs `body` (a callable returning HRESULT) inside the frame of member `m`
// on object `node`. `args` are the member's parameters wrapped in In / Out, in
// the order of m.params. Nothing thrown anywhere in the frame leaves it.
template <class Body, class... Args>
HRESULT RunFrame(CDriverNode& node, const MemberInfo& m, Body&& body, Args... args) noexcept {
    try {
        return RunFrameSteps(node, m, std::forward<Body>(body), args...);
    } catch (const std::bad_alloc&) {
        return frame_detail::OutOfMemory(node);
    } catch (...) {
        return frame_detail::InternalError(node, "the method frame could not be entered");
    }
}

}  // namespace qn
