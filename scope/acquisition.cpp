// Acquisition and timebase: IQuorlen731XXAcquisition and the class-compliant
// IIviScopeAcquisition on the root object.
#include "core/member_impl.h"
#include "core/root.h"

namespace qn {

#define QN_CLASS Quorlen731XX
#include "core/member_definitions_begin.h"
#include "members/IQuorlen731XXAcquisition.def"
#include "members/IIviScopeAcquisition.def"
#include "QnEndMembers.h"
#undef QN_CLASS

}  // namespace qn
