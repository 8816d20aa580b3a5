#include "core/frame.h"

#include <string>

namespace qn::frame_detail {

HRESULT CheckOut(CDriverNode& node, const MemberInfo& m, std::size_t index, const void* p) {
    if (p) return S_OK;
    std::string_view param = index < m.params.size() ? m.params[index] : std::string_view();
    return node.Errors().NullPointer(m.entry, param);
}

std::string VisibleText(std::string_view text) {
    std::string out;
    for (char c : text) {
        if (c == '\n')
            out += "\\n";
        else if (c == '\0')
            out += "\\0";
        else
            out += c;
    }
    return out;
}

HRESULT OutOfMemory(CDriverNode& node) { return node.Errors().Error(Msg::E_IVI_OUT_OF_MEMORY); }

HRESULT InternalError(CDriverNode& node, const char* what) {
    std::string text = std::string(kMessagePrefix) + "Internal error: " + (what ? what : "");
    return node.Errors().Publish(E_UNEXPECTED, text);
}

}  // namespace qn::frame_detail
