// Properties of any interface and value type seen through doubles, so one
// table of rows can sweep an interface's members.
#pragma once

#include <functional>
#include <string>
#include <type_traits>

#include "platform/com/types.h"

namespace qn::test {

// One property seen as doubles: the value it starts with and a value to
// write (none for a read-only property).
struct PropertyRow {
    std::string name;
    std::function<HRESULT(double*)> get;
    std::function<HRESULT(double)> put;  // empty: read-only
    double initial;
    double written;
};

template <class Itf, class T>
PropertyRow Row(const char* name, Itf* itf, HRESULT (Itf::*get)(T*), HRESULT (Itf::*put)(T),
           double initial, double written) {
    PropertyRow r{name,
             [=](double* v) {
                 T t{};
                 HRESULT hr = (itf->*get)(&t);
                 *v = static_cast<double>(t);
                 return hr;
             },
             {}, initial, written};
    if (put) r.put = [=](double v) {
        if constexpr (std::is_floating_point_v<T>)
            return (itf->*put)(v);
        else
            return (itf->*put)(static_cast<T>(static_cast<LONG>(v)));
    };
    return r;
}
template <class Itf, class T>
PropertyRow ReadOnly(const char* name, Itf* itf, HRESULT (Itf::*get)(T*), double initial) {
    return Row<Itf, T>(name, itf, get, nullptr, initial, initial);
}

}  // namespace qn::test
