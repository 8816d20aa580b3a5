// Status-register functions of the C API.
#include "Qn731XX.h"
#include "Quorlen731XX.h"
#include "capi/call.h"

using namespace qn;
using namespace qn::capi;

extern "C" {

ViStatus Qn731XX_StatusPreset(ViSession vi) { return CallSimple(vi, &IQuorlen731XXStatus::Preset); }
ViStatus Qn731XX_StatusClear(ViSession vi) { return CallSimple(vi, &IQuorlen731XXStatus::Clear); }

ViStatus Qn731XX_StatusConfigureServiceRequest(ViSession vi, ViInt32 reason) {
    return CallMethod(vi, &IQuorlen731XXStatus::ConfigureServiceRequest, reason);
}

ViStatus Qn731XX_StatusGetRegister(ViSession vi, ViInt32 statusRegister, ViInt32 subRegister,
                                   ViInt32* value) {
    return Guard(vi, [&]() -> ViStatus {
        if (!value) return NullResult(vi, "value");
        LONG v = 0;
        ViStatus status = CallOn<IQuorlen731XXStatus>(vi, [&](IQuorlen731XXStatus* s) {
            return s->get_Register(static_cast<Quorlen731XXStatusRegisterEnum>(statusRegister),
                                   static_cast<Quorlen731XXStatusSubRegisterEnum>(subRegister), &v);
        });
        if (status >= 0) *value = v;
        return status;
    });
}

ViStatus Qn731XX_StatusSetRegister(ViSession vi, ViInt32 statusRegister, ViInt32 subRegister,
                                   ViInt32 value) {
    return CallMethod(vi, &IQuorlen731XXStatus::put_Register, statusRegister, subRegister, value);
}

}  // extern "C"
