// Processes, the environment and the version tests. The programs started
// are shell scripts here and cmd.exe batch files on Windows; a waiting
// program ends only when the test creates its 'go' file, and its end is
// polled with a generous deadline.
#include "fs/os_version.h"
#include "support/temp_dir.h"

#include <vaskel/fs.h>

#include <gtest/gtest.h>

#include <chrono>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>

using namespace vaskel;

namespace {

#ifdef _WIN32
const char* const programName = "fs_tests.exe";
#else
const char* const programName = "fs_tests";
#endif

class ProcessTest : public ::testing::Test {
protected:
    std::string Native(const std::string& name) const { return (m_dir.Path() / name).string(); }

    // The program that exits with 3 once Go() was called: its path (with
    // backslashes) and the arguments it needs.
    std::string WaitingProgram() const {
#ifdef _WIN32
        std::ofstream(m_dir.Path() / "wait.bat", std::ios::binary)
            << "@echo off\r\n:wait\r\nif exist \"%~1\" exit 3\r\n"
               "ping -n 2 127.0.0.1 > nul\r\ngoto wait\r\n";
        return m_dir.File("wait.bat");
#else
        std::ofstream(m_dir.Path() / "wait.sh")
            << "#!/bin/sh\nwhile [ ! -e \"$1\" ]; do sleep 0.05; done\nexit 3\n";
        std::filesystem::permissions(m_dir.Path() / "wait.sh", std::filesystem::perms::owner_exec,
                                     std::filesystem::perm_options::add);
        return m_dir.File("wait.sh");
#endif
    }
    std::string GoArgument() const {
        return "\"" + Native("go") + "\"";
    }
    // A whole command line that runs the waiting program.
    std::string WaitingCommandLine() const {
#ifdef _WIN32
        // cmd.exe drops the first and the last quote of what follows /c.
        return "cmd.exe /c \"\"" + WaitingProgram() + "\" " + GoArgument() + "\"";
#else
        return "\"" + WaitingProgram() + "\" " + GoArgument();
#endif
    }
    void Go() const {
        std::ofstream(m_dir.Path() / "go") << "";
    }

    // Whether the process stops running before a deadline no working
    // system misses.
    static bool EndsInTime(DWORD processId) {
        auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(60);
        while (Process::IsRunning(processId)) {
            if (std::chrono::steady_clock::now() > deadline)
                return false;
            Sleep(20);
        }
        return true;
    }

    vaskel_test::TempDir m_dir;
};

TEST_F(ProcessTest, AnExecutedProgramRunsUntilItEnds) {
    DWORD pid = 0;
    ASSERT_TRUE(Process::Execute(nullptr, WaitingCommandLine().c_str(), pid));
    EXPECT_NE(pid, 0u);
    EXPECT_NE(pid, GetCurrentProcessId());
    EXPECT_TRUE(Process::IsRunning(pid));
    Go();
    EXPECT_TRUE(EndsInTime(pid));
}

TEST_F(ProcessTest, TheApplicationAndItsArgumentsMakeTheCommandLine) {
#ifdef _WIN32
    const char* shell = std::getenv("ComSpec");
    ASSERT_NE(shell, nullptr);
    const std::string application = shell;
    const std::string arguments = "/c \"\"" + WaitingProgram() + "\" " + GoArgument() + "\"";
#else
    const std::string application = WaitingProgram();
    const std::string arguments = GoArgument();
#endif
    DWORD pid = 0;
    ASSERT_TRUE(Process::Execute(application.c_str(), arguments.c_str(), pid));
    EXPECT_TRUE(Process::IsRunning(pid));
    // It ends only if it was given the 'go' file's path.
    Go();
    EXPECT_TRUE(EndsInTime(pid));
}

TEST_F(ProcessTest, AMissingProgramLeavesTheIdentifierAlone) {
    DWORD pid = 12345;
    EXPECT_FALSE(Process::Execute(nullptr, "vaskel-no-such-program -a 1", pid));
    EXPECT_FALSE(Process::Execute(m_dir.File("missing.exe").c_str(), "-a 1", pid));
    EXPECT_EQ(pid, 12345u);
}

TEST_F(ProcessTest, NoProcessRunsUnderIdentifierZeroAndThisOneRuns) {
    EXPECT_FALSE(Process::IsRunning(0));
    EXPECT_TRUE(Process::IsRunning(GetCurrentProcessId()));
}

TEST_F(ProcessTest, AProcessThatEndedWithTheStillActiveCodeDoesNotRun) {
    DWORD pid = 0;
    ASSERT_TRUE(Process::Execute(nullptr, WaitingCommandLine().c_str(), pid));
    // Held open, so that the ended process can still be opened and asked.
    HANDLE process = OpenProcess(PROCESS_TERMINATE | SYNCHRONIZE, FALSE, pid);
    ASSERT_NE(process, nullptr);
    EXPECT_TRUE(TerminateProcess(process, STILL_ACTIVE));
    EXPECT_EQ(WaitForSingleObject(process, 60000), WAIT_OBJECT_0);
    EXPECT_FALSE(Process::IsRunning(pid));
    CloseHandle(process);
}

TEST(ProcessNamesTest, TheModuleAndImageNamesAreTheTestProgramsName) {
    EXPECT_STREQ(Process::GetModuleName(nullptr), programName);
    EXPECT_STREQ(Process::GetModuleNameNoExtension(nullptr), "fs_tests");
    EXPECT_STREQ(Process::GetModuleName(GetModuleHandleA(nullptr)), programName);
    EXPECT_STREQ(Process::GetBaseName(), programName);
    EXPECT_STREQ(Process::GetBaseNameNoExtension(), "fs_tests");

    const CString path = Process::GetModulePath(nullptr);
    ASSERT_GT(path.GetLength(), static_cast<int>(std::strlen(programName)));
    EXPECT_STREQ(static_cast<const char*>(path) + path.GetLength() - std::strlen(programName),
                 programName);
    EXPECT_TRUE(std::filesystem::exists(static_cast<const char*>(path)));
}

TEST(ProcessNamesTest, LongAndShortFormsNameExistingPathsOnly) {
    vaskel_test::TempDir dir;
    const std::string file = dir.File("a long file name.text");
    std::ofstream(dir.Path() / "a long file name.text") << "x";
    const CString longForm = Process::GetLongPath(file.c_str());
    const CString shortForm = Process::GetShortPath(file.c_str());
    ASSERT_FALSE(longForm.IsEmpty());
    ASSERT_FALSE(shortForm.IsEmpty());
    EXPECT_EQ(Process::GetLongPath(shortForm).CompareNoCase(longForm), 0);
#ifndef _WIN32
    EXPECT_STREQ(longForm, file.c_str()) << "no short names here";
    EXPECT_STREQ(shortForm, file.c_str());
#endif
    const std::string missing = dir.File("missing");
    EXPECT_TRUE(Process::GetLongPath(missing.c_str()).IsEmpty());
    EXPECT_TRUE(Process::GetShortPath(missing.c_str()).IsEmpty());
}

#ifndef _WIN32
// Windows' classic path functions refuse such a path before any buffer.
TEST(ProcessNamesTest, AFormThatDoesNotFitTheBufferIsNoForm) {
    vaskel_test::TempDir dir;
    std::filesystem::path deep = dir.Path();
    for (int level = 0; level < 3; ++level)
        deep /= std::string(100, 'd');
    std::filesystem::create_directories(deep);
    ASSERT_GT(deep.string().size(), static_cast<std::size_t>(MAX_PATH));
    EXPECT_TRUE(Process::GetLongPath(deep.string().c_str()).IsEmpty());
    EXPECT_TRUE(Process::GetShortPath(deep.string().c_str()).IsEmpty());
}
#endif

TEST(EnvironmentTest, CountsTheLogicalProcessors) {
    SYSTEM_INFO info{};
    GetSystemInfo(&info);
    EXPECT_GE(Environment::GetLogicalProcessorCount(), 1u);
    EXPECT_EQ(Environment::GetLogicalProcessorCount(), info.dwNumberOfProcessors);
}

TEST(OsVersionTest, TheLayersAndTheSystemsHereAreWindows7OrLater) {
    EXPECT_TRUE(IsWindows2KOrBetter());
    EXPECT_TRUE(IsWindows7OrBetter());
    EXPECT_TRUE(IsWindows7OrBetter()) << "the cached answer";
}

TEST(OsVersionTest, TheRuleComparesMajorThenMinor) {
    using detail::IsVersionAtLeast;
    EXPECT_FALSE(IsVersionAtLeast(6, 0, 6, 1)) << "Vista";
    EXPECT_TRUE(IsVersionAtLeast(6, 1, 6, 1));
    EXPECT_TRUE(IsVersionAtLeast(6, 2, 6, 1));
    EXPECT_TRUE(IsVersionAtLeast(10, 0, 6, 1)) << "a newer major with minor 0";
    EXPECT_TRUE(IsVersionAtLeast(5, 0, 5, 0));
    EXPECT_FALSE(IsVersionAtLeast(4, 90, 5, 0)) << "Windows Me's 4.90";
}

} // namespace
