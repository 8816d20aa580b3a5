/* A C program driving an oscilloscope through the C API: it opens a session,
 * configures a channel, an edge trigger and the record, captures and reads a waveform,
 * measures its frequency, and shows the error text of a setting the driver refuses.
 *
 *   qn731xx_c_example RESOURCE [OPTIONS]
 *   qn731xx_c_example TCPIP0::127.0.0.1::5025::SOCKET
 *   qn731xx_c_example "" "Simulate=true"
 */
#include <stdio.h>

#include "Qn731XX.h"

#define MAX_POINTS 100000

static ViReal64 waveform[MAX_POINTS];

/* Prints the failure of a call with the session's recorded description. */
static int report(ViSession vi, const char *what, ViStatus status) {
    ViChar message[256] = "";
    ViChar description[1024] = "";
    ViStatus code = 0;
    Qn731XX_error_message(vi, status, message);
    Qn731XX_GetError(vi, &code, (ViInt32)sizeof description, description);
    printf("%s failed: status 0x%08lX (%s)\n  %s\n", what, (unsigned long)(ViUInt32)status,
           message, description);
    return 1;
}

int main(int argc, char **argv) {
    ViSession vi = 0;
    ViStatus status;
    ViInt32 actual = 0;
    ViReal64 initial_x = 0.0, x_increment = 0.0, low, high, frequency = 0.0;
    ViChar model[256] = "";
    ViChar trigger_source[64] = "";
    ViReal64 trigger_level = 0.0;
    ViInt32 trigger_slope = 0;
    ViInt32 i;

    if (argc < 2) {
        fprintf(stderr, "usage: %s RESOURCE [OPTIONS]\n", argv[0]);
        return 2;
    }
    status = Qn731XX_InitWithOptions(argv[1], VI_TRUE, VI_TRUE, argc > 2 ? argv[2] : "", &vi);
    if (status < 0) return report(0, "Qn731XX_InitWithOptions", status);
    Qn731XX_GetAttributeViString(vi, "", IVI_ATTR_INSTRUMENT_MODEL, (ViInt32)sizeof model, model);
    printf("model: %s\n", model);

    status = Qn731XX_ConfigureChannel(vi, "Channel1", 4.0, 0.0, QN731XX_VAL_VERTICAL_COUPLING_DC,
                                      1.0, VI_TRUE);
    if (status < 0) return report(vi, "Qn731XX_ConfigureChannel", status);
    /* Trigger on the rising edge of channel 1 as it crosses 0.5 V. */
    status = Qn731XX_ConfigureTrigger(vi, QN731XX_VAL_TRIGGER_EDGE, 0.0);
    if (status < 0) return report(vi, "Qn731XX_ConfigureTrigger", status);
    status = Qn731XX_ConfigureEdgeTriggerSource(vi, "Channel1", 0.5,
                                                QN731XX_VAL_TRIGGER_SLOPE_POSITIVE);
    if (status < 0) return report(vi, "Qn731XX_ConfigureEdgeTriggerSource", status);
    Qn731XX_GetAttributeViString(vi, "", IVISCOPE_ATTR_TRIGGER_SOURCE,
                                 (ViInt32)sizeof trigger_source, trigger_source);
    Qn731XX_GetAttributeViReal64(vi, "", IVISCOPE_ATTR_TRIGGER_LEVEL, &trigger_level);
    Qn731XX_GetAttributeViInt32(vi, "", IVISCOPE_ATTR_TRIGGER_SLOPE, &trigger_slope);
    printf("trigger: edge on %s at %g V, %s\n", trigger_source, trigger_level,
           trigger_slope == QN731XX_VAL_TRIGGER_SLOPE_POSITIVE ? "rising" : "falling");
    status = Qn731XX_ConfigureAcquisitionRecord(vi, 1e-3, 1000, -5e-4);
    if (status < 0) return report(vi, "Qn731XX_ConfigureAcquisitionRecord", status);

    status = Qn731XX_ReadWaveform(vi, "Channel1", MAX_POINTS, 5000, waveform, &actual,
                                  &initial_x, &x_increment);
    if (status < 0) return report(vi, "Qn731XX_ReadWaveform", status);
    low = high = actual > 0 ? waveform[0] : 0.0;
    for (i = 1; i < actual; ++i) {
        if (waveform[i] < low) low = waveform[i];
        if (waveform[i] > high) high = waveform[i];
    }
    printf("waveform: %ld points from %g s every %g s, %g V to %g V\n", (long)actual, initial_x,
           x_increment, low, high);

    status = Qn731XX_FetchWaveformMeasurement(vi, "Channel1", QN731XX_VAL_MEASUREMENT_FREQUENCY,
                                              &frequency);
    if (status < 0) return report(vi, "Qn731XX_FetchWaveformMeasurement", status);
    printf("frequency: %g Hz\n", frequency);

    /* A coupling the driver does not know: refused before anything is sent. */
    status = Qn731XX_SetAttributeViInt32(vi, "Channel1", IVISCOPE_ATTR_VERTICAL_COUPLING, 42);
    if (status >= 0) {
        ViBoolean simulating = VI_FALSE;
        Qn731XX_GetAttributeViBoolean(vi, "", IVI_ATTR_SIMULATE, &simulating);
        printf("the setting was accepted%s\n",
               simulating ? " (simulation remembers values without checking them)" : "");
        if (!simulating) {
            Qn731XX_close(vi);
            return 1;
        }
    } else {
        report(vi, "refused setting", status);
    }

    status = Qn731XX_close(vi);
    if (status < 0) return report(0, "Qn731XX_close", status);
    printf("closed\n");
    return 0;
}
