#include "services/tracer.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <pugixml.hpp>
#include <sstream>
#include <string>
#include <vector>

#include "platform/com/bstr.h"
#include "platform/com/safearray.h"

namespace fs = std::filesystem;

namespace qn {
namespace {

std::int64_t g_now = 1700000000;
std::int64_t FakeClock() {
    return g_now;
}

// Every test runs in its own temporary directory.
class TracerTest : public ::testing::Test {
  protected:
    void SetUp() override {
        old_ = fs::current_path();
        char tmpl[] = "/tmp/qn_trace_XXXXXX";
        ASSERT_NE(mkdtemp(tmpl), nullptr);
        dir_ = tmpl;
        fs::current_path(dir_);
        unsetenv("IVI_STANDARD_ROOT_DIR");
        g_now = 1700000000;
    }
    void TearDown() override {
        fs::current_path(old_);
        fs::remove_all(dir_);
    }
    // A tracer with the fake clock, enabled, started with `name`.
    void Start(CTraceOwner& t, const char* name, LONG interval = 1) {
        t.SetClock(&FakeClock);
        t.SetTraceName(name);
        t.SetSaveInterval(interval);
        ASSERT_EQ(t.SetEnabled(true), S_OK);
        ASSERT_EQ(t.StartSessionTracing(), S_OK);
        ASSERT_EQ(t.GetState(), CTracer::kRecording);
    }
    static pugi::xml_document Load(const std::string& path) {
        pugi::xml_document d;
        pugi::xml_parse_result r = d.load_file(
            path.c_str(), pugi::parse_default | pugi::parse_pi | pugi::parse_declaration);
        EXPECT_TRUE(r) << path << ": " << r.description();
        return d;
    }
    static std::size_t CountMethods(const std::string& path) {
        pugi::xml_document d = Load(path);
        std::size_t n = 0;
        for (auto m : d.child("TraceRecords").children("Method")) n += !m.empty();
        return n;
    }
    fs::path old_, dir_;
};

// One traced call the way the method frame makes it: In, Out and InOut
// parameters, the out values set by the body.
void TracedCall(CTraceOwner& t, double in, LONG outValue, const char* inout) {
    LONG out = 0;
    com::Bstr io(inout);
    BSTR ioRaw = io.get();
    const TraceParam params[] = {
        TraceParam::Double("val", TraceDirection::In, &in),
        TraceParam::Long("count", TraceDirection::Out, &out),
        TraceParam::String("text", TraceDirection::InOut, &ioRaw),
    };
    CMethodTrace trace(&t, "IQuorlen731XXChannel", "Measure", params);
    out = outValue;
    ioRaw = nullptr;  // the body replaced the in/out string
}

TEST_F(TracerTest, TwoCallsGiveTwoMethodElementsWithParameters) {
    CTraceOwner t;
    Start(t, "session");
    EXPECT_EQ(t.GetFilePath(), (dir_ / "session.xml").string());
    TracedCall(t, 2.5, 7, "a<b & \"c\" 'd'");
    TracedCall(t, -1, 8, "x");
    ASSERT_EQ(t.SaveOnClose(), S_OK);

    pugi::xml_document d = Load(t.GetFilePath());
    auto methods = d.child("TraceRecords").children("Method");
    ASSERT_EQ(std::distance(methods.begin(), methods.end()), 2);
    pugi::xml_node m = *methods.begin();
    EXPECT_STREQ(m.attribute("Name").value(), "Measure");
    EXPECT_STREQ(m.attribute("Interface").value(), "IQuorlen731XXChannel");
    EXPECT_EQ(m.attribute("Thread").as_int(), gettid());
    EXPECT_EQ(std::string(m.attribute("StartTime").value()).size(), 8u);
    EXPECT_STREQ(m.attribute("StartTime").value(), m.attribute("EndTime").value());
    EXPECT_STREQ(m.attribute("ExecutionTime").value(), "00");
    // In and InOut at the start, Out and InOut with their final values at the end.
    std::vector<std::string> params;
    for (pugi::xml_node p : m.children("Parameter")) {
        params.push_back(std::string(p.attribute("Name").value()) + " " +
                         p.attribute("Direction").value() + " " + p.attribute("Value").value());
    }
    EXPECT_EQ(params, (std::vector<std::string>{"val In 2.5", "text InOut a<b & \"c\" 'd'",
                                                "count Out 7", "text InOut "}));
}

TEST_F(TracerTest, FileStartsWithDeclarationAndStyleSheet) {
    fs::create_directories(dir_ / "ivi" / "Components" / "Orrinsoft");
    struct Case {
        const char* transform;
        bool companyDir;
        std::string href;
    } cases[] = {
        {"", false, (dir_ / "ivi/Components/Orrinsoft/trace.xslt").string()},
        {"mine", false, (dir_ / "ivi/Components/Orrinsoft/mine.xslt").string()},
        {"mine.xslt", true, (dir_ / "ivi/Components/Quorlen Technologies/mine.xslt").string()},
    };
    setenv("IVI_STANDARD_ROOT_DIR", (dir_ / "ivi").c_str(), 1);
    int n = 0;
    for (const Case& c : cases) {
        if (c.companyDir)
            fs::create_directories(dir_ / "ivi" / "Components" / "Quorlen Technologies");
        CTraceOwner t;
        t.SetTraceTransform(c.transform);
        Start(t, ("pi" + std::to_string(n++)).c_str());
        std::ifstream f(t.GetFilePath());
        std::string decl, pi;
        std::getline(f, decl);
        std::getline(f, pi);
        EXPECT_EQ(decl, "<?xml version=\"1.0\"?>");
        EXPECT_EQ(pi, "<?xml-stylesheet type=\"text/xsl\" href=\"file:\\\\" + c.href + "\"?>");
        pugi::xml_document d = Load(t.GetFilePath());
        EXPECT_EQ(std::string(d.document_element().name()), "TraceRecords");
    }
    unsetenv("IVI_STANDARD_ROOT_DIR");
    CTraceOwner t;
    EXPECT_EQ(t.StyleSheetPath(), "Components/Orrinsoft/trace.xslt");
}

TEST_F(TracerTest, TraceNamesAndDefaultName) {
    struct Case {
        const char* name;
        std::string path;
    } cases[] = {
        {"plain", (dir_ / "plain.xml").string()},
        {"kept.xml", (dir_ / "kept.xml").string()},
        {"other.txt", (dir_ / "other.txt.xml").string()},
        {"sub/../rel", (dir_ / "rel.xml").string()},
        {"", (dir_ / "PLACEHOLDER").string()},
    };
    char exe[4096];
    ssize_t len = readlink("/proc/self/exe", exe, sizeof exe - 1);
    ASSERT_GT(len, 0);
    std::string exeName = fs::path(std::string(exe, std::size_t(len))).filename().string();
    cases[4].path = (dir_ / (exeName + "_2023-11-14_22-13-20.xml")).string();
    setenv("TZ", "UTC", 1);
    tzset();
    fs::create_directories(dir_ / "sub");
    for (const Case& c : cases) {
        CTraceOwner t;
        Start(t, c.name);
        EXPECT_EQ(t.GetFilePath(), c.path);
        EXPECT_TRUE(fs::exists(c.path)) << c.path;
    }
}

TEST_F(TracerTest, ArrayParameters) {
    com::SafeArray wave = com::SafeArray::Vector(VT_R8, 20);
    for (LONG i = 0; i < 20; ++i) {
        double x = i;
        SafeArrayPutElement(wave.get(), &i, &x);
    }
    SAFEARRAYBOUND b[2] = {{2, 0}, {4, 0}};
    com::SafeArray grid(SafeArrayCreate(VT_I2, 2, b));
    SAFEARRAY* w = wave.get();
    SAFEARRAY* g = grid.get();
    struct Case {
        bool traceArray;
        LONG limit;
        SAFEARRAY** psa;
        const char* dimSizes;
        int elements;
    } cases[] = {{true, 10, &w, "20", 10},
                 {false, 10, &w, "20", 0},
                 {true, 10, &g, "2,4", 0}};
    int n = 0;
    for (const Case& c : cases) {
        CTraceOwner t;
        t.SetTraceArrays(c.traceArray);
        t.SetArrayLimit(c.limit);
        Start(t, ("arr" + std::to_string(n++)).c_str());
        {
            const TraceParam p[] = {TraceParam::Array("data", TraceDirection::Out, c.psa)};
            CMethodTrace trace(&t, "IQuorlen731XXWaveform", "FetchWaveform", p);
        }
        t.SaveOnClose();
        pugi::xml_document d = Load(t.GetFilePath());
        pugi::xml_node p = d.child("TraceRecords").child("Method").child("Parameter");
        EXPECT_EQ(p.attribute("NumDims").as_int(), c.psa == &g ? 2 : 1);
        EXPECT_STREQ(p.attribute("DimSizes").value(), c.dimSizes);
        auto el = p.children("Element");
        EXPECT_EQ(std::distance(el.begin(), el.end()), c.elements) << n;
        if (c.elements) {
            EXPECT_STREQ(p.last_child().attribute("Value").value(),
                         std::to_string(c.elements - 1).c_str());
        }
    }
}

TEST_F(TracerTest, BoolByReferenceAndWholeExecutionSeconds) {
    CTraceOwner t;
    Start(t, "bool");
    VARIANT_BOOL flag = VARIANT_TRUE;
    VARIANT v;
    VariantInit(&v);
    v.vt = VT_BOOL | VT_BYREF;
    v.pboolVal = &flag;
    {
        const TraceParam p[] = {TraceParam::Variant("pbVal", TraceDirection::In, &v)};
        CMethodTrace trace(&t, "IQuorlen731XXSystem", "WaitForOperationComplete", p);
        g_now += 75;
    }
    t.SaveOnClose();
    pugi::xml_document d = Load(t.GetFilePath());
    pugi::xml_node m = d.child("TraceRecords").child("Method");
    EXPECT_STREQ(m.child("Parameter").attribute("Value").value(), "true");
    EXPECT_STREQ(m.attribute("ExecutionTime").value(), "75");
}

TEST_F(TracerTest, SaveIntervalDecidesWhenTheFileIsWritten) {
    CTraceOwner every, minute;
    Start(every, "every", 0);
    Start(minute, "minute", 1);
    for (int i = 1; i <= 3; ++i) {
        TracedCall(every, i, i, "");
        TracedCall(minute, i, i, "");
        EXPECT_EQ(CountMethods(every.GetFilePath()), std::size_t(i));
        EXPECT_EQ(CountMethods(minute.GetFilePath()), 0u);
    }
    g_now += 59;
    TracedCall(minute, 0, 0, "");
    EXPECT_EQ(CountMethods(minute.GetFilePath()), 0u);
    g_now += 1;
    TracedCall(minute, 0, 0, "");
    EXPECT_EQ(CountMethods(minute.GetFilePath()), 5u);
}

TEST_F(TracerTest, SizeLimitStopsRecording) {
    CTraceOwner t;
    Start(t, "full", 0);
    TracedCall(t, 1, 1, "");
    // A file exactly at the limit is not full; one more record passes it.
    t.SetSizeLimit(LONG(fs::file_size(t.GetFilePath())));
    ASSERT_EQ(t.Save(), S_OK);
    EXPECT_EQ(t.GetState(), CTracer::kRecording);
    TracedCall(t, 2, 2, "");
    EXPECT_EQ(t.GetState(), CTracer::kFull);
    TracedCall(t, 3, 3, "");
    t.SaveOnClose();
    EXPECT_EQ(CountMethods(t.GetFilePath()), 2u);
}

TEST_F(TracerTest, SizeLimitBoundsTheTraceBetweenIntervalSaves) {
    CTraceOwner t;
    Start(t, "bounded", 60);  // an hour between interval saves
    t.SetSizeLimit(4000);
    int calls = 0;
    while (t.GetState() == CTracer::kRecording && calls < 10000) TracedCall(t, ++calls, 0, "");
    // The limit was reached within the hour: the file was saved early and the
    // trace is full, instead of growing in memory until the next save.
    EXPECT_EQ(t.GetState(), CTracer::kFull);
    EXPECT_LT(calls, 100);
    EXPECT_GT(fs::file_size(t.GetFilePath()), 4000u);
}

TEST_F(TracerTest, SessionsInTheSameSecondShareOneFile) {
    std::string path;
    {
        CTraceOwner first;
        Start(first, "");
        TracedCall(first, 1, 1, "");
        first.SaveOnClose();
        path = first.GetFilePath();
    }
    CTraceOwner second, third;
    Start(second, "");
    Start(third, "");
    EXPECT_EQ(second.GetFilePath(), path);
    EXPECT_EQ(third.GetFilePath(), path);
    TracedCall(second, 2, 2, "");
    TracedCall(third, 3, 3, "");
    // Either session's save writes the records of both.
    ASSERT_EQ(third.Save(), S_OK);
    EXPECT_EQ(CountMethods(path), 3u);
    TracedCall(second, 4, 4, "");
    ASSERT_EQ(second.SaveOnClose(), S_OK);
    EXPECT_EQ(CountMethods(path), 4u);
}

TEST_F(TracerTest, StateTransitions) {
    CTraceOwner t;
    // The documented defaults of a new tracer.
    EXPECT_EQ(t.GetState(), CTracer::kNotStarted);
    EXPECT_FALSE(t.GetEnabled());
    EXPECT_EQ(t.GetSizeLimit(), 1000000);
    EXPECT_FALSE(t.GetTraceArrays());
    EXPECT_EQ(t.GetArrayLimit(), 10);
    EXPECT_EQ(t.GetSaveInterval(), 1);
    t.SetClock(&FakeClock);
    EXPECT_EQ(t.StartSessionTracing(), S_FALSE);  // not enabled
    Start(t, "states");
    EXPECT_EQ(t.StartSessionTracing(), E_UNEXPECTED);
    TracedCall(t, 1, 1, "");
    // Close, then a new Initialize with the same name appends to the file.
    ASSERT_EQ(t.SaveOnClose(), S_OK);
    EXPECT_EQ(t.GetState(), CTracer::kNotStarted);
    t.SetTraceName("states");
    ASSERT_EQ(t.StartSessionTracing(), S_OK);
    TracedCall(t, 2, 2, "");
    // Disabling in the middle of a call releases the document safely and
    // drops what was not saved.
    {
        CMethodTrace trace(&t, "IQuorlen731XXSystem", "put_TraceEnabled");
        t.SetEnabled(false);
    }
    EXPECT_FALSE(t.GetEnabled());
    EXPECT_EQ(t.GetState(), CTracer::kNotStarted);
    TracedCall(t, 3, 3, "");  // not recording: nothing happens
    EXPECT_EQ(CountMethods((dir_ / "states.xml").string()), 1u);
}

TEST_F(TracerTest, ForeignFileIsNotOverwritten) {
    for (const char* content : {"not xml at all", "<Other/>"}) {
        std::ofstream("foreign.xml") << content;
        CTraceOwner t;
        t.SetTraceName("foreign.xml");
        t.SetEnabled(true);
        EXPECT_TRUE(FAILED(t.StartSessionTracing()));
        EXPECT_EQ(t.GetState(), CTracer::kNotStarted);
        TracedCall(t, 1, 1, "");
        std::stringstream s;
        s << std::ifstream("foreign.xml").rdbuf();
        EXPECT_EQ(s.str(), content);
    }
}

}  // namespace
}  // namespace qn
