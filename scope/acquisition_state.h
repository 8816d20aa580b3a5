// The acquisition settings a session remembers between calls: the average
// count to send when the type becomes Average, and the type last written or
// read (a HiRes type makes average-count writes no-ops).
#pragma once

#include "Quorlen731XXEnums.h"

namespace qn {

struct AcquisitionState {
    LONG last_average_count = 8;
    LONG last_acquisition_type = Quorlen731XXAcquisitionTypeNormal;
};

}  // namespace qn
