// Trigger functions of the C API: the Configure methods of the trigger
// interfaces, each C argument passed to the member parameter of its position.
#include "IviScope.h"
#include "Qn731XX.h"
#include "Quorlen731XX.h"
#include "capi/call.h"

using namespace qn;
using namespace qn::capi;

extern "C" {

ViStatus Qn731XX_ConfigureTrigger(ViSession vi, ViInt32 triggerType, ViReal64 holdoff) {
    return CallMethod(vi, &IIviScopeTrigger::Configure, triggerType, holdoff);
}

ViStatus Qn731XX_ConfigureEdgeTriggerSource(ViSession vi, ViConstString source, ViReal64 level,
                                            ViInt32 slope) {
    return CallMethod(vi, &IIviScopeTriggerEdge::Configure, source, level, slope);
}

ViStatus Qn731XX_ConfigureGlitchTriggerSource(ViSession vi, ViConstString source, ViReal64 level,
                                              ViReal64 width, ViInt32 polarity, ViInt32 condition) {
    return CallMethod(vi, &IIviScopeTriggerGlitch::Configure, source, level, width, polarity,
                      condition);
}

ViStatus Qn731XX_ConfigureRuntTriggerSource(ViSession vi, ViConstString source,
                                            ViReal64 thresholdLow, ViReal64 thresholdHigh,
                                            ViInt32 polarity) {
    return CallMethod(vi, &IIviScopeTriggerRunt::Configure, source, thresholdLow, thresholdHigh,
                      polarity);
}

ViStatus Qn731XX_ConfigureTVTriggerSource(ViSession vi, ViConstString source, ViInt32 signalFormat,
                                          ViInt32 event, ViInt32 polarity) {
    return CallMethod(vi, &IIviScopeTriggerTv::Configure, source, signalFormat, event, polarity);
}

ViStatus Qn731XX_ConfigureWidthTriggerSource(ViSession vi, ViConstString source, ViReal64 level,
                                             ViReal64 thresholdLow, ViReal64 thresholdHigh,
                                             ViInt32 polarity, ViInt32 condition) {
    return CallMethod(vi, &IIviScopeTriggerWidth::Configure, source, level, thresholdLow,
                      thresholdHigh, polarity, condition);
}

ViStatus Qn731XX_TriggerPatternConfigure(ViSession vi, ViInt32 analogPattern, ViInt32 analogMask,
                                         ViInt32 digitalPattern, ViInt32 digitalMask,
                                         ViInt32 matchingMode) {
    return CallMethod(vi, &IQuorlen731XXTriggerPattern::Configure, analogPattern, analogMask,
                      digitalPattern, digitalMask, matchingMode);
}

ViStatus Qn731XX_TriggerRuntConfigure(ViSession vi, ViConstString source, ViReal64 thresholdLow,
                                      ViReal64 thresholdHigh, ViInt32 polarity) {
    return CallMethod(vi, &IQuorlen731XXTriggerRunt::Configure, source, thresholdLow,
                      thresholdHigh, polarity);
}

ViStatus Qn731XX_TriggerStateConfigure(ViSession vi, ViConstString clockSource, ViReal64 clockLevel,
                                       ViInt32 clockSlope, ViInt32 analogPattern,
                                       ViInt32 analogMask, ViInt32 digitalPattern,
                                       ViInt32 digitalMask) {
    return CallMethod(vi, &IQuorlen731XXTriggerState::Configure, clockSource, clockLevel,
                      clockSlope, analogPattern, analogMask, digitalPattern, digitalMask);
}

}  // extern "C"
