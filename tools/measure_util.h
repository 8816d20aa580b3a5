// Measurement objects for the qn731xx commands.
#pragma once

#include <string>

#include "tools/session_util.h"

namespace qn::tools {

// The measurement object named `name` ("UserChannel1", "UserDigitalChannel3").
HRESULT MeasurementNamed(Quorlen731XX* driver, const std::string& name,
                         ComPtr<IQuorlen731XXMeasurement>* m);

// The measurement object of analog channel `channel`; on the embedded
// emulator the channel is switched on first (a fresh emulator shows only
// channel 1).
HRESULT ShowChannel(ToolSession& session, long channel, ComPtr<IQuorlen731XXMeasurement>* m);

}  // namespace qn::tools
