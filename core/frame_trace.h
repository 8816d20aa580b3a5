// The method frame's trace record: opened after the argument checks, closed
// when the body has returned. Costs one branch when tracing is not recording.
#pragma once

#include "core/session_core.h"

namespace qn {

struct MemberInfo;

class FrameTrace {
public:
    template <class... Args>
    FrameTrace(SessionCore& /*core*/, const MemberInfo& /*m*/, const Args&... /*args*/) {}
    template <class... Args>
    void End(const Args&... /*args*/) {}
};

}  // namespace qn
