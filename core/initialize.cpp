// Initialize and Close of the root object, and the configuration sources
// Initialize reads: the IVI configuration store, then the option string.
#include <algorithm>

#include "core/inherent.h"
#include "core/models.h"
#include "core/option_processing.h"
#include "core/options.h"
#include "core/root.h"
#include "platform/ivi/config_store.h"

namespace qn {

namespace {

constexpr std::string_view kSoftwareModuleName = "Qn731XX";

std::string SettingText(const InitialSetting& v) {
    if (const auto* s = std::get_if<std::string>(&v)) return *s;
    if (const auto* l = std::get_if<long>(&v)) return std::to_string(*l);
    if (const auto* d = std::get_if<double>(&v)) return FormatDouble(*d);
    return std::get<bool>(v) ? "true" : "false";
}

// Reads the "Configurable Initial Settings" of a session or module.
void LoadConfigurableInitialSettings(DriverSession& s,
                                     const std::vector<ivi::DataComponent>& components) {
    const auto* settings = ivi::FindStructure(components, ivi::kConfigurableInitialSettings);
    if (!settings) return;
    for (long i = 1; const ivi::DataComponent* c = ivi::DataComponentAt(*settings, i); ++i) {
        std::string name = ToLower(TrimBlanks(c->name));
        switch (c->type) {
            case ivi::DataType::kString:
                if (auto* v = std::get_if<std::string>(&c->value)) s.initial_settings[name] = *v;
                break;
            case ivi::DataType::kInteger:
                if (auto* v = std::get_if<std::int32_t>(&c->value)) s.initial_settings[name] = long{*v};
                break;
            case ivi::DataType::kReal:
                if (auto* v = std::get_if<double>(&c->value)) s.initial_settings[name] = *v;
                break;
            case ivi::DataType::kBoolean:
                if (auto* v = std::get_if<bool>(&c->value)) s.initial_settings[name] = *v;
                break;
            case ivi::DataType::kStructure:
            case ivi::DataType::kApiReference:
                break;
        }
    }
    auto model = s.initial_settings.find("model");
    if (model != s.initial_settings.end()) s.model = SettingText(model->second);
}

}  // namespace

Quorlen731XX::Quorlen731XX() : CDriverNode(std::make_shared<SessionCore>()) {}

Quorlen731XX::~Quorlen731XX() {
    std::lock_guard<com::CriticalSection> lock(Core().lock);
    if (Core().session.initialized) {
        CloseIo();
        Core().session.initialized = false;
        EndSession();
    }
    // The children hold the session core; dropping the lists breaks that
    // cycle. Children a client still holds stay valid, not initialized.
    Core().repcaps.Clear();
}

template <class T>
HRESULT Quorlen731XX::Nav(T** out) {
    *out = static_cast<T*>(this);
    AddRef();
    return S_OK;
}
template HRESULT Quorlen731XX::Nav(IIviDriverOperation**);
template HRESULT Quorlen731XX::Nav(IIviDriverIdentity**);
template HRESULT Quorlen731XX::Nav(IIviDriverUtility**);

HRESULT Quorlen731XX::InterfaceSupportsErrorInfo(REFIID riid) {
    void* p = nullptr;
    if (riid == iid_of<ISupportErrorInfo> || FAILED(InnerQueryInterface(riid, &p))) return S_FALSE;
    static_cast<IUnknown*>(p)->Release();
    return S_OK;
}

bool Quorlen731XX::IsModelSupported() const {
    return CSupportedModelValidator::Instance().IsSupported(Core().Model());
}
bool Quorlen731XX::IsModel(std::string_view model) const {
    return Core().Initialized() && Core().Model() == model;
}
bool Quorlen731XX::IsModelInFamily(std::string_view family) const {
    return CSupportedModelValidator::Instance().IsInFamily(Core().Model(), family);
}

// Step 4 of Initialize: the configuration store (when there is one), then
// the option string.
HRESULT Quorlen731XX::ApplyConfiguration(const std::string& resource, const std::string& options) {
    DriverSession& s = Core().session;
    ivi::LoadResult store = ivi::ConfigStore::LoadDefault();
    if (store.status == ivi::LoadStatus::kError)
        return Errors().ErrorWithExtra(Msg::E_IVI_INVALID_FILE_FORMAT, store.error);
    if (!store.loaded()) {
        s.io_resource_descriptor = resource;
        return ProcessOptionString(s, Errors(), options);
    }
    if (const ivi::DriverSession* ds = store.store.FindSession(resource)) {
        s.logical_name = resource;
        Core().virtual_names = ds->virtual_name_map;
        if (ds->HasHardwareAsset()) s.io_resource_descriptor = ds->resource_descriptor;
        s.flags = SessionFlags{ds->flags.cache, ds->flags.interchange_check,
                               ds->flags.query_instr_status, ds->flags.range_check,
                               ds->flags.record_coercions, ds->flags.simulate};
        HRESULT hr = ProcessDriverSetupText(s, Errors(), ds->driver_setup);
        if (FAILED(hr)) return hr;
        LoadConfigurableInitialSettings(s, ds->data_components);
        return ProcessOptionString(s, Errors(), options);
    }
    s.io_resource_descriptor = resource;
    const ivi::SoftwareModule* module = store.store.FindSoftwareModule(kSoftwareModuleName);
    if (!module)
        return Errors().ErrorWithExtra(
            Msg::E_IVI_CANNOT_RECOVER,
            "Software module could not be loaded from the IVI Configuration Store.");
    LoadConfigurableInitialSettings(s, module->data_components);
    return ProcessOptionString(s, Errors(), options);
}

HRESULT Quorlen731XX::InitializeBody(BSTR resource, bool id_query, bool reset, BSTR options) {
    if (!resource)                                                                      // 1
        return Errors().InvalidValue("Initialize", "bstrResourceDescriptor", std::int32_t{0});
    SessionCore& core = Core();
    DriverSession& s = core.session;
    if (s.initialized) return Errors().Error(Msg::E_IVI_ALREADY_INITIALIZED);            // 2

    s.option_string = com::BstrToUtf8(options);                                          // 3
    s.io_resource_descriptor.clear();
    s.logical_name.clear();
    s.identity = InstrumentIdentity{};
    s.init_options.clear();
    s.driver_setup_options.clear();
    s.initial_settings.clear();
    core.virtual_names.clear();
    core.acquisition_control = {};

    HRESULT hr = ApplyConfiguration(com::BstrToUtf8(resource), s.option_string);          // 4
    if (SUCCEEDED(hr) && s.flags.simulate && s.model.empty())                             // 5
        s.model = std::string(kDefaultModel);
    s.snapshot = s.flags;                                                                 // 6
    if (FAILED(hr)) return hr;                                                            // 7

    hr = StartTracing();                                                                  // 8
    if (FAILED(hr)) return hr;
    if (!s.flags.simulate) {                                                              // 9
        hr = OpenIo();
        if (FAILED(hr)) return hr;
    }
    s.initialized = true;                                                                 // 10
    hr = StartSession();                                                                  // 11
    if (FAILED(hr)) {
        CloseIo();
        s.initialized = false;
        return hr;
    }
    hr = S_OK;
    if (!s.flags.simulate && !s.identity.known) hr = QueryIdentity();                     // 12
    if (SUCCEEDED(hr) && id_query && !IsModelSupported())                                 // 13
        hr = Errors().ErrorWithExtra(Msg::E_IVI_ID_QUERY_FAILED,
                                     "Unrecognized model: " + s.model + ".");
    if (SUCCEEDED(hr) && reset && FAILED(Reset()))                                        // 14
        hr = Errors().Error(Msg::E_IVI_RESET_FAILED);
    if (SUCCEEDED(hr) && s.flags.interchange_check)                                       // 15
        hr = Errors().ErrorWithExtra(Msg::E_IVI_BAD_OPTION_VALUE,
                                     "Interchange check is not supported by the driver.",
                                     {"true"});
    if (FAILED(hr)) {                                                                     // 16
        EndSession();
        CloseIo();
        s.initialized = false;
        return hr;
    }
    core.features = s.flags.simulate ? FixedFeatures(s.model) : DiscoverFeatures(*this, s.model);
    CompleteMeasurements();
    // A failed discovery query does not fail Initialize and leaves no error
    // information behind.
    SetErrorInfo(0, nullptr);
    return S_OK;
}

HRESULT Quorlen731XX::CloseBody() {
    DriverSession& s = Core().session;
    if (!s.initialized) return Errors().Error(Msg::E_IVI_NOT_INITIALIZED);
    SaveTrace();
    CloseIo();
    Cache().Clear();
    s.initialized = false;
    EndSession();
    return S_OK;
}

}  // namespace qn
