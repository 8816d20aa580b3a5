// Repeated-capability items reached from a C session: the channel,
// measurement and digital-channel objects a selector names.
#pragma once

#include <string>
#include <type_traits>

#include "capi/c_session.h"
#include "capi/selector.h"

namespace qn::capi {

// The element interface of a collection, from its get_Item member.
template <class C, class E>
E* ItemType(HRESULT (C::*)(BSTR, E**));
template <class Coll>
using ElementOf = std::remove_pointer_t<decltype(ItemType(&Coll::get_Item))>;

// The item of `Coll` named by the first name of `selector`; the selector's
// errors and the collection's own errors are converted and recorded.
template <class Coll, class Out>
ViStatus ItemOf(ViSession vi, IUnknown* driver, ViConstString selector, ComPtr<Out>* out) {
    using Elem = ElementOf<Coll>;
    std::string_view name;
    ViStatus status = FirstSelectorName(vi, selector, &name);
    if (status != VI_SUCCESS) return status;
    ComPtr<Coll> collection;
    status = Convert(vi, driver->QueryInterface(iid_of<Coll>, collection.OutVoid()));
    if (status < 0) return status;
    com::Bstr bname(name);
    ComPtr<Elem> item;
    status = Convert(vi, collection->get_Item(bname.get(), item.Out()));
    if (status < 0) return status;
    if constexpr (std::is_same_v<Out, Elem>) *out = std::move(item);
    else *out = ComPtr<Out>(item.get());
    return VI_SUCCESS;
}

// Calls `member(Elem*)` (returning an HRESULT) on the item of `Coll` that
// `selector` names, in the session's driver object.
template <class Coll, class Member>
ViStatus CallOnItem(ViSession vi, ViConstString selector, Member&& member) {
    ComPtr<IUnknown> driver;
    ViStatus status = DriverOf(vi, &driver);
    if (status != VI_SUCCESS) return status;
    ComPtr<ElementOf<Coll>> item;
    status = ItemOf<Coll>(vi, driver.get(), selector, &item);
    if (status != VI_SUCCESS) return status;
    return Convert(vi, member(item.get()));
}

// The item of `Coll` that `selector` names, as the element interface (held by
// the session's cache when the session may cache items, else by *hold).
template <class Coll>
ViStatus CachedItemOf(ViSession vi, SessionData& session, ViConstString selector,
                      ComPtr<IUnknown>* hold, IUnknown** item) {
    // A selector that is exactly the name of a cached item is well formed:
    // the common case is found without parsing it.
    const std::string_view raw = selector ? selector : "";
    if (IUnknown* cached = session.FindItem(iid_of<Coll>, raw)) {
        *item = cached;
        return VI_SUCCESS;
    }
    std::string_view name;
    ViStatus status = FirstSelectorName(vi, selector, &name);
    if (status != VI_SUCCESS) return status;
    if (IUnknown* cached = session.FindItem(iid_of<Coll>, name)) {
        *item = cached;
        return VI_SUCCESS;
    }
    ComPtr<ElementOf<Coll>> found;
    status = ItemOf<Coll>(vi, session.Driver(), selector, &found);
    if (status != VI_SUCCESS) return status;
    session.StoreItem(iid_of<Coll>, name, found.get());
    *hold = ComPtr<IUnknown>(found.get());
    *item = hold->get();
    return VI_SUCCESS;
}

}  // namespace qn::capi
