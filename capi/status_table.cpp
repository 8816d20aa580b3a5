// Both tables are derived from the driver's message table: every row there
// gives one row here, by the fixed rules of the C statuses (driver errors keep
// their low 16 bits under 0xBFFA, class statuses keep 0x2001.., inherent
// statuses keep their low byte under 0xBFFA0000 or 0x3FFA0000).
#include "capi/status_table.h"

#include <unordered_map>

#include "core/error_table.h"

namespace qn::capi {

namespace {

constexpr std::uint32_t kErrorHigh = 0xBFFA0000u;
constexpr std::uint32_t kWarningHigh = 0x3FFA0000u;

// The C status of one row of the message table.
ViStatus RowStatus(HRESULT hr) {
    const auto bits = static_cast<std::uint32_t>(hr);
    if (bits == 0) return VI_SUCCESS;
    const std::uint32_t facility_code = bits & 0x7FFFFFFFu;  // without the severity bit
    const bool error = (bits & 0x80000000u) != 0;
    const std::uint32_t high = error ? kErrorHigh : kWarningHigh;
    // Inherent statuses: 0x7000..0x70FF of the driver's interface facility.
    if ((facility_code & 0xFFFFFF00u) == 0x00047000u) return static_cast<ViStatus>(high | (bits & 0xFFu));
    // Class and driver statuses keep their low 16 bits.
    return static_cast<ViStatus>(high | (bits & 0xFFFFu));
}

struct Tables {
    std::unordered_map<HRESULT, ViStatus> to_c;
    std::unordered_map<ViStatus, std::string_view> text;
};

// Texts of the statuses the C layer produces itself, and of the session
// library's statuses, which are VISA statuses.
struct ExtraText {
    std::uint32_t status;
    std::string_view text;
};
constexpr ExtraText kExtraTexts[] = {
    {0x80000000u, "Failure: a null pointer was passed for a result, or the driver reported an "
                  "unexpected error."},
    {0xBFFA000Cu, "Attribute not recognized."},
    {0xBFFA000Du, "Attribute is read only."},
    {0xBFFA0015u, "Incorrect GetAttribute or SetAttribute for attribute of this type."},
    {0xBFFF0000u, "Unknown system error (miscellaneous error)."},
    {0xBFFF000Eu, "The given session or object reference is invalid."},
    {0xBFFF0011u, "Insufficient location information or the requested device or resource is "
                  "not present in the system."},
    {0xBFFF0012u, "Invalid resource reference specified. Parsing error."},
    {0xBFFF0015u, "Timeout expired before operation completed."},
    {0xBFFF003Eu, "Could not perform operation because of I/O error."},
    {0xBFFF0067u, "The given session or object reference does not support this operation."},
    {0xBFFF0071u, "A specified user buffer is not valid or cannot be accessed for the required "
                  "size."},
    {0xBFFF009Cu, "The current session did not have a lock on the resource."},
    {0xBFFF00A6u, "The connection for the given session has been lost."},
};

const Tables& Instance() {
    static const Tables tables = [] {
        Tables t;
        for (const ErrorEntry& e : ErrorTable()) {
            const ViStatus s = RowStatus(e.hr);
            t.to_c.emplace(e.hr, s);
            t.text.emplace(s, e.text);
        }
        for (const ExtraText& x : kExtraTexts)
            t.text.emplace(static_cast<ViStatus>(x.status), x.text);
        return t;
    }();
    return tables;
}

}  // namespace

ViStatus ToCStatus(HRESULT hr) {
    const Tables& t = Instance();
    auto it = t.to_c.find(hr);
    if (it != t.to_c.end()) return it->second;
    return FAILED(hr) ? kFailure : VI_SUCCESS;
}

std::string_view StatusText(ViStatus status) {
    const Tables& t = Instance();
    auto it = t.text.find(status);
    return it == t.text.end() ? std::string_view{} : it->second;
}

}  // namespace qn::capi
