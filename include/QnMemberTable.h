// Member tables: every member of a driver interface is one row of the
// interface's table file (include/members/<Interface>.def):
//
//   QN_PROPERTY(Interface, Name, CType, TraceVt, Access, Simulation,
//               ReadCommand, WriteCommand, ReadBody, WriteBody)
//   QN_NAVIGATION(Interface, Name, TargetInterface)
//   QN_METHOD(Interface, Name, Command, Body, (Dir, Type, Param)...)
//   QN_METHOD0(Interface, Name, Command, Body)
//
//   Access      RO, RW or WO
//   Simulation  QN_SIM(Long, 0), QN_SIM(Double, 40.0), QN_SIM(String, "x"),
//               QN_SIM(Short, -1) for booleans, or QN_NOSIM (the body decides)
//   ReadBody    DEFAULT (query the read command), CUSTOM (a body function
//   WriteBody   <Interface>_get_<Name>_Body / <Interface>_put_<Name>_Body),
//               FORWARD (the instrument-specific member of the same name), or
//   Body        NONE for an access the property does not have; methods take
//               CUSTOM (<Interface>_<Name>_Body) or FORWARD.
//   Dir         In, Out, InBool, OutBool (booleans are VARIANT_BOOL)
//
// The same rows declare the interface (here), tie it to the implementing
// class, declare and define the implementing members (core/member_impl.h),
// name the trace parameters and hold the simulation values and the
// instrument commands. An interface declares its rows with
//
//   #define QN_PROPERTY QN_DECLARE_PROPERTY   (and the other row kinds)
//   #include "members/IQuorlen731XXAcquisition.def"
//
// (include/QnDeclareMembers.h does those defines).
#pragma once

#define QN_IF_GET_RO(...) __VA_ARGS__
#define QN_IF_GET_RW(...) __VA_ARGS__
#define QN_IF_GET_WO(...)
#define QN_IF_PUT_RO(...)
#define QN_IF_PUT_RW(...) __VA_ARGS__
#define QN_IF_PUT_WO(...) __VA_ARGS__

#define QN_SIM(Kind, value) ::qn::SimValue::Kind(value)
#define QN_NOSIM ::qn::SimValue{}

// Applies m to each parenthesised parameter tuple, separated by commas.
#define QN_EXPAND(x) x
#define QN_FE_1(m, x) m x
#define QN_FE_2(m, x, ...) m x, QN_EXPAND(QN_FE_1(m, __VA_ARGS__))
#define QN_FE_3(m, x, ...) m x, QN_EXPAND(QN_FE_2(m, __VA_ARGS__))
#define QN_FE_4(m, x, ...) m x, QN_EXPAND(QN_FE_3(m, __VA_ARGS__))
#define QN_FE_5(m, x, ...) m x, QN_EXPAND(QN_FE_4(m, __VA_ARGS__))
#define QN_FE_6(m, x, ...) m x, QN_EXPAND(QN_FE_5(m, __VA_ARGS__))
#define QN_FE_7(m, x, ...) m x, QN_EXPAND(QN_FE_6(m, __VA_ARGS__))
#define QN_FE_8(m, x, ...) m x, QN_EXPAND(QN_FE_7(m, __VA_ARGS__))
#define QN_FE_PICK(_1, _2, _3, _4, _5, _6, _7, _8, NAME, ...) NAME
#define QN_FOR_EACH(m, ...)                                                                    \
    QN_EXPAND(QN_FE_PICK(__VA_ARGS__, QN_FE_8, QN_FE_7, QN_FE_6, QN_FE_5, QN_FE_4, QN_FE_3,  \
                         QN_FE_2, QN_FE_1)(m, __VA_ARGS__))

// Parameter pieces of a (Dir, Type, Name) tuple.
#define QN_P_DECL_In(T, N) T N
#define QN_P_DECL_Out(T, N) T* N
#define QN_P_DECL_InBool(T, N) VARIANT_BOOL N
#define QN_P_DECL_OutBool(T, N) VARIANT_BOOL* N
#define QN_P_DECL(Dir, T, N) QN_P_DECL_##Dir(T, N)
#define QN_P_NAME(Dir, T, N) N

// The pure virtual members of the rows, for an interface declaration.
#define QN_DECLARE_PROPERTY(Itf, Name, CType, Vt, Access, Sim, GetCmd, PutCmd, GetBody, PutBody) \
    QN_IF_GET_##Access(virtual HRESULT get_##Name(CType* val) = 0;)                              \
    QN_IF_PUT_##Access(virtual HRESULT put_##Name(CType val) = 0;)
#define QN_DECLARE_NAVIGATION(Itf, Name, Target) virtual HRESULT get_##Name(Target** val) = 0;
#define QN_DECLARE_METHOD(Itf, Name, Cmd, Body, ...) \
    virtual HRESULT Name(QN_FOR_EACH(QN_P_DECL, __VA_ARGS__)) = 0;
#define QN_DECLARE_METHOD0(Itf, Name, Cmd, Body) virtual HRESULT Name() = 0;
