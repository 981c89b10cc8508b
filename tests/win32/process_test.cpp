// Processes: starting programs, their handles, exit codes and ends, opening
// processes by identifier, the program's file names, the processor count and
// the version reported. Children are shell scripts here and cmd.exe batch
// files on Windows; a waiting child ends only when the test creates its 'go'
// file, so nothing depends on timing.
#include "support/temp_dir.h"
#include "support/wine.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <bitset>
#include <chrono>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#ifndef _WIN32
#include <csignal>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>
extern char** environ;
#endif

namespace {

const DWORD generous = 60000; // a wait that only a broken implementation exhausts

// The file name part of a path of either kind.
std::string LastPart(const std::string& path) {
    std::string::size_type separator = path.find_last_of("\\/");
    return separator == std::string::npos ? path : path.substr(separator + 1);
}

class ProcessTest : public ::testing::Test {
protected:
    ~ProcessTest() override {
        for (HANDLE handle : m_handles)
            CloseHandle(handle);
    }

    std::string Native(const std::string& name) const { return (m_dir.Path() / name).string(); }

    void Write(const std::string& name, const std::string& text, bool executable) const {
        std::ofstream(m_dir.Path() / name, std::ios::binary) << text;
        if (executable)
            std::filesystem::permissions(m_dir.Path() / name, std::filesystem::perms::owner_exec,
                                         std::filesystem::perm_options::add);
    }

    // The command line of a program that exits with code at once.
    static std::string ExitAtOnce(int code) {
#ifdef _WIN32
        return "cmd.exe /c exit " + std::to_string(code);
#else
        return "sh -c \"exit " + std::to_string(code) + "\"";
#endif
    }

    // The command line of a program that exits with 3 once Go() was called.
    std::string WaitForGo() const {
#ifdef _WIN32
        Write("wait.bat",
              "@echo off\r\n:wait\r\nif exist \"%~1\" exit 3\r\n"
              "ping -n 2 127.0.0.1 > nul\r\ngoto wait\r\n",
              false);
        // cmd.exe drops the first and the last quote of what follows /c.
        return "cmd.exe /c \"\"" + Native("wait.bat") + "\" \"" + Native("go") + "\"\"";
#else
        Write("wait.sh", "#!/bin/sh\nwhile [ ! -e \"$1\" ]; do sleep 0.05; done\nexit 3\n", true);
        return "\"" + Native("wait.sh") + "\" \"" + Native("go") + "\"";
#endif
    }
    void Go() const {
        Write("go", "", false);
    }

    // Starts a command line; the handles are closed with the test.
    PROCESS_INFORMATION Start(const std::string& commandLine) {
        STARTUPINFOA startup{};
        startup.cb = sizeof startup;
        PROCESS_INFORMATION started{};
        std::vector<char> line(commandLine.begin(), commandLine.end());
        line.push_back('\0');
        EXPECT_TRUE(CreateProcessA(nullptr, line.data(), nullptr, nullptr, FALSE,
                                   NORMAL_PRIORITY_CLASS, nullptr, nullptr, &startup, &started))
            << commandLine << ": error " << GetLastError();
        Keep(started.hProcess);
        Keep(started.hThread);
        return started;
    }

    // The error of a start that must fail.
    static DWORD StartError(const char* application, std::string commandLine) {
        STARTUPINFOA startup{};
        startup.cb = sizeof startup;
        PROCESS_INFORMATION started{};
        SetLastError(ERROR_SUCCESS);
        if (CreateProcessA(application, commandLine.data(), nullptr, nullptr, FALSE, 0, nullptr,
                           nullptr, &startup, &started)) {
            CloseHandle(started.hProcess);
            CloseHandle(started.hThread);
            return ERROR_SUCCESS;
        }
        return GetLastError();
    }

    HANDLE Keep(HANDLE handle) {
        if (handle)
            m_handles.push_back(handle);
        return handle;
    }

    static DWORD ExitCode(HANDLE process) {
        DWORD code = 0xDEADBEEF;
        EXPECT_TRUE(GetExitCodeProcess(process, &code)) << GetLastError();
        return code;
    }

    vaskel_test::TempDir m_dir;

private:
    std::vector<HANDLE> m_handles;
};

TEST_F(ProcessTest, AProgramThatEndsSignalsBothHandlesAndReportsItsExitCode) {
    PROCESS_INFORMATION child = Start(ExitAtOnce(3));
    ASSERT_NE(child.hProcess, nullptr);
    EXPECT_NE(child.dwProcessId, 0u);
    EXPECT_NE(child.dwThreadId, 0u);
    EXPECT_NE(child.dwProcessId, GetCurrentProcessId());
    ASSERT_EQ(WaitForSingleObject(child.hProcess, generous), WAIT_OBJECT_0);
    EXPECT_EQ(WaitForSingleObject(child.hProcess, 0), WAIT_OBJECT_0) << "stays signalled";
    EXPECT_EQ(ExitCode(child.hProcess), 3u);
    ASSERT_EQ(WaitForSingleObject(child.hThread, generous), WAIT_OBJECT_0);
    DWORD threadCode = 0;
    EXPECT_TRUE(GetExitCodeThread(child.hThread, &threadCode));
    EXPECT_EQ(threadCode, 3u);
}

TEST_F(ProcessTest, ARunningProgramIsStillActiveUntilItEnds) {
    PROCESS_INFORMATION child = Start(WaitForGo());
    ASSERT_NE(child.hProcess, nullptr);
    EXPECT_EQ(ExitCode(child.hProcess), static_cast<DWORD>(STILL_ACTIVE));
    EXPECT_EQ(WaitForSingleObject(child.hProcess, 0), static_cast<DWORD>(WAIT_TIMEOUT));

    // A second handle opened by identifier names the same process.
    HANDLE opened =
        Keep(OpenProcess(PROCESS_QUERY_INFORMATION | SYNCHRONIZE, FALSE, child.dwProcessId));
    ASSERT_NE(opened, nullptr) << GetLastError();
    EXPECT_EQ(ExitCode(opened), static_cast<DWORD>(STILL_ACTIVE));

    Go();
    ASSERT_EQ(WaitForSingleObject(opened, generous), WAIT_OBJECT_0);
    EXPECT_EQ(ExitCode(opened), 3u);
    EXPECT_EQ(WaitForSingleObject(child.hProcess, 0), WAIT_OBJECT_0);
    EXPECT_EQ(ExitCode(child.hProcess), 3u);
}

TEST_F(ProcessTest, WaitsForSeveralObjectsAndMessageWaitsSeeTheEnd) {
    PROCESS_INFORMATION child = Start(WaitForGo());
    ASSERT_NE(child.hProcess, nullptr);
    HANDLE event = Keep(CreateEventA(nullptr, TRUE, FALSE, nullptr));
    HANDLE both[] = {event, child.hProcess};
    EXPECT_EQ(WaitForMultipleObjects(2, both, FALSE, 0), static_cast<DWORD>(WAIT_TIMEOUT));
    EXPECT_EQ(MsgWaitForMultipleObjects(1, &child.hProcess, FALSE, 0, QS_ALLINPUT),
              static_cast<DWORD>(WAIT_TIMEOUT));

    std::thread releaser([this] { Go(); });
    DWORD result = MsgWaitForMultipleObjects(1, &child.hProcess, FALSE, generous, QS_ALLINPUT);
    releaser.join();
    EXPECT_EQ(result, WAIT_OBJECT_0);
    EXPECT_EQ(WaitForMultipleObjects(2, both, FALSE, 0), WAIT_OBJECT_0 + 1);
    SetEvent(event);
    EXPECT_EQ(WaitForMultipleObjects(2, both, TRUE, 0), WAIT_OBJECT_0);
}

// Starts, opens, waits for and closes processes from several threads at once:
// every wait ends with its own process's code.
TEST_F(ProcessTest, ThreadsStartAndWaitForProcessesAtOnce) {
    std::mutex lock;
    std::vector<std::string> wrong;
    auto report = [&](int code, const std::string& what) {
        std::lock_guard<std::mutex> hold(lock);
        wrong.push_back("exit " + std::to_string(code) + ": " + what);
    };
    std::vector<std::thread> threads;
    for (int t = 0; t < 3; ++t) {
        threads.emplace_back([t, &report] {
            for (int i = 0; i < 4; ++i) {
                const int code = 10 * t + i;
                std::string line = ExitAtOnce(code);
                STARTUPINFOA startup{};
                startup.cb = sizeof startup;
                PROCESS_INFORMATION child{};
                if (!CreateProcessA(nullptr, line.data(), nullptr, nullptr, FALSE, 0, nullptr,
                                    nullptr, &startup, &child)) {
                    report(code, "not started, error " + std::to_string(GetLastError()));
                    continue;
                }
                HANDLE opened =
                    OpenProcess(SYNCHRONIZE | PROCESS_QUERY_INFORMATION, FALSE, child.dwProcessId);
                DWORD first = 0, second = 0;
                if (!opened)
                    report(code, "not opened, error " + std::to_string(GetLastError()));
                else if (WaitForSingleObject(opened, generous) != WAIT_OBJECT_0)
                    report(code, "the wait did not end");
                else if (!GetExitCodeProcess(opened, &first) ||
                         !GetExitCodeProcess(child.hProcess, &second))
                    report(code, "no exit code");
                else if (first != static_cast<DWORD>(code) || second != first)
                    report(code, "ended with " + std::to_string(first) + " and " +
                                     std::to_string(second));
                if (opened)
                    CloseHandle(opened);
                CloseHandle(child.hThread);
                CloseHandle(child.hProcess);
            }
        });
    }
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_TRUE(wrong.empty()) << ::testing::PrintToString(wrong);
}

TEST_F(ProcessTest, TerminateProcessEndsItWithTheCodeGiven) {
    PROCESS_INFORMATION child = Start(WaitForGo());
    ASSERT_NE(child.hProcess, nullptr);
    EXPECT_TRUE(TerminateProcess(child.hProcess, 7));
    ASSERT_EQ(WaitForSingleObject(child.hProcess, generous), WAIT_OBJECT_0);
    EXPECT_EQ(ExitCode(child.hProcess), 7u);
    if (!vaskel_test::RunningOnWine()) { // Wine 8 "terminates" an ended process again
        SetLastError(ERROR_SUCCESS);
        EXPECT_FALSE(TerminateProcess(child.hProcess, 8)) << "it has ended already";
        EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_ACCESS_DENIED));
    }
    EXPECT_EQ(ExitCode(child.hProcess), 7u);
}

// Why a still-active exit code alone does not prove that a process runs.
TEST_F(ProcessTest, AnEndedProcessMayReportTheStillActiveCode) {
    PROCESS_INFORMATION child = Start(WaitForGo());
    ASSERT_NE(child.hProcess, nullptr);
    EXPECT_TRUE(TerminateProcess(child.hProcess, STILL_ACTIVE));
    ASSERT_EQ(WaitForSingleObject(child.hProcess, generous), WAIT_OBJECT_0);
    EXPECT_EQ(ExitCode(child.hProcess), static_cast<DWORD>(STILL_ACTIVE));
}

TEST_F(ProcessTest, AProgramThatCannotRunFailsAtOnce) {
    EXPECT_EQ(StartError(nullptr, "vaskel-no-such-program --flag"),
              static_cast<DWORD>(ERROR_FILE_NOT_FOUND));
    const std::string missing = m_dir.File("missing.exe");
    EXPECT_EQ(StartError(missing.c_str(), missing), static_cast<DWORD>(ERROR_FILE_NOT_FOUND));
    // Text is no program.
    Write("text.exe", "this is not a program\n", true);
    const std::string text = m_dir.File("text.exe");
    EXPECT_EQ(StartError(text.c_str(), text), static_cast<DWORD>(ERROR_BAD_EXE_FORMAT));
}

TEST_F(ProcessTest, OpenProcessRefusesIdentifiersThatNameNoProcess) {
    for (DWORD id : {0u, 0x7FFFFFFCu}) {
        SetLastError(ERROR_SUCCESS);
        EXPECT_EQ(OpenProcess(PROCESS_QUERY_INFORMATION, FALSE, id), nullptr) << id;
        EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_PARAMETER)) << id;
    }
}

TEST_F(ProcessTest, TheCurrentProcessIsStillActive) {
    HANDLE self = Keep(
        OpenProcess(PROCESS_QUERY_LIMITED_INFORMATION | SYNCHRONIZE, FALSE, GetCurrentProcessId()));
    ASSERT_NE(self, nullptr);
    for (HANDLE handle : {self, GetCurrentProcess()}) {
        EXPECT_EQ(ExitCode(handle), static_cast<DWORD>(STILL_ACTIVE));
        EXPECT_EQ(WaitForSingleObject(handle, 0), static_cast<DWORD>(WAIT_TIMEOUT));
    }
}

TEST_F(ProcessTest, FileNamesNameTheProgram) {
    char module[MAX_PATH] = "";
    DWORD length = GetModuleFileNameExA(GetCurrentProcess(), nullptr, module, MAX_PATH);
    ASSERT_GT(length, 0u) << GetLastError();
    EXPECT_EQ(length, std::strlen(module));
    const std::string program = LastPart(module);
    EXPECT_EQ(program.rfind("win32_tests", 0), 0u) << module;

    char same[MAX_PATH] = "";
    EXPECT_EQ(GetModuleFileNameExA(GetCurrentProcess(), GetModuleHandleA(nullptr), same, MAX_PATH),
              length);
    EXPECT_STREQ(same, module);

    char image[MAX_PATH] = "";
    DWORD imageLength = GetProcessImageFileNameA(GetCurrentProcess(), image, MAX_PATH);
    ASSERT_GT(imageLength, 0u) << GetLastError();
    EXPECT_EQ(LastPart(image), program) << "a device path on Windows, the same file";

    // Cut to the buffer, with its NUL; the image name is not cut.
    char shortBuffer[5] = "xxxx";
    DWORD cut = GetModuleFileNameExA(GetCurrentProcess(), nullptr, shortBuffer, 5);
    EXPECT_EQ(std::string(shortBuffer), std::string(module, 4));
    if (!vaskel_test::RunningOnWine()) { // Wine counts the NUL, as GetModuleFileNameA does
        EXPECT_EQ(cut, 4u);
    }
    SetLastError(ERROR_SUCCESS);
    EXPECT_EQ(GetProcessImageFileNameA(GetCurrentProcess(), shortBuffer, 5), 0u);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INSUFFICIENT_BUFFER));

    PROCESS_INFORMATION child = Start(WaitForGo());
    ASSERT_NE(child.hProcess, nullptr);
    // The program of a process just started: a module list may not exist yet.
    char childProgram[MAX_PATH] = "";
    EXPECT_GT(GetProcessImageFileNameA(child.hProcess, childProgram, MAX_PATH), 0u)
        << GetLastError();
    Go();
    EXPECT_EQ(WaitForSingleObject(child.hProcess, generous), WAIT_OBJECT_0);
}

TEST(SystemInfoTest, CountsTheLogicalProcessors) {
    SYSTEM_INFO info{};
    GetSystemInfo(&info);
    EXPECT_GE(info.dwNumberOfProcessors, 1u);
    if (unsigned hardware = std::thread::hardware_concurrency()) {
        EXPECT_EQ(info.dwNumberOfProcessors, std::min<unsigned>(hardware, sizeof(DWORD_PTR) * 8));
    }
    EXPECT_EQ(std::bitset<sizeof(DWORD_PTR) * 8>(info.dwActiveProcessorMask).count(),
              info.dwNumberOfProcessors);
    EXPECT_GT(info.dwPageSize, 0u);
    EXPECT_EQ(info.dwPageSize & (info.dwPageSize - 1), 0u) << "a power of two";
}

TEST(SystemInfoTest, TheVersionIsWindows7OrLaterAndTheSizeFieldIsChecked) {
    OSVERSIONINFOA version{};
    for (DWORD size : {DWORD{0}, DWORD{sizeof version - 1}, DWORD{200}}) {
        version.dwOSVersionInfoSize = size;
        SetLastError(ERROR_SUCCESS);
        EXPECT_FALSE(GetVersionExA(&version)) << size;
        EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INSUFFICIENT_BUFFER)) << size;
    }
    version.dwOSVersionInfoSize = sizeof version;
    ASSERT_TRUE(GetVersionExA(&version));
    EXPECT_EQ(version.dwPlatformId, static_cast<DWORD>(VER_PLATFORM_WIN32_NT));
    EXPECT_TRUE(version.dwMajorVersion > 6 ||
                (version.dwMajorVersion == 6 && version.dwMinorVersion >= 1));

    OSVERSIONINFOEXA extended{};
    extended.dwOSVersionInfoSize = sizeof extended;
    ASSERT_TRUE(GetVersionExA(reinterpret_cast<LPOSVERSIONINFOA>(&extended)));
    EXPECT_EQ(extended.dwMajorVersion, version.dwMajorVersion);
    EXPECT_EQ(extended.dwMinorVersion, version.dwMinorVersion);
    EXPECT_EQ(extended.dwBuildNumber, version.dwBuildNumber);
    EXPECT_EQ(extended.wProductType, VER_NT_WORKSTATION);
#ifndef _WIN32
    EXPECT_EQ(version.dwMajorVersion, 6u);
    EXPECT_EQ(version.dwMinorVersion, 1u);
    EXPECT_EQ(version.dwBuildNumber, 7601u);
    EXPECT_STREQ(version.szCSDVersion, "Service Pack 1");
    EXPECT_EQ(extended.wServicePackMajor, 1u);
#endif
}

#ifndef _WIN32
// How the POSIX processes behave where Windows has nothing to compare with.

TEST_F(ProcessTest, ArgumentsAreSplitAsAWindowsProgramSplitsThem) {
    Write("args.sh", "#!/bin/sh\nprintf '%s\\n' \"$0\" \"$@\" > \"$0.out\"\n", true);
    const std::string script = Native("args.sh");
    // Leading blanks are skipped; a tab separates like a space.
    PROCESS_INFORMATION child = Start("  \"" + script + "\" plain \"two words\"\ttab " +
                                      R"(a\b a\\\"b "c\\" d"e f"g "h""i "" \\\\"j k" end)");
    ASSERT_NE(child.hProcess, nullptr);
    ASSERT_EQ(WaitForSingleObject(child.hProcess, generous), WAIT_OBJECT_0);
    std::ifstream output(script + ".out");
    std::vector<std::string> arguments;
    for (std::string line; std::getline(output, line);)
        arguments.push_back(line);
    const std::vector<std::string> expected = {script,   "plain",   "two words", "tab",
                                               R"(a\b)", R"(a\"b)", R"(c\)",     "de fg",
                                               R"(h"i)", "",        R"(\\j k)",  "end"};
    EXPECT_EQ(arguments, expected);
}

TEST_F(ProcessTest, BackslashPathsNameTheProgramAndPathIsSearched) {
    Write("exit4.sh", "#!/bin/sh\nexit 4\n", true);
    const std::string backslashed = m_dir.File("exit4.sh");
    ASSERT_NE(backslashed.find('\\'), std::string::npos);
    PROCESS_INFORMATION byName = Start(backslashed + " first");
    STARTUPINFOA startup{};
    startup.cb = sizeof startup;
    PROCESS_INFORMATION byModule{};
    char line[] = "exit4 first";
    ASSERT_TRUE(CreateProcessA(backslashed.c_str(), line, nullptr, nullptr, FALSE, 0, nullptr,
                               nullptr, &startup, &byModule));
    Keep(byModule.hProcess);
    Keep(byModule.hThread);
    for (HANDLE process : {byName.hProcess, byModule.hProcess}) {
        ASSERT_EQ(WaitForSingleObject(process, generous), WAIT_OBJECT_0);
        EXPECT_EQ(ExitCode(process), 4u);
    }
    // A module name is used as it is, never searched for.
    EXPECT_EQ(StartError("sh", "sh -c true"), static_cast<DWORD>(ERROR_FILE_NOT_FOUND));
}

TEST_F(ProcessTest, UnsupportedRequestsFailWithoutAProcess) {
    STARTUPINFOA startup{};
    startup.cb = sizeof startup;
    PROCESS_INFORMATION started{};
    char line[] = "sh -c true";
    char environment[] = "A=1\0";
    EXPECT_FALSE(CreateProcessA(nullptr, line, nullptr, nullptr, FALSE, CREATE_SUSPENDED, nullptr,
                                nullptr, &startup, &started));
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_NOT_SUPPORTED));
    EXPECT_FALSE(CreateProcessA(nullptr, line, nullptr, nullptr, FALSE, 0, environment, nullptr,
                                &startup, &started));
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_NOT_SUPPORTED));
    EXPECT_FALSE(CreateProcessA(nullptr, line, nullptr, nullptr, FALSE, 0, nullptr, "/", &startup,
                                &started));
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_NOT_SUPPORTED));
    EXPECT_EQ(started.hProcess, nullptr);
    EXPECT_EQ(StartError(nullptr, "   "), static_cast<DWORD>(ERROR_INVALID_PARAMETER));
}

TEST_F(ProcessTest, AChildEndedByASignalReports128PlusTheSignal) {
    PROCESS_INFORMATION child = Start("sh -c \"kill -TERM $$\"");
    ASSERT_NE(child.hProcess, nullptr);
    ASSERT_EQ(WaitForSingleObject(child.hProcess, generous), WAIT_OBJECT_0);
    EXPECT_EQ(ExitCode(child.hProcess), 128u + SIGTERM);
}

TEST_F(ProcessTest, AChildWhoseHandlesAreClosedIsReapedWhenItEnds) {
    PROCESS_INFORMATION child = Start(ExitAtOnce(0));
    ASSERT_NE(child.hProcess, nullptr);
    const pid_t pid = static_cast<pid_t>(child.dwProcessId);
    EXPECT_TRUE(CloseHandle(child.hProcess));
    EXPECT_TRUE(CloseHandle(child.hThread));
    // A zombie still answers kill(pid, 0); a reaped process does not.
    auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(generous);
    while (::kill(pid, 0) == 0 && std::chrono::steady_clock::now() < deadline)
        Sleep(10);
    EXPECT_EQ(::kill(pid, 0), -1);
    EXPECT_EQ(errno, ESRCH);
}

TEST_F(ProcessTest, AProcessThatAnotherStartedIsWatchedButNeverReaped) {
    char shell[] = "sh";
    char option[] = "-c";
    char command[] = "exit 5";
    char* argv[] = {shell, option, command, nullptr};
    pid_t pid = 0;
    ASSERT_EQ(::posix_spawnp(&pid, "sh", nullptr, nullptr, argv, environ), 0);
    HANDLE process =
        Keep(OpenProcess(SYNCHRONIZE | PROCESS_QUERY_INFORMATION, FALSE, static_cast<DWORD>(pid)));
    ASSERT_NE(process, nullptr) << GetLastError();
    ASSERT_EQ(WaitForSingleObject(process, generous), WAIT_OBJECT_0);
    // Only its parent, the test, learns how it ended.
    DWORD code = 0;
    SetLastError(ERROR_SUCCESS);
    EXPECT_FALSE(GetExitCodeProcess(process, &code));
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_ACCESS_DENIED));
    int status = 0;
    ASSERT_EQ(::waitpid(pid, &status, 0), pid);
    EXPECT_TRUE(WIFEXITED(status));
    EXPECT_EQ(WEXITSTATUS(status), 5);
}

TEST_F(ProcessTest, AnotherProcessCanBeOpenedAndAskedAbout) {
    HANDLE parent = Keep(OpenProcess(PROCESS_QUERY_INFORMATION | SYNCHRONIZE, FALSE,
                                     static_cast<DWORD>(::getppid())));
    ASSERT_NE(parent, nullptr) << GetLastError();
    EXPECT_EQ(ExitCode(parent), static_cast<DWORD>(STILL_ACTIVE));
    EXPECT_EQ(WaitForSingleObject(parent, 0), static_cast<DWORD>(WAIT_TIMEOUT));
    char module[MAX_PATH] = "";
    EXPECT_GT(GetModuleFileNameExA(parent, nullptr, module, MAX_PATH), 0u) << GetLastError();
    SetLastError(ERROR_SUCCESS);
    EXPECT_EQ(GetModuleFileNameExA(parent, GetModuleHandleA(nullptr), module, MAX_PATH), 0u)
        << "module handles are this process's";
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_HANDLE));
}
#endif

} // namespace
