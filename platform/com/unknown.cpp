#include "platform/com/unknown.h"

namespace qn::com {

std::atomic<long>& ModuleLockCount() {
    static std::atomic<long> count{0};
    return count;
}

}  // namespace qn::com
