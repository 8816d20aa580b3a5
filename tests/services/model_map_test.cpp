#include "services/model_map.h"

#include <gtest/gtest.h>

#include "platform/com/bstr.h"
#include "services/simulation.h"

namespace qn {
namespace {

using com::Bstr;

TEST(ModelBasedMap, LookupPrefersExactModelThenEveryModel) {
    CSimulationMap<LONG> m{CSimulationInfo<LONG>("", 1), CSimulationInfo<LONG>("QDS4032A", 2)};
    struct Case {
        const char* model;
        LONG expected;
    } cases[] = {{"QDS4032A", 2}, {"qds4032a", 1}, {"QDS9999", 1}, {"", 1}};
    for (const Case& c : cases) {
        ASSERT_NE(m.Lookup(c.model), nullptr) << c.model;
        EXPECT_EQ(m.Lookup(c.model)->Value(), c.expected) << c.model;
    }
}

TEST(ModelBasedMap, NoRowWithoutEveryModelRowAndLaterRowReplaces) {
    CSimulationMap<double> m{CSimulationInfo<double>("A", 1.0)};
    EXPECT_EQ(m.Lookup("B"), nullptr);
    EXPECT_EQ(m.Lookup(""), nullptr);
    EXPECT_EQ(m.GetSimulationValue("B"), 0.0);
    m.AddRow(CSimulationInfo<double>("A", 3.0));
    EXPECT_EQ(m.size(), 1u);
    EXPECT_EQ(m.GetSimulationValue("A"), 3.0);
}

TEST(SimulationMap, DefaultsWithoutRow) {
    EXPECT_EQ(CSimulationMap<SHORT>{}.GetSimulationValue("X"), 0);
    EXPECT_EQ(CSimulationMap<LONG>{}.GetSimulationValue("X"), 0);
    Bstr s = Bstr::Adopt(CSimulationMap<BSTR>{}.GetSimulationValue("X"));
    ASSERT_NE(s.get(), nullptr);
    EXPECT_EQ(s.size(), 0u);
}

TEST(SimulationMap, StringValuesAreIndependentCopies) {
    CSimulationMap<BSTR> m{CSimulationInfo<BSTR>("", "SIM01234567")};
    Bstr a = Bstr::Adopt(m.GetSimulationValue("QDS4032A"));
    Bstr b = Bstr::Adopt(m.GetSimulationValue("QDS4032A"));
    ASSERT_NE(a.get(), b.get());
    ASSERT_NE(a.get(), m.Lookup("")->Value());
    a.get()[0] = u'X';
    a.reset();
    EXPECT_EQ(b.utf8(), "SIM01234567");
    EXPECT_EQ(Bstr::Adopt(m.GetSimulationValue("")).utf8(), "SIM01234567");
}

// A member-table-like literal: the rows a driver's member tables carry.
struct MemberRow {
    const char* name;
    const char* simKey;
    SimValue sim;
};
constexpr MemberRow kRows[] = {
    {"get_Range", "IQuorlen731XXChannel.Range", SimValue::Double(40)},
    {"get_SerialNumber", "IQuorlen731XXSystem.SerialNumber", SimValue::String("SIM01234567")},
    {"get_Type", "IQuorlen731XXTrigger.Type", SimValue::Long(1)},
    {"get_Enabled", "IQuorlen731XXChannel.Enabled", SimValue::Short(VARIANT_TRUE)},
    {"Reset", nullptr, {}},
};

TEST(SimulationTable, BuiltOnceFromMemberLiterals) {
    const CSimulationTable& t = SimulationTableOf<kRows>();
    EXPECT_EQ(&t, &SimulationTableOf<kRows>());
    EXPECT_EQ(t.size(), 4u);
    EXPECT_EQ(t.GetSimulationValue<double>("IQuorlen731XXChannel.Range", "QDS4032A"), 40.0);
    EXPECT_EQ(t.GetSimulationValue<LONG>("IQuorlen731XXTrigger.Type", "X"), 1);
    EXPECT_EQ(t.GetSimulationValue<SHORT>("IQuorlen731XXChannel.Enabled", "X"), VARIANT_TRUE);
    Bstr s = Bstr::Adopt(t.GetSimulationValue<BSTR>("IQuorlen731XXSystem.SerialNumber", "X"));
    EXPECT_EQ(s.utf8(), "SIM01234567");
    // Wrong type or unknown key: no map, the type's zero value.
    EXPECT_EQ(t.Find<LONG>("IQuorlen731XXChannel.Range"), nullptr);
    EXPECT_EQ(t.GetSimulationValue<double>("IQuorlen731XXChannel.Nope", "X"), 0.0);
}

}  // namespace
}  // namespace qn
