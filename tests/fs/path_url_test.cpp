// CPathUrl: comparisons without case, the parts of a path, parents, node
// walks (ending on every text), validity, appending and existence.
#include "support/temp_dir.h"

#include <vaskel/fs.h>

#include <gtest/gtest.h>

#include <cstring>
#include <fstream>
#include <string>
#include <utility>
#include <vector>

using namespace vaskel;

namespace {

using Nodes = std::vector<std::string>;

// Every node of a walk; a walk that has not ended after 100 steps is cut
// short and fails the comparison.
Nodes Walk(const CPathUrl& path) {
    Nodes nodes;
    POSITION pos = path.GetFirstNodePosition();
    for (int step = 0; pos != nullptr && step < 100; ++step) {
        CString node;
        CString& same = path.GetNextNodePosition(pos, node);
        EXPECT_EQ(&same, &node);
        EXPECT_EQ(static_cast<size_t>(node.GetLength()), std::strlen(node));
        nodes.push_back(node.GetString());
    }
    if (pos != nullptr)
        nodes.push_back("<no end>");
    return nodes;
}

TEST(PathUrl, ComparesWithoutCase) {
    const CPathUrl data(CString("C:\\Data"));
    EXPECT_TRUE(data == "c:\\data");
    EXPECT_TRUE(data == CString("C:\\DATA"));
    EXPECT_TRUE(data == CPathUrl(CString("c:\\dAta")));
    EXPECT_TRUE(data != "c:\\data2");
    EXPECT_FALSE(data != CPathUrl(CString("C:\\data")));
    EXPECT_TRUE(CPathUrl(CString("a")) < "B");
    EXPECT_FALSE(CPathUrl(CString("b")) < "A");
    EXPECT_FALSE(CPathUrl(CString("a")) < "A");
}

TEST(PathUrl, Parts) {
    const CPathUrl path(CString("C:\\a\\f.txt"));
    CString drive, directory, name, extension;
    path.Split(&drive, &directory, &name, &extension);
    EXPECT_EQ(drive + "|" + directory + "|" + name + "|" + extension, "C:|\\a\\|f|.txt");
    name.Empty();
    path.Split(nullptr, nullptr, &name, nullptr); // null outputs are skipped
    EXPECT_EQ(name, "f");
    EXPECT_EQ(path.GetDrive() + path.GetDirectory() + path.GetName() + path.GetExtension(),
              "C:\\a\\f.txt");
    EXPECT_TRUE(path.HasDrive());
    EXPECT_FALSE(CPathUrl(CString("\\a\\f.txt")).HasDrive());
    EXPECT_EQ(path.GetFileName(), "f.txt");
    EXPECT_EQ(path.GetFilePath(), "C:\\a\\");
    EXPECT_EQ(CPathUrl(CString("readme")).GetFilePath(), "");
}

TEST(PathUrl, ParentIsEverythingBeforeTheLastBackslash) {
    const std::pair<const char*, const char*> cases[] = {
        {"C:\\a\\b", "C:\\a"},
        {"C:\\a\\", "C:\\a"},
        {"C:\\a", "C:"},
        {"C:\\", "C:"},
        {"a", ""},
        {"", ""},
        {"\\a", ""},
        {"a/b", ""},
    };
    for (const auto& [text, parent] : cases)
        EXPECT_EQ(CPathUrl(CString(text)).GetParentUrl().GetUrl(), parent) << text;
}

TEST(PathUrl, NodeWalksEndOnEveryText) {
    const std::pair<const char*, Nodes> cases[] = {
        {"C:\\a\\b", {"C:", "a", "b"}},
        {"a\\\\b", {"a", "", "b"}},
        {"\\a", {"", "a"}},
        // Every backslash ends a node, the last one too.
        {"C:\\a\\", {"C:", "a", ""}},
        {"a\\\\", {"a", "", ""}},
        {"\\", {"", ""}},
        {"plain", {"plain"}},
        {"", {}},
    };
    for (const auto& [text, nodes] : cases)
        EXPECT_EQ(Walk(CPathUrl(CString(text))), nodes) << text;
}

TEST(PathUrl, WalkPositions) {
    const CPathUrl path(CString("C:\\a\\b"));
    POSITION pos = path.GetFirstNodePosition();
    EXPECT_EQ(reinterpret_cast<INT_PTR>(pos), -1);
    EXPECT_EQ(path.GetNextNodePosition(pos), "C:");
    EXPECT_EQ(reinterpret_cast<INT_PTR>(pos), 3);
    EXPECT_EQ(path.GetNextNodePosition(pos), "a");
    EXPECT_EQ(path.GetNextNodePosition(pos), "b");
    EXPECT_EQ(pos, nullptr);
    // A finished walk stays finished.
    EXPECT_EQ(path.GetNextNodePosition(pos), "");
    EXPECT_EQ(pos, nullptr);
    // A position past the end starts again at the first node.
    pos = reinterpret_cast<POSITION>(static_cast<INT_PTR>(100));
    EXPECT_EQ(path.GetNextNodePosition(pos), "C:");
    EXPECT_EQ(CPathUrl().GetFirstNodePosition(), nullptr);
}

TEST(PathUrl, Validity) {
    const std::pair<const char*, bool> cases[] = {
        {"C:\\temp\\file.txt", true},
        {"\\\\server\\share\\x", true},
        {"C:\\a\\", true},
        {"a\\\\b", true},
        {"C:", true},
        {"relative\\name", true},
        {"", false},
        {"C:\\te*mp\\file.txt", false},
        {"C:\\temp\\a:b", false},
        {"dir/file", false},
        {"a\\b?", false},
        {"a\\\"b\"", false},
        {"a\\<b", false},
        {"a\\b>", false},
        {"a|b", false},
        // Only the drive itself may hold the colon.
        {"C:te*mp\\x", false},
        {"C:a:b", false},
        {"a:\\b", true},
    };
    for (const auto& [text, valid] : cases)
        EXPECT_EQ(CPathUrl(CString(text)).IsValid(), valid) << text;
}

TEST(PathUrl, AddChildAndExtensionKeepTheText) {
    CPathUrl path(CString("C:\\a"));
    EXPECT_TRUE(path.AddChild("x"));
    EXPECT_EQ(path.GetUrl(), "C:\\a\\x");
    path = "C:\\a\\";
    EXPECT_TRUE(path.AddChild("x"));
    EXPECT_EQ(path.GetUrl(), "C:\\a\\x");
    path = "C:\\a";
    EXPECT_FALSE(path.AddChild("x?"));
    EXPECT_EQ(path.GetUrl(), "C:\\a\\x?");

    path = "C:\\a\\f";
    EXPECT_TRUE(path.AddExtension("txt"));
    EXPECT_EQ(path.GetUrl(), "C:\\a\\f.txt");
    path = "C:\\a\\f";
    EXPECT_TRUE(path.AddExtension(".txt"));
    EXPECT_EQ(path.GetUrl(), "C:\\a\\f.txt");
    EXPECT_FALSE(path.AddExtension("t|t"));
    EXPECT_EQ(path.GetUrl(), "C:\\a\\f.txt.t|t");
}

TEST(PathUrl, Exists) {
    vaskel_test::TempDir dir;
    std::ofstream(dir.Path() / "file") << "x";
    const CString root(dir.Win32Path().c_str());
    EXPECT_TRUE(CPathUrl(root).Exists());
    EXPECT_TRUE(CPathUrl(root + "\\file").Exists());
    EXPECT_FALSE(CPathUrl(root + "\\gone").Exists());
    EXPECT_FALSE(CPathUrl().Exists());
    EXPECT_TRUE(CPathUrl(CString("file")).Exists(root));
    EXPECT_TRUE(CPathUrl(CString("file")).Exists(root + "\\"));
    EXPECT_FALSE(CPathUrl(CString("gone")).Exists(root));
}

} // namespace
