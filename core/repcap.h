// The instance lists of the repeated capabilities: per class, the ordered
// instances with their names and 1-based positions, and the resolution of a
// name given to a collection's Item.
#pragma once

#include <map>
#include <string>
#include <string_view>
#include <vector>

#include "platform/com/unknown.h"

namespace qn {

class CDriverNode;

// The repeated-capability classes, in the order the session builds them.
enum class RepCapClass : int {
    kChannel,             // Quorlen731XXChannel (IIviScopeChannel)
    kUserChannel,         // Quorlen731XXUserChannel (IQuorlen731XXChannel)
    kMeasurement,         // Quorlen731XXMeasurement (IIviScopeMeasurement)
    kUserMeasurement,     // Quorlen731XXUserMeasurement (IQuorlen731XXMeasurement)
    kUserDigitalChannel,  // Quorlen731XXUserDigitalChannel (IQuorlen731XXDigitalChannel)
    kCount
};

struct RepCapInstance {
    std::string name;
    long position = 0;        // 1-based
    ComPtr<IUnknown> object;  // holds the instance
    IUnknown* element = nullptr;  // its element interface (owned by object)
    CDriverNode* node = nullptr;  // its per-object services
};

// First and last index (1-based, inclusive) of a kind of user measurement;
// empty when first > last.
struct IndexRange {
    long first = 1;
    long last = 0;
    bool Contains(long i) const { return i >= first && i <= last; }
};

class RepCapLists {
public:
    // Null until the session built the class's list.
    const std::vector<RepCapInstance>* List(RepCapClass c) const;
    std::vector<RepCapInstance>& Build(RepCapClass c);  // cleared, marked built
    void Clear();                                       // every list dropped

    // Item resolution: trimmed name; the only instance for an empty name;
    // otherwise the name translated through the virtual names (lower-case
    // key, one further translation of the result) and compared without
    // regard to case. Null when nothing matches.
    const RepCapInstance* Find(RepCapClass c, std::string_view name,
                               const std::map<std::string, std::string>& virtual_names) const;

    // Index ranges of the user-measurement kinds.
    IndexRange digital_measurements;
    IndexRange math_measurements;
    IndexRange external_measurements;

private:
    std::vector<RepCapInstance> lists_[static_cast<int>(RepCapClass::kCount)];
    bool built_[static_cast<int>(RepCapClass::kCount)] = {};
};

}  // namespace qn
