#include "services/cache.h"

#include <gtest/gtest.h>

#include "platform/com/bstr.h"
#include "services/call_context.h"
#include "services/coercion_log.h"

namespace qn {
namespace {

using com::Bstr;

TEST(CacheEntry, StringsAreCopiedInAndOut) {
    CCacheManager m;
    CCacheEntry<BSTR>* e = m.GetCacheEntry<BSTR>("IQuorlen731XXSystem.Date");
    Bstr written("+2008,+2,+27");
    e->Set(written.get());
    written.reset();
    Bstr a, b;
    ASSERT_TRUE(e->Get(a.Out()));
    ASSERT_TRUE(e->Get(b.Out()));
    EXPECT_NE(a.get(), b.get());
    a.reset();
    EXPECT_EQ(b.utf8(), "+2008,+2,+27");

    // An empty string (or a null BSTR) is a value: it reads back as "" and
    // not as "not valid".
    Bstr emptyText("");
    for (BSTR empty : {emptyText.get(), static_cast<BSTR>(nullptr)}) {
        e->Set(empty);
        Bstr r;
        ASSERT_TRUE(e->Get(r.Out()));
        ASSERT_NE(r.get(), nullptr);
        EXPECT_EQ(r.size(), 0u);
    }
    e->Invalidate();
    Bstr none;
    EXPECT_FALSE(e->Get(none.Out()));
    EXPECT_EQ(none.get(), nullptr);
}

TEST(CacheManager, ManagersAndKeysAreIndependent) {
    CCacheManager channel1, channel2;
    channel1.GetCacheEntry<double>("IQuorlen731XXChannel.Range")->Set(5.0);
    EXPECT_FALSE(channel2.GetCacheEntry<double>("IQuorlen731XXChannel.Range")->IsValid());
    EXPECT_FALSE(channel1.GetCacheEntry<double>("IIviScopeChannel.Range")->IsValid());
    // A key already used with another type is refused, not reinterpreted.
    EXPECT_EQ(channel1.GetCacheEntry<LONG>("IQuorlen731XXChannel.Range"), nullptr);
    EXPECT_EQ(channel1.FindCacheEntry<double>("Missing.Key"), nullptr);
    channel1.Clear();
    EXPECT_EQ(channel1.size(), 0u);
    EXPECT_FALSE(channel1.GetCacheEntry<double>("IQuorlen731XXChannel.Range")->IsValid());
}

TEST(ComparePolicy, DoublesEqualAtFourteenDigits) {
    const CSimpleComparePolicy<double>* p = DefaultComparePolicy<double>().Lookup("QDS4032A");
    ASSERT_NE(p, nullptr);
    EXPECT_EQ(p->Digits(), 14);
    EXPECT_TRUE(p->Compare(1.000000000000001, 1.000000000000002));
    EXPECT_FALSE(p->Compare(1.0, 1.00000000000001));
    EXPECT_TRUE(p->Compare(-2.5, -2.5));

    CCacheManager m;
    EXPECT_TRUE(m.GetCacheEntry<double>("K")->Equal(1.000000000000001, 1.0, ""));
    EXPECT_FALSE(m.GetCacheEntry<LONG>("L")->Equal(1, 2, ""));
    Bstr a("abc"), b("abc"), c("ABC");
    CCacheEntry<BSTR>* s = m.GetCacheEntry<BSTR>("S");
    EXPECT_TRUE(s->Equal(a.get(), b.get(), ""));
    EXPECT_FALSE(s->Equal(a.get(), c.get(), ""));
    EXPECT_TRUE(s->Equal(nullptr, Bstr("").get(), ""));
}

TEST(CoercionLog, BoundedFifo) {
    CCoercionLogManager log(2);
    EXPECT_EQ(log.GetNext(), "");
    log.AddCoercionRecord("a");
    log.AddCoercionRecord("b");
    log.AddCoercionRecord("c");  // drops "a"
    EXPECT_EQ(log.GetNext(), "b");
    EXPECT_EQ(log.GetNext(), "c");
    EXPECT_EQ(log.GetNext(), "");
}

TEST(CallContext, NestedScopesRestoreTheStack) {
    CCallContextManager m;
    EXPECT_EQ(m.Current(), nullptr);
    {
        CallContextScope outer(m, {"Quorlen731XX", "IIviDriver", "Initialize"});
        {
            CallContextScope inner(m, {"Quorlen731XX", "IIviDriverUtility", "Reset"});
            ASSERT_NE(m.Current(), nullptr);
            EXPECT_EQ(m.Current()->member, "Reset");
            EXPECT_EQ(m.Depth(), 2u);
        }
        EXPECT_EQ(m.Current()->member, "Initialize");
    }
    EXPECT_EQ(m.Depth(), 0u);
    EXPECT_EQ(m.Pop().member, "");  // popping an empty stack is harmless
    EXPECT_EQ(m.ContextText(), "");
}

}  // namespace
}  // namespace qn
