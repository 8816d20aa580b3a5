// In a source file, inside a namespace and before a table file: each row
// becomes named constants holding its instrument commands, so a body that
// formats a command itself (a computed value, a token) uses the text of its
// own row:
//
//   <Interface>_<Name>_Read, <Interface>_<Name>_Write   (properties)
//   <Interface>_<Name>_Command                          (methods)
//
// Ended by QnEndMembers.h.
#include <string_view>

#define QN_PROPERTY(Itf, Name, CType, Vt, Access, Sim, GetCmd, PutCmd, GetBody, PutBody) \
    [[maybe_unused]] constexpr std::string_view Itf##_##Name##_Read = GetCmd;            \
    [[maybe_unused]] constexpr std::string_view Itf##_##Name##_Write = PutCmd;
#define QN_NAVIGATION(Itf, Name, Target)
#define QN_METHOD(Itf, Name, Cmd, Body, ...) \
    [[maybe_unused]] constexpr std::string_view Itf##_##Name##_Command = Cmd;
#define QN_METHOD0(Itf, Name, Cmd, Body) \
    [[maybe_unused]] constexpr std::string_view Itf##_##Name##_Command = Cmd;
