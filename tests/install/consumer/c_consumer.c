/* Opens a simulated session through the C API and prints the model. */
#include <stdio.h>
#include <string.h>

#include "Qn731XX.h"

int main(void) {
    ViSession vi = 0;
    ViChar model[256] = "";
    ViStatus status = Qn731XX_InitWithOptions("", VI_FALSE, VI_FALSE, "Simulate=true", &vi);
    if (status < 0) {
        fprintf(stderr, "Qn731XX_InitWithOptions failed: 0x%08lX\n", (unsigned long)(ViUInt32)status);
        return 1;
    }
    status = Qn731XX_GetAttributeViString(vi, "", IVI_ATTR_INSTRUMENT_MODEL, (ViInt32)sizeof model,
                                          model);
    Qn731XX_close(vi);
    if (status < 0 || model[0] == '\0') {
        fprintf(stderr, "reading the model failed: 0x%08lX\n", (unsigned long)(ViUInt32)status);
        return 1;
    }
    printf("model: %s\n", model);
    return 0;
}
