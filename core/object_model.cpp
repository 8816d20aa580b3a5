// The object model of a session: building the instance lists of the
// repeated capabilities, the session notifications, and the collections.

#include <algorithm>

#include "Quorlen731XXErrors.h"
#include "core/children.h"
#include "core/features.h"
#include "core/inherent.h"
#include "core/options.h"
#include "core/root.h"
#include "io/io_manager.h"

namespace qn {

namespace {

std::string Numbered(const char* prefix, long n) { return prefix + std::to_string(n); }

template <class Child>
void AddInstance(const std::shared_ptr<SessionCore>& core, std::vector<RepCapInstance>& list,
                 std::string name) {
    long position = static_cast<long>(list.size()) + 1;
    ComPtr<Child> child = com::MakeComObject<Child>(core, name, position);
    RepCapInstance r;
    r.name = std::move(name);
    r.position = position;
    r.element = static_cast<typename Child::ElementInterface*>(child.get());
    r.node = child.get();
    r.object = ComPtr<IUnknown>(static_cast<typename Child::ElementInterface*>(child.get()));
    list.push_back(std::move(r));
}

template <class Child>
void BuildList(const std::shared_ptr<SessionCore>& core, RepCapClass c, const char* prefix,
               long first, long count) {
    std::vector<RepCapInstance>& list = core->repcaps.Build(c);
    for (long i = 0; i < count; ++i) AddInstance<Child>(core, list, Numbered(prefix, first + i));
}

// Visits the per-object services of every child of the session.
template <class F>
void ForEachChild(SessionCore& core, F&& f) {
    for (int c = 0; c < static_cast<int>(RepCapClass::kCount); ++c)
        if (const auto* list = core.repcaps.List(static_cast<RepCapClass>(c)))
            for (const RepCapInstance& r : *list) f(static_cast<RepCapClass>(c), r);
}

bool IsOneOf(std::string_view model, std::initializer_list<std::string_view> models) {
    for (std::string_view m : models)
        if (m == model) return true;
    return false;
}

}  // namespace

// The analog and digital counts come from the model for the early families
// and from the instrument otherwise; the status check is off meanwhile.
HRESULT Quorlen731XX::BuildInstanceLists() {
    SessionCore& core = Core();
    long analog = 4, digital = 16;
    if (!core.Simulating()) {
        bool& qis = core.session.flags.query_instrument_status;
        const bool saved = qis;
        qis = false;
        CDriverIOManager io(*this);
        std::string reply;
        HRESULT hr = io.InstrQuery(kIdentityQuery, &reply, 255);
        std::string model;
        if (SUCCEEDED(hr)) {
            std::size_t a = reply.find(',');
            std::size_t b = a == std::string::npos ? a : reply.find(',', a + 1);
            if (a != std::string::npos)
                model = std::string(TrimBlanks(reply.substr(a + 1, b == std::string::npos ? b : b - a - 1)));
        }
        LONG n = 0, pods = 0, size = 0;
        if (SUCCEEDED(hr)) {
            if (IsOneOf(model, {"73121A", "73121D", "73122A", "73122D"})) {
                analog = 2;
            } else if (IsOneOf(model, {"73141A", "73141D", "73142A", "73142D"})) {
                analog = 4;
            } else if (IsEarlyFamilyModel(model)) {
                // The other early models have no system-data queries either.
                analog = FixedFeatures(model).analog_channel_count;
            } else {
                hr = io.InstrQuery("SYST:DATA:VAL? \"COUN:CHAN\"", &n);
                analog = n;
            }
        }
        if (SUCCEEDED(hr)) {
            if (IsEarlyFamilyModel(model)) {
                // The early families have no system-data queries: their
                // digital channels follow from the model name.
                digital = model.find('D') != std::string::npos ? 16 : 0;
            } else {
                hr = io.InstrQuery("SYST:DATA:VAL? \"COUN:POD\"", &pods);
                if (SUCCEEDED(hr)) hr = io.InstrQuery("SYST:DATA:VAL? \"POD:SIZE\"", &size);
                // Each factor on its own: two negative replies must not
                // multiply into a large positive count.
                digital = static_cast<long>(std::max<LONG>(pods, 0)) * std::max<LONG>(size, 0);
            }
        }
        qis = saved;
        if (FAILED(hr)) return hr;
        if (analog < 0) analog = 0;
        if (digital < 0) digital = 0;
        // A larger count is a bad reply, not a reason to create millions of objects.
        if (analog > kMaxChannelCount || digital > kMaxChannelCount)
            return Errors().Error(Msg::E_IVI_UNEXPECTED_RESPONSE);
    }
    const std::shared_ptr<SessionCore>& cp = CorePtr();
    core.repcaps.Clear();
    BuildList<Quorlen731XXChannel>(cp, RepCapClass::kChannel, "Channel", 1, analog);
    BuildList<Quorlen731XXUserChannel>(cp, RepCapClass::kUserChannel, "UserChannel", 1, analog);
    BuildList<Quorlen731XXMeasurement>(cp, RepCapClass::kMeasurement, "Channel", 1, analog);
    core.repcaps.Build(RepCapClass::kUserMeasurement);
    BuildList<Quorlen731XXUserDigitalChannel>(cp, RepCapClass::kUserDigitalChannel,
                                              "UserDigitalChannel", 0, digital);
    return S_OK;
}

HRESULT Quorlen731XX::StartSession() { return BuildInstanceLists(); }

// After a successful Initialize: one user measurement per channel, user
// channel and digital channel, in that order.
void Quorlen731XX::CompleteMeasurements() {
    RepCapLists& r = Core().repcaps;
    std::vector<RepCapInstance>& list = r.Build(RepCapClass::kUserMeasurement);
    for (RepCapClass c : {RepCapClass::kChannel, RepCapClass::kUserChannel,
                          RepCapClass::kUserDigitalChannel}) {
        const auto* source = r.List(c);
        if (!source) continue;
        if (c == RepCapClass::kUserDigitalChannel)
            r.digital_measurements = {static_cast<long>(list.size()) + 1,
                                      static_cast<long>(list.size() + source->size())};
        for (const RepCapInstance& s : *source)
            AddInstance<Quorlen731XXUserMeasurement>(CorePtr(), list, s.name);
    }
    r.math_measurements = r.external_measurements = IndexRange{};
}

void Quorlen731XX::EndSession() {
    ForEachChild(Core(), [](RepCapClass c, const RepCapInstance& r) {
        switch (c) {
            case RepCapClass::kChannel: static_cast<Quorlen731XXChannel*>(r.node)->OnSessionEnd(); break;
            case RepCapClass::kUserChannel: static_cast<Quorlen731XXUserChannel*>(r.node)->OnSessionEnd(); break;
            case RepCapClass::kMeasurement: static_cast<Quorlen731XXMeasurement*>(r.node)->OnSessionEnd(); break;
            case RepCapClass::kUserMeasurement: static_cast<Quorlen731XXUserMeasurement*>(r.node)->OnSessionEnd(); break;
            default: static_cast<Quorlen731XXUserDigitalChannel*>(r.node)->OnSessionEnd(); break;
        }
    });
}

void Quorlen731XX::ResetChildren() {
    ForEachChild(Core(), [](RepCapClass c, const RepCapInstance& r) {
        if (c == RepCapClass::kUserChannel)
            static_cast<Quorlen731XXUserChannel*>(r.node)->OnReset();
        else
            r.node->Cache().InvalidateAll();
    });
}

void Quorlen731XX::InvalidateAll() {
    Cache().InvalidateAll();
    ForEachChild(Core(), [](RepCapClass, const RepCapInstance& r) { r.node->Cache().InvalidateAll(); });
}

void Quorlen731XXUserChannel::OnReset() {
    Cache().InvalidateAll();
    last_probe_attenuation.reset();
}

namespace {

template <class Element>
Element* CounterpartAt(SessionCore& core, RepCapClass c, long position) {
    const auto* list = core.repcaps.List(c);
    if (!list || position < 1 || position > static_cast<long>(list->size())) return nullptr;
    return static_cast<Element*>((*list)[position - 1].element);
}

}  // namespace

IQuorlen731XXChannel* Quorlen731XXChannel::Counterpart(IIviScopeChannel*) {
    return CounterpartAt<IQuorlen731XXChannel>(Core(), RepCapClass::kUserChannel, Position());
}

IQuorlen731XXMeasurement* Quorlen731XXMeasurement::Counterpart(IIviScopeMeasurement*) {
    // The user measurement of the same channel: the user-measurement list
    // starts with one instance per channel, in channel order.
    return CounterpartAt<IQuorlen731XXMeasurement>(Core(), RepCapClass::kUserMeasurement,
                                                   Position());
}

}  // namespace qn
