// The collections of the root (Count, Name, Item) and the navigation
// properties of the root's interfaces.
#include "Quorlen731XXErrors.h"
#include "core/member_impl.h"
#include "core/root.h"

namespace qn {

namespace {

struct CollectionOps {
    Quorlen731XX& root;
    RepCapClass cls;

    HRESULT Count(LONG* val) const {
        const auto* list = root.Core().repcaps.List(cls);
        if (!list) return E_UNEXPECTED;
        *val = static_cast<LONG>(list->size());
        return S_OK;
    }
    HRESULT Name(LONG index, BSTR* val) const {
        const auto* list = root.Core().repcaps.List(cls);
        if (!list) return E_UNEXPECTED;
        if (index < 1 || index > static_cast<LONG>(list->size()))
            return root.Errors().InvalidValue("get_Name", "Index", std::int32_t{index});
        *val = com::Utf8ToBstr((*list)[static_cast<std::size_t>(index) - 1].name);
        if (!*val) throw std::bad_alloc();
        return S_OK;
    }
    template <class Element>
    HRESULT Item(BSTR name, Element** val) const {
        const RepCapInstance* r = root.Core().repcaps.Find(cls, com::BstrToUtf8(name),
                                                           root.Core().virtual_names);
        if (!r) return root.Errors().Error(Msg::E_IVI_UNKNOWN_PHYSICAL_IDENTIFIER);
        *val = static_cast<Element*>(r->element);
        (*val)->AddRef();
        return S_OK;
    }
};

}  // namespace

#define QN_COLLECTION_BODIES(Itf, Cls, Element)                                             \
    HRESULT Quorlen731XX::Itf##_get_Count_Body(LONG* val) {                                 \
        return CollectionOps{*this, Cls}.Count(val);                            \
    }                                                                                       \
    HRESULT Quorlen731XX::Itf##_get_Name_Body(LONG Index, BSTR* pVal) {                     \
        return CollectionOps{*this, Cls}.Name(Index, pVal);                     \
    }                                                                                       \
    HRESULT Quorlen731XX::Itf##_get_Item_Body(BSTR Name, Element** pVal) {                  \
        return CollectionOps{*this, Cls}.Item(Name, pVal);                      \
    }

QN_COLLECTION_BODIES(IIviScopeChannels, RepCapClass::kChannel, IIviScopeChannel)
QN_COLLECTION_BODIES(IIviScopeMeasurements, RepCapClass::kMeasurement, IIviScopeMeasurement)
QN_COLLECTION_BODIES(IQuorlen731XXChannels, RepCapClass::kUserChannel, IQuorlen731XXChannel)
QN_COLLECTION_BODIES(IQuorlen731XXMeasurements, RepCapClass::kUserMeasurement,
                     IQuorlen731XXMeasurement)
QN_COLLECTION_BODIES(IQuorlen731XXDigitalChannels, RepCapClass::kUserDigitalChannel,
                     IQuorlen731XXDigitalChannel)

#define QN_CLASS Quorlen731XX
#include "core/member_definitions_begin.h"
#include "members/IIviScope.def"
#include "members/IIviScopeChannels.def"
#include "members/IIviScopeMeasurements.def"
#include "members/IQuorlen731XX.def"
#include "members/IQuorlen731XXChannels.def"
#include "members/IQuorlen731XXDigitalChannels.def"
#include "members/IQuorlen731XXMeasurements.def"
#include "QnEndMembers.h"
#undef QN_CLASS

}  // namespace qn
