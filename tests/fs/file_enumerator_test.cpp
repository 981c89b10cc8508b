// FileEnumerator: depth-first pre-order walks, the pattern at every level,
// agreement with the standard library and with GetSubDirPathsRecurse, copies
// made in the middle of a walk, and directories that vanish during a walk.
#include "fs/fs_test_tree.h"

#include <vaskel/fs.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <set>
#include <string>
#include <vector>

using namespace vaskel;

namespace {

namespace fs = std::filesystem;
using Entries = std::vector<std::string>;

class FileEnumeratorTest : public ::testing::Test {
protected:
    // The path of the current entry below the root, backslash-separated.
    std::string Relative(const FileEnumerator& walk) const {
        const CString path = walk.Current().GetFilePath();
        const int skip = m_tree.Path().GetLength() + 1;
        EXPECT_EQ(path.Left(skip), m_tree.Path() + "\\");
        return path.Mid(skip).GetString();
    }
    // The rest of a walk, at most limit entries.
    Entries Rest(FileEnumerator& walk, size_t limit = 100000) const {
        Entries entries;
        while (entries.size() < limit && walk.MoveNext())
            entries.push_back(Relative(walk));
        return entries;
    }
    Entries Walk(const std::string& pattern, bool recursive) const {
        FileEnumerator walk(m_tree.Path(), pattern.c_str(), recursive);
        walk.Reset();
        return Rest(walk);
    }
    static Entries Sorted(Entries entries) {
        std::sort(entries.begin(), entries.end());
        return entries;
    }

    vaskel_test::TestTree m_tree;
};

TEST_F(FileEnumeratorTest, EmptyDirectoriesAndMissingRoots) {
    FileEnumerator walk(m_tree.Path(), "*", true);
    EXPECT_FALSE(walk.MoveNext()); // before Reset
    EXPECT_EQ(walk.Current().GetFileName(), "");
    walk.Reset();
    EXPECT_FALSE(walk.MoveNext()); // only "." and ".."
    EXPECT_FALSE(walk.MoveNext());
    walk.SetRoot(m_tree.Path("gone"));
    walk.Reset();
    EXPECT_FALSE(walk.MoveNext());
}

TEST_F(FileEnumeratorTest, DirectoriesComeBeforeTheirContent) {
    m_tree.Put("a\\f.txt", "12");
    EXPECT_EQ(Walk("*", true), (Entries{"a", "a\\f.txt"}));
    EXPECT_EQ(Walk("*", false), (Entries{"a"}));
    FileEnumerator walk(m_tree.Path(), "*", true);
    walk.Reset();
    ASSERT_TRUE(walk.MoveNext());
    EXPECT_TRUE(walk.Current().IsDirectory());
    ASSERT_TRUE(walk.MoveNext());
    EXPECT_FALSE(walk.Current().IsDirectory());
    EXPECT_EQ(walk.Current().GetLength(), 2u);
    EXPECT_FALSE(walk.MoveNext());
}

TEST_F(FileEnumeratorTest, PatternAppliesAtEveryLevel) {
    for (const char* file : {"a.txt", "b.log", "sub\\c.txt", "x.txt\\d.txt", "x.txt\\e.log"})
        m_tree.Put(file);
    // Only subdirectories whose own names match are entered.
    EXPECT_EQ(Sorted(Walk("*.txt", true)), (Entries{"a.txt", "x.txt", "x.txt\\d.txt"}));
    EXPECT_EQ(Sorted(Walk("*.TXT", false)), (Entries{"a.txt", "x.txt"}));
}

TEST_F(FileEnumeratorTest, AgreesWithTheStandardLibraryAndSubDirPaths) {
    ASSERT_TRUE(FileSystem::PopulateDirectoryTree(m_tree.Path(), 3, 3, 2, nullptr, nullptr));
    const Entries walked = Walk("*", true);
    Entries expected;
    for (const auto& entry : fs::recursive_directory_iterator(m_tree.Native(""))) {
        std::string relative = entry.path().lexically_relative(m_tree.Native("")).string();
        std::replace(relative.begin(), relative.end(), '/', '\\');
        expected.push_back(relative);
    }
    EXPECT_EQ(walked.size(), 3u + 9u + 27u + 2u * (1u + 3u + 9u + 27u));
    EXPECT_EQ(Sorted(walked), Sorted(expected));
    // Pre-order: every entry comes after its directory.
    std::set<std::string> seen;
    Entries directories;
    for (const std::string& entry : walked) {
        const size_t slash = entry.rfind('\\');
        if (slash != std::string::npos) {
            EXPECT_EQ(seen.count(entry.substr(0, slash)), 1u) << entry;
        }
        seen.insert(entry);
        if (fs::is_directory(m_tree.Native(entry)))
            directories.push_back(m_tree.Path(entry).GetString());
    }
    CStringArray paths;
    FileSystem::GetSubDirPathsRecurse(paths, m_tree.Path());
    Entries subDirs;
    for (INT_PTR i = 1; i < paths.GetSize(); ++i)
        subDirs.push_back(paths[i].GetString());
    EXPECT_EQ(paths[0], m_tree.Path());
    EXPECT_EQ(Sorted(subDirs), Sorted(directories));
}

TEST_F(FileEnumeratorTest, RootWithTrailingBackslash) {
    m_tree.Put("a\\b\\c");
    FileEnumerator walk(m_tree.Path() + "\\", "*", true);
    walk.Reset();
    EXPECT_EQ(Rest(walk), (Entries{"a", "a\\b", "a\\b\\c"}));
}

TEST_F(FileEnumeratorTest, ResetStartsAgain) {
    ASSERT_TRUE(FileSystem::PopulateDirectoryTree(m_tree.Path(), 2, 2, 1, nullptr, nullptr));
    FileEnumerator walk(m_tree.Path(), "*", true);
    walk.Reset();
    const Entries first = Rest(walk);
    walk.Reset();
    const Entries partly = Rest(walk, 3);
    walk.Reset();
    EXPECT_EQ(Rest(walk), first);
    EXPECT_EQ(partly, Entries(first.begin(), first.begin() + 3));
}

TEST_F(FileEnumeratorTest, CopiesMadeMidWalkStartAgainAndLeaveTheOriginalAlone) {
    ASSERT_TRUE(FileSystem::PopulateDirectoryTree(m_tree.Path(), 3, 2, 2, nullptr, nullptr));
    FileEnumerator walk(m_tree.Path(), "*", true);
    walk.Reset();
    const Entries all = Rest(walk);
    ASSERT_GT(all.size(), 10u);

    walk.Reset();
    const Entries head = Rest(walk, 5); // deep inside the first subdirectories
    {
        FileEnumerator copy(walk);
        EXPECT_EQ(copy.GetRoot(), walk.GetRoot());
        EXPECT_EQ(Rest(copy, 2), Entries(all.begin(), all.begin() + 2));
        FileEnumerator assigned;
        assigned = walk;
        EXPECT_EQ(Rest(assigned), all);
    } // the copies close their own searches only
    Entries whole = head;
    const Entries tail = Rest(walk);
    whole.insert(whole.end(), tail.begin(), tail.end());
    EXPECT_EQ(whole, all);

    // A finished walk copies as finished, one not started as not started.
    FileEnumerator finished(walk);
    EXPECT_FALSE(finished.MoveNext());
    FileEnumerator fresh(m_tree.Path(), "*", true);
    FileEnumerator copyOfFresh(fresh);
    EXPECT_FALSE(copyOfFresh.MoveNext());
    copyOfFresh.Reset();
    EXPECT_EQ(Rest(copyOfFresh), all);

    walk.Reset();
    Rest(walk, 4);
    const FileEnumerator& same = walk;
    walk = same; // assigning itself keeps the walk
    EXPECT_EQ(Rest(walk), Entries(all.begin() + 4, all.end()));
}

TEST_F(FileEnumeratorTest, VanishedSubdirectoryIsSkipped) {
    for (const char* file : {"a\\1", "b\\2", "c\\3"})
        m_tree.Put(file);
    FileEnumerator walk(m_tree.Path(), "*", true);
    walk.Reset();
    Entries entries;
    while (walk.MoveNext()) {
        const std::string entry = Relative(walk);
        entries.push_back(entry);
        // The walk has not yet entered this directory.
        if (entries.size() == 1)
            fs::remove_all(m_tree.Native(entry));
    }
    ASSERT_FALSE(entries.empty());
    EXPECT_EQ(entries.size(), 5u);
    for (const std::string& entry : entries)
        EXPECT_NE(entry.find(entries.front() + "\\"), 0u) << entry;
}

#ifndef _WIN32
// Windows needs a privilege to make symbolic links.
TEST_F(FileEnumeratorTest, LinksAreListedButNotEntered) {
    m_tree.Put("dir\\file");
    fs::create_directory_symlink(m_tree.Native(""), m_tree.Native("dir/loop"));
    EXPECT_EQ(Sorted(Walk("*", true)), (Entries{"dir", "dir\\file", "dir\\loop"}));
    // Searching and deleting go no further than the link itself.
    m_tree.Put("outside\\kept");
    m_tree.MakeDirectory("links");
    fs::create_directory_symlink(m_tree.Native("outside"), m_tree.Native("links/out"));
    EXPECT_FALSE(FileSystem::DirectoryHasFiles(m_tree.Path("links"), true));
    fs::create_directory_symlink(m_tree.Native("outside"), m_tree.Native("dir/out"));
    EXPECT_TRUE(FileSystem::DeleteDirectory(m_tree.Path("dir"), false));
    EXPECT_TRUE(FileSystem::DeleteDirectoryFiles(m_tree.Path("links"), "*", true));
    EXPECT_EQ(m_tree.Entries(), (Entries{"links/", "links/out/", "outside/", "outside/kept"}));
}
#endif

} // namespace
