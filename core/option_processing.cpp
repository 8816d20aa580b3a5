#include "core/option_processing.h"

#include <array>

#include "core/options.h"

namespace qn {

namespace {

struct FlagOption {
    std::string_view name;  // lower case
    bool SessionFlags::*flag;
};

constexpr std::array kFlagOptions = {
    FlagOption{"cache", &SessionFlags::cache},
    FlagOption{"interchangecheck", &SessionFlags::interchange_check},
    FlagOption{"queryinstrstatus", &SessionFlags::query_instrument_status},
    FlagOption{"rangecheck", &SessionFlags::range_check},
    FlagOption{"recordcoercions", &SessionFlags::record_coercions},
    FlagOption{"simulate", &SessionFlags::simulate},
};

using SetupHandler = HRESULT (*)(DriverSession&, const CErrorManagerBase&, std::string_view);

HRESULT BadValue(const CErrorManagerBase& err, std::string_view value) {
    return err.Error(Msg::E_IVI_BAD_OPTION_VALUE, {value});
}

HRESULT SetBool(bool& dst, const CErrorManagerBase& err, std::string_view value) {
    auto b = ParseBooleanWord(value);
    if (!b) return BadValue(err, value);
    dst = *b;
    return S_OK;
}

struct SetupOption {
    std::string_view name;  // lower case
    SetupHandler apply;
};

constexpr std::array kSetupOptions = {
    SetupOption{"model", [](DriverSession& s, const CErrorManagerBase&, std::string_view v) {
                    s.model = std::string(v);
                    return S_OK;
                }},
    SetupOption{"trace", [](DriverSession& s, const CErrorManagerBase& e, std::string_view v) {
                    HRESULT hr = SetBool(s.trace.enabled, e, v);
                    if (SUCCEEDED(hr)) s.trace.enabled_given = true;
                    return hr;
                }},
    SetupOption{"tracename", [](DriverSession& s, const CErrorManagerBase&, std::string_view v) {
                    s.trace.name = std::string(v);
                    return S_OK;
                }},
    SetupOption{"tracesizemax", [](DriverSession& s, const CErrorManagerBase&, std::string_view v) {
                    s.trace.size_max = ParseDecimalPrefix(v);
                    return S_OK;
                }},
    SetupOption{"tracearray", [](DriverSession& s, const CErrorManagerBase& e, std::string_view v) {
                    return SetBool(s.trace.arrays, e, v);
                }},
    SetupOption{"tracearraysizemax",
                [](DriverSession& s, const CErrorManagerBase&, std::string_view v) {
                    s.trace.array_size_max = ParseDecimalPrefix(v);
                    return S_OK;
                }},
    SetupOption{"tracesaveinterval",
                [](DriverSession& s, const CErrorManagerBase&, std::string_view v) {
                    s.trace.save_interval = ParseDecimalPrefix(v);
                    return S_OK;
                }},
    SetupOption{"tracetransform",
                [](DriverSession& s, const CErrorManagerBase&, std::string_view v) {
                    s.trace.transform = std::string(v);
                    return S_OK;
                }},
};

HRESULT ProcessDriverSetupOption(DriverSession& s, const CErrorManagerBase& err,
                                 std::string_view name, std::string_view value) {
    std::string key = ToLower(name);
    s.driver_setup_options[key] = std::string(value);
    for (const SetupOption& o : kSetupOptions)
        if (o.name == key) return o.apply(s, err, value);
    return S_OK;  // unknown names are only recorded
}

}  // namespace

HRESULT ProcessInitOption(DriverSession& s, const CErrorManagerBase& err, std::string_view name,
                          std::string_view value) {
    if (name.empty()) return err.InvalidValue("ProcessInitOption", "strNameIn", std::int32_t{0});
    if (value.empty()) return err.InvalidValue("ProcessInitOption", "strValueIn", std::int32_t{0});
    std::string key = ToLower(name);
    s.init_options[key] = std::string(value);
    for (const FlagOption& o : kFlagOptions)
        if (o.name == key) return SetBool(s.flags.*o.flag, err, value);
    return S_OK;
}

HRESULT ProcessDriverSetupText(DriverSession& s, const CErrorManagerBase& err,
                               std::string_view text) {
    s.driver_setup = std::string(text);
    s.driver_setup_options.clear();
    for (const OptionPair& p : ParseOptionPairs(text)) {
        HRESULT hr = ProcessDriverSetupOption(s, err, p.name, p.value);
        if (FAILED(hr)) return hr;
    }
    return S_OK;
}

HRESULT ProcessOptionString(DriverSession& s, const CErrorManagerBase& err,
                            std::string_view options) {
    SplitOptionString split = SplitDriverSetup(options);
    if (split.has_driver_setup) {
        HRESULT hr = ProcessDriverSetupText(s, err, split.driver_setup);
        if (FAILED(hr)) return hr;
    }
    for (const OptionPair& p : ParseOptionPairs(split.ordinary)) {
        HRESULT hr = ProcessInitOption(s, err, p.name, p.value);
        if (FAILED(hr)) return hr;
    }
    return S_OK;
}

}  // namespace qn
