// The entries of the measurement objects' member tables (the instrument-specific
// measurement of one source and the class-compliant measurement of one
// channel). The bodies live with the members they belong to.
#include "core/children.h"
#include "core/member_impl.h"

namespace qn {

#define QN_CLASS Quorlen731XXUserMeasurement
#include "core/member_definitions_begin.h"
#include "members/IQuorlen731XXMeasurement.def"
#include "QnEndMembers.h"
#undef QN_CLASS

#define QN_CLASS Quorlen731XXMeasurement
#include "core/member_definitions_begin.h"
#include "members/IIviScopeMeasurement.def"
#include "QnEndMembers.h"
#undef QN_CLASS

}  // namespace qn
