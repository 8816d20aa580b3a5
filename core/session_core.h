// SessionCore: the state one driver session shares between its root object
// and every child object of its repeated capabilities: the session lock, the
// session state and, as they arrive, the I/O provider, the tracer, the
// feature record and the instance lists.
//
// The root object and every child hold it through a shared pointer, so a
// child a client still holds after releasing the root stays a valid object
// (its calls then find the session not initialized).
#pragma once

#include <memory>

#include <map>
#include <string>

#include "core/features.h"
#include "core/repcap.h"
#include "core/session.h"
#include "platform/com/lock.h"
#include "scope/acquisition_control.h"
#include "scope/acquisition_state.h"
#include "scope/measurement_settings.h"
#include "scope/trigger_shadow.h"
#include "services/coercion_log.h"
#include "io/visa_provider.h"
#include "services/tracer.h"

namespace qn {

class SessionCore {
public:
    // One lock per session. Every member of the root and of every child runs
    // under it: the instrument is one byte stream, and two threads talking
    // to it at once through different objects would interleave their
    // commands and replies.
    com::CriticalSection lock;
    DriverSession session;
    FeatureRecord features;
    AcquisitionState acquisition;
    AcquisitionControl acquisition_control;
    MeasurementSettings measurement;
    TriggerShadow trigger;
    RepCapLists repcaps;
    CCoercionLogManager coercions;
    CTraceOwner tracer;
    // The instrument session (closed while simulating). Tests may put a
    // scripted provider in its place before Initialize.
    std::unique_ptr<CDriverIOProvider> io = std::make_unique<CVisaComIOProvider>();
    // Virtual names of the configuration store's driver session:
    // lower-case virtual name -> physical name.
    std::map<std::string, std::string> virtual_names;
    // The external input's probe attenuation last written or read. -1
    // (automatic sensing) is remembered without I/O and read back as is.
    double external_probe_attenuation = 1.0;
    // The IVI-C session handle of the C API session this object is bound
    // to; 0 while no C session is linked. Set by the C API.
    LONG c_session_handle = 0;

    bool Initialized() const { return session.initialized; }
    bool Simulating() const { return session.flags.simulate; }
    // The instrument model string (empty when not initialized).
    const std::string& Model() const {
        static const std::string kNone;
        return session.initialized ? session.model : kNone;
    }
};

}  // namespace qn
