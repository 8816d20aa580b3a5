// The registry tree, its file format and the locked atomic file access.
#include "platform/com/registry.h"

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sstream>

namespace {

using qn::com::RegistryTree;

const char* kClassKey = "HKEY_CLASSES_ROOT\\CLSID\\{00000000-0000-0000-0000-000000000001}";

TEST(RegistryTree, KeysAreCaseInsensitiveAndKeepTheirCase) {
    RegistryTree t;
    ASSERT_TRUE(t.SetValue(std::string(kClassKey) + "\\InprocServer32", "", "/lib/x.so"));
    ASSERT_TRUE(t.SetValue(std::string(kClassKey) + "\\InprocServer32", "ThreadingModel", "Both"));
    EXPECT_EQ(t.GetValue("hkcr\\clsid\\{00000000-0000-0000-0000-000000000001}\\inprocserver32"),
              "/lib/x.so");
    EXPECT_EQ(t.GetValue(std::string(kClassKey) + "\\InprocServer32", "threadingmodel"), "Both");
    EXPECT_EQ(t.GetValue(kClassKey), std::nullopt);  // key exists, default value does not
    EXPECT_EQ(t.EnumSubkeys("HKEY_CLASSES_ROOT\\CLSID"),
              std::vector<std::string>{"{00000000-0000-0000-0000-000000000001}"});
    EXPECT_EQ(t.EnumSubkeys(kClassKey), std::vector<std::string>{"InprocServer32"});
    EXPECT_TRUE(t.EnumSubkeys("HKCR\\Nothing").empty());
}

TEST(RegistryTree, InvalidPathsAreRefused) {
    RegistryTree t;
    for (const char* bad : {"", "\\", "HKCR\\\\x", "HKCR\\x\\", "HKCR\\a\nb", "HKCR\\a\tb"}) {
        EXPECT_EQ(t.CreateKey(bad), nullptr) << bad;
        EXPECT_FALSE(t.SetValue(bad, "", "v")) << bad;
    }
    EXPECT_TRUE(t.EnumSubkeys("").empty());
}

TEST(RegistryTree, DeleteTreeRemovesSubkeysOnly) {
    RegistryTree t;
    t.SetValue("HKCR\\A\\B\\C", "", "1");
    t.SetValue("HKCR\\A\\D", "", "2");
    EXPECT_TRUE(t.DeleteTree("HKCR\\a\\b"));
    EXPECT_EQ(t.OpenKey("HKCR\\A\\B"), nullptr);
    EXPECT_EQ(t.GetValue("HKCR\\A\\D"), "2");
    EXPECT_FALSE(t.DeleteTree("HKCR\\A\\B"));
    EXPECT_FALSE(t.DeleteTree("HKCR\\X\\Y"));
}

TEST(RegistryTree, SerializationRoundTripsAwkwardText) {
    RegistryTree t;
    t.SetValue("HKCR\\Key With ] and \"quotes\"", "", "back\\slash \"q\" line\nfeed\ttab\r");
    t.SetValue("HKCR\\Key With ] and \"quotes\"", "name=with \"=\"", "");
    t.CreateKey("HKCR\\Empty\\Leaf");
    RegistryTree back;
    std::string error;
    ASSERT_TRUE(back.Deserialize(t.Serialize(), &error)) << error << "\n" << t.Serialize();
    EXPECT_EQ(back.Serialize(), t.Serialize());
    EXPECT_EQ(back.GetValue("HKCR\\key with ] and \"quotes\""),
              "back\\slash \"q\" line\nfeed\ttab\r");
    EXPECT_NE(back.OpenKey("HKCR\\Empty\\Leaf"), nullptr);
}

TEST(RegistryTree, MalformedTextIsAnErrorWithTheLine) {
    struct Case {
        const char* text;
        const char* line;
    };
    for (Case c :
         {Case{"@=\"x\"", "line 1"}, Case{"[HKCR\\A]\n\"n\"", "line 2"},
          Case{"[HKCR\\A\n", "line 1"}, Case{"[]", "line 1"},
          Case{"[HKCR\\A]\n@=\"unterminated", "line 2"}, Case{"[HKCR\\A]\n@=\"\\q\"", "line 2"},
          Case{"[HKCR\\A]\n@=\"x\" trailing", "line 2"}, Case{"[HKCR\\A]\nname=\"x\"", "line 2"},
          Case{"; ok\n\n[HKCR\\A]\r\n@=\"x\"\r\n[\\\\]", "line 5"}}) {
        RegistryTree t;
        std::string error;
        EXPECT_FALSE(t.Deserialize(c.text, &error)) << c.text;
        EXPECT_EQ(error.rfind(c.line, 0), 0u) << c.text << " -> " << error;
        EXPECT_TRUE(t.EnumSubkeys("HKCR").empty());
    }
}

class RegistryFile : public ::testing::Test {
  protected:
    void SetUp() override {
        char dir[] = "/tmp/qn-registry-XXXXXX";
        ASSERT_NE(mkdtemp(dir), nullptr);
        dir_ = dir;
        path_ = dir_ + "/sub/dir/registry";
    }
    void TearDown() override { std::system(("rm -rf '" + dir_ + "'").c_str()); }
    std::string dir_, path_;
};

TEST_F(RegistryFile, MissingFileIsEmptyAndUpdatesPersist) {
    RegistryTree t;
    ASSERT_TRUE(qn::com::LoadRegistryFile(path_, &t).ok);
    EXPECT_TRUE(t.EnumSubkeys("HKCR").empty());
    auto status = qn::com::UpdateRegistryFile(
        path_, [](RegistryTree& tree) { return tree.SetValue("HKCR\\Prog.Id\\CLSID", "", "{X}"); });
    ASSERT_TRUE(status.ok) << status.error;
    ASSERT_TRUE(qn::com::LoadRegistryFile(path_, &t).ok);
    EXPECT_EQ(t.GetValue("HKCR\\Prog.Id\\CLSID"), "{X}");
    // An abandoned change writes nothing.
    status = qn::com::UpdateRegistryFile(path_, [](RegistryTree& tree) {
        tree.DeleteTree("HKCR\\Prog.Id");
        return false;
    });
    ASSERT_TRUE(status.ok);
    ASSERT_TRUE(qn::com::LoadRegistryFile(path_, &t).ok);
    EXPECT_EQ(t.GetValue("HKCR\\Prog.Id\\CLSID"), "{X}");
}

TEST_F(RegistryFile, MalformedFileIsAnErrorAndIsNotOverwritten) {
    ASSERT_TRUE(qn::com::UpdateRegistryFile(path_, [](RegistryTree&) { return true; }).ok);
    std::ofstream(path_) << "[HKCR\\A]\ngarbage\n";
    RegistryTree t;
    auto status = qn::com::LoadRegistryFile(path_, &t);
    EXPECT_FALSE(status.ok);
    EXPECT_NE(status.error.find("line 2"), std::string::npos) << status.error;
    EXPECT_NE(status.error.find(path_), std::string::npos) << status.error;
    bool called = false;
    status = qn::com::UpdateRegistryFile(path_, [&](RegistryTree&) { return called = true; });
    EXPECT_FALSE(status.ok);
    EXPECT_FALSE(called);
    std::stringstream content;
    content << std::ifstream(path_).rdbuf();
    EXPECT_EQ(content.str(), "[HKCR\\A]\ngarbage\n");
}

TEST_F(RegistryFile, ConcurrentProcessesDoNotLoseUpdates) {
    constexpr int kProcesses = 4, kUpdates = 25;
    std::vector<pid_t> children;
    for (int p = 0; p < kProcesses; ++p) {
        pid_t pid = fork();
        ASSERT_GE(pid, 0);
        if (pid == 0) {
            for (int i = 0; i < kUpdates; ++i)
                if (!qn::com::UpdateRegistryFile(path_, [&](RegistryTree& t) {
                         return t.SetValue("HKCR\\Counter\\P" + std::to_string(p),
                                           std::to_string(i), "x");
                     }).ok)
                    _exit(1);
            _exit(0);
        }
        children.push_back(pid);
    }
    for (pid_t pid : children) {
        int status = 0;
        waitpid(pid, &status, 0);
        EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
    }
    RegistryTree t;
    ASSERT_TRUE(qn::com::LoadRegistryFile(path_, &t).ok);
    for (int p = 0; p < kProcesses; ++p) {
        const auto* key = t.OpenKey("HKCR\\Counter\\P" + std::to_string(p));
        ASSERT_NE(key, nullptr);
        EXPECT_EQ(key->values.size(), std::size_t(kUpdates));
    }
}

TEST(RegistryFilePath, EnvironmentOverridesTheDefault) {
    setenv("QN_REGISTRY_FILE", "/tmp/explicit-registry", 1);
    EXPECT_EQ(qn::com::RegistryFilePath(), "/tmp/explicit-registry");
    setenv("QN_REGISTRY_FILE", "", 1);
    setenv("XDG_CONFIG_HOME", "/tmp/xdg", 1);
    EXPECT_EQ(qn::com::RegistryFilePath(), "/tmp/xdg/quorlen731xx/registry");
    unsetenv("XDG_CONFIG_HOME");
    setenv("HOME", "/home/someone", 1);
    EXPECT_EQ(qn::com::RegistryFilePath(), "/home/someone/.config/quorlen731xx/registry");
    unsetenv("QN_REGISTRY_FILE");
}

}  // namespace
