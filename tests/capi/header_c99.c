/* The C API header on its own in a C99 translation unit. */
#include "Qn731XX.h"

ViStatus header_check(ViSession vi) {
    ViReal64 waveform[4];
    ViInt32 actual = 0;
    ViReal64 x0 = 0.0, dx = 0.0;
    ViChar message[256];
    ViStatus status = Qn731XX_FetchWaveform(vi, "Channel1", 4, waveform, &actual, &x0, &dx);
    Qn731XX_error_message(vi, status, message);
    return status == IVI_ERROR_INVALID_VALUE ? QN731XX_ERROR_FAILURE : status;
}
