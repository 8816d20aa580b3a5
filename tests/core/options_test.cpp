#include <gtest/gtest.h>

#include "Quorlen731XXErrors.h"
#include "core/option_processing.h"
#include "platform/com/errorinfo.h"
#include "core/options.h"

namespace qn {
namespace {

std::string Pairs(std::string_view text) {
    std::string out;
    for (const OptionPair& p : ParseOptionPairs(text)) out += "[" + p.name + "|" + p.value + "]";
    return out;
}

TEST(OptionGrammar, PairsAreFoundTrimmedAndDeduplicated) {
    struct Case {
        const char* text;
        const char* pairs;
    };
    const Case cases[] = {
        {"Simulate=1,RangeCheck=false", "[Simulate|1][RangeCheck|false]"},
        {"  simulate =  TRUE  ", "[simulate|TRUE]"},
        {"", ""},
        {",,,", ""},
        {"word,Simulate=1", "[Simulate|1]"},                  // a bare word is skipped
        {"=1,Simulate=0", "[Simulate|0]"},                    // empty name: no pair
        {"Cache=,Simulate=0", "[Simulate|0]"},                // empty value: no pair
        {"a=b=c", "[a|b]"},                                   // value stops at "="
        {"Cache=1,cache=0", "[Cache|1][cache|0]"},            // names differ in case
        {"Cache=1,Simulate=1,Cache=0", "[Cache|0][Simulate|1]"},  // replaced in place
        {" = x", "[|x]"},                                     // blank name reaches processing
    };
    for (const Case& c : cases) EXPECT_EQ(Pairs(c.text), c.pairs) << c.text;
}

TEST(OptionGrammar, DriverSetupIsTheRestOfTheString) {
    auto s = SplitDriverSetup("Simulate=true, DriverSetup=Model=QDS4032A, Trace=false");
    EXPECT_TRUE(s.has_driver_setup);
    EXPECT_EQ(s.ordinary, "Simulate=true, ");
    EXPECT_EQ(s.driver_setup, "Model=QDS4032A, Trace=false");

    s = SplitDriverSetup("driversetup=Model=X");  // found by upper-casing
    EXPECT_TRUE(s.has_driver_setup);
    EXPECT_EQ(s.driver_setup, "Model=X");

    s = SplitDriverSetup("DriverSetup =Model=X");  // a blank before "=" hides it
    EXPECT_FALSE(s.has_driver_setup);
}

TEST(OptionGrammar, BooleanWordsAndDecimals) {
    for (const char* t : {"true", "TRUE", "vi_true", "1"}) EXPECT_EQ(ParseBooleanWord(t), true) << t;
    for (const char* f : {"false", "Vi_False", "0"}) EXPECT_EQ(ParseBooleanWord(f), false) << f;
    for (const char* b : {"yes", "", "01", "true "}) EXPECT_FALSE(ParseBooleanWord(b)) << b;

    EXPECT_EQ(ParseDecimalPrefix("  42abc"), 42);
    EXPECT_EQ(ParseDecimalPrefix("-7"), -7);
    EXPECT_EQ(ParseDecimalPrefix("+12"), 12);
    EXPECT_EQ(ParseDecimalPrefix("abc"), 0);
    EXPECT_EQ(ParseDecimalPrefix("99999999999999999999"), 2147483647);
    EXPECT_EQ(ParseDecimalPrefix("-99999999999999999999"), -2147483647 - 1);
}

class OptionProcessing : public ::testing::Test {
protected:
    DriverSession s;
    CErrorManagerBase err;
};

// A new session holds the documented flag defaults; each option name, in
// any letter case, sets its own flag and no other.
TEST_F(OptionProcessing, EachFlagStartsAtItsDefaultAndHasItsOwnName) {
    struct Flag {
        const char* option;
        bool SessionFlags::*flag;
        bool documented_default;
    };
    const Flag flags[] = {
        {"Cache", &SessionFlags::cache, true},
        {"interchangecheck", &SessionFlags::interchange_check, false},
        {"QUERYINSTRSTATUS", &SessionFlags::query_instrument_status, false},
        {"RangeCheck", &SessionFlags::range_check, true},
        {"recordCoercions", &SessionFlags::record_coercions, false},
        {"Simulate", &SessionFlags::simulate, false},
    };
    for (const Flag& changed : flags) {
        SCOPED_TRACE(changed.option);
        DriverSession fresh;
        for (const Flag& f : flags) EXPECT_EQ(fresh.flags.*f.flag, f.documented_default) << f.option;
        const std::string text =
            std::string(changed.option) + (changed.documented_default ? "=0" : "=1");
        ASSERT_EQ(ProcessOptionString(fresh, err, text), S_OK);
        for (const Flag& f : flags)
            EXPECT_EQ(fresh.flags.*f.flag, f.documented_default != (&f == &changed)) << f.option;
    }
    const TraceSettings trace = DriverSession{}.trace;
    EXPECT_FALSE(trace.enabled);
    EXPECT_EQ(trace.size_max, 1000000);
    EXPECT_FALSE(trace.arrays);
    EXPECT_EQ(trace.array_size_max, 10);
    EXPECT_EQ(trace.save_interval, 1);
}

TEST_F(OptionProcessing, FlagsModelAndTraceSettings) {
    ASSERT_EQ(ProcessOptionString(
                  s, err,
                  "Simulate=1,RangeCheck=false,Foo=1,DriverSetup=Model=QDS4032A, Trace=true, "
                  "TraceName=run, TraceSizeMax=5000, TraceArray=1, TraceArraySizeMax=3, "
                  "TraceSaveInterval=0, TraceTransform=t, Extra=x"),
              S_OK);
    EXPECT_TRUE(s.flags.simulate);
    EXPECT_FALSE(s.flags.range_check);
    EXPECT_EQ(s.model, "QDS4032A");
    EXPECT_TRUE(s.trace.enabled);
    EXPECT_EQ(s.trace.name, "run");
    EXPECT_EQ(s.trace.size_max, 5000);
    EXPECT_TRUE(s.trace.arrays);
    EXPECT_EQ(s.trace.array_size_max, 3);
    EXPECT_EQ(s.trace.save_interval, 0);
    EXPECT_EQ(s.trace.transform, "t");
    EXPECT_EQ(s.init_options.at("foo"), "1");
    EXPECT_EQ(s.driver_setup_options.at("extra"), "x");
    EXPECT_EQ(s.driver_setup, "Model=QDS4032A, Trace=true, TraceName=run, TraceSizeMax=5000, "
                              "TraceArray=1, TraceArraySizeMax=3, TraceSaveInterval=0, "
                              "TraceTransform=t, Extra=x");
}

TEST_F(OptionProcessing, PairsAfterDriverSetupBelongToIt) {
    ASSERT_EQ(ProcessOptionString(s, err, "DriverSetup=Model=QDS4032A, Simulate=true"), S_OK);
    EXPECT_FALSE(s.flags.simulate);
    EXPECT_EQ(s.driver_setup_options.at("simulate"), "true");
}

TEST_F(OptionProcessing, BadValuesFailWithTheirText) {
    EXPECT_EQ(ProcessOptionString(s, err, "Simulate=yes"), E_IVI_BAD_OPTION_VALUE);
    com::ErrorRecord rec;
    ASSERT_TRUE(com::TakeThreadError(&rec));
    EXPECT_EQ(rec.description, "Quorlen731XX: The yes value in the option string is unknown.");

    EXPECT_EQ(ProcessOptionString(s, err, "DriverSetup=Trace=maybe"), E_IVI_BAD_OPTION_VALUE);
    EXPECT_EQ(ProcessOptionString(s, err, "DriverSetup=TraceArray=2"), E_IVI_BAD_OPTION_VALUE);

    EXPECT_EQ(ProcessOptionString(s, err, " =1"), E_IVI_INVALID_VALUE);
    ASSERT_TRUE(com::TakeThreadError(&rec));
    EXPECT_EQ(rec.description,
              "Quorlen731XX: Invalid value (0) for method ProcessInitOption, parameter strNameIn.");
}

TEST_F(OptionProcessing, FailureStopsProcessing) {
    // Pairs are processed in the order they first appear: the bad value stops
    // everything after it.
    EXPECT_EQ(ProcessOptionString(s, err, "Cache=0,Simulate=bad,RangeCheck=0"),
              E_IVI_BAD_OPTION_VALUE);
    EXPECT_FALSE(s.flags.cache);
    EXPECT_TRUE(s.flags.range_check);
}

}  // namespace
}  // namespace qn
