// What a session remembers about an acquisition started with Initiate that
// completes through the operation-complete event.
#pragma once

#include "platform/com/types.h"

namespace qn {

struct AcquisitionControl {
    // Set by Initiate when it armed such an acquisition; cleared by Status
    // when the event has arrived and by Abort.
    bool pending = false;
    // The standard event status enable Initiate found, written back when the
    // pending acquisition ends.
    LONG saved_event_status_enable = 0;
};

}  // namespace qn
