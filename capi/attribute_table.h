// The attributes of the C API: each ID names one property of the driver. The
// ID is the header's constant, the property is the member-table row it names;
// type and access come from that row, never from here.
#pragma once

#include <span>
#include <string_view>

#include "capi/property_access.h"
#include "visatype.h"

namespace qn::capi {

// Where a property lives: on the driver object itself, or on an item of one
// of its channel collections, selected by the channel name.
enum class Scope : unsigned char { kSession, kChannel, kUserChannel, kDigitalChannel };

struct AttributeRow {
    ViAttr id;
    std::string_view name;  // the header's constant
    std::string_view key;   // "Interface.Property" of the property
    Scope scope;
};

std::span<const AttributeRow> AttributeRows();

struct Attribute {
    const AttributeRow* row = nullptr;
    const PropertyAccess* property = nullptr;  // null while the driver lacks the property
    std::size_t interface_slot = 0;  // the property's interface, numbered among all attributes'
};

// How many interfaces carry the attributes (interface_slot is below this).
std::size_t AttributeInterfaceCount();

// The attribute of an ID; row null for an ID the API does not know.
Attribute FindAttribute(ViAttr id);

}  // namespace qn::capi
