// Processes: starting programs, opening running processes by identifier,
// their exit codes and their end. Process handles are waitable like the
// other kernel objects.
#pragma once

#include "types.h"
#include "winerror.h"

#define PROCESS_TERMINATE 0x0001u
#define PROCESS_QUERY_INFORMATION 0x0400u
#define PROCESS_QUERY_LIMITED_INFORMATION 0x1000u

#define NORMAL_PRIORITY_CLASS 0x00000020u

typedef struct _STARTUPINFOA {
    DWORD cb;
    LPSTR lpReserved;
    LPSTR lpDesktop;
    LPSTR lpTitle;
    DWORD dwX;
    DWORD dwY;
    DWORD dwXSize;
    DWORD dwYSize;
    DWORD dwXCountChars;
    DWORD dwYCountChars;
    DWORD dwFillAttribute;
    DWORD dwFlags;
    WORD wShowWindow;
    WORD cbReserved2;
    LPBYTE lpReserved2;
    HANDLE hStdInput;
    HANDLE hStdOutput;
    HANDLE hStdError;
} STARTUPINFOA, *LPSTARTUPINFOA;

typedef struct _PROCESS_INFORMATION {
    HANDLE hProcess;
    HANDLE hThread;
    DWORD dwProcessId;
    DWORD dwThreadId;
} PROCESS_INFORMATION, *PPROCESS_INFORMATION, *LPPROCESS_INFORMATION;

extern "C" {

// Starts a program in the background. The command line is split into the
// program's arguments by the rules a Windows program's runtime applies:
// white space separates arguments, double quotes group, 2n backslashes
// before a quote give n backslashes and a grouping quote, 2n + 1 give n and
// a literal quote, other backslashes are literal, and "" inside quotes is a
// literal quote that ends the quoted part; the first argument (the
// program's name) knows quotes only, and white space before it is skipped.
// The program is applicationName when given (used as it is, relative to the
// current directory), else the first argument, which without a directory
// part is looked for in the program's own directory, the current directory
// and then each directory of PATH. Backslashes in the program's path are
// separators. The new process has the caller's environment and current
// directory, no blocked and no ignored signals, and without inheritHandles
// no descriptor but the standard streams (0-2). Only the normal priority
// class is known; other flags, an environment block and a current directory
// fail with ERROR_NOT_SUPPORTED. The start-up information is not read. A
// program that cannot be run fails at once (ERROR_FILE_NOT_FOUND for a
// missing one) and no process remains.
//
// The thread identifier and handle name the new process's main thread (its
// identifier is the process identifier, as POSIX numbers it); the thread
// handle is signalled when the process ends and reports its exit code.
BOOL WINAPI CreateProcessA(LPCSTR applicationName, LPSTR commandLine,
                           LPSECURITY_ATTRIBUTES processAttributes,
                           LPSECURITY_ATTRIBUTES threadAttributes, BOOL inheritHandles,
                           DWORD creationFlags, LPVOID environment, LPCSTR currentDirectory,
                           LPSTARTUPINFOA startupInfo, LPPROCESS_INFORMATION processInformation);

// Any process of the system may be opened, and every handle may query, wait
// and try to terminate: access rights are not checked here (POSIX checks
// them when a signal is sent). Identifier 0 and one that names no process
// fail with ERROR_INVALID_PARAMETER. A process this process started is the
// same object as its creation handle's as long as any handle names it.
HANDLE WINAPI OpenProcess(DWORD desiredAccess, BOOL inheritHandle, DWORD processId);

// STILL_ACTIVE while the process runs. A process this process started
// reports its exit status (0-255), or 128 plus the signal number when a
// signal ended it, or the code given to TerminateProcess. Only the parent
// learns how a process ended: for any other process that has ended the call
// fails with ERROR_ACCESS_DENIED.
BOOL WINAPI GetExitCodeProcess(HANDLE process, LPDWORD exitCode);

// Ends the process at once (SIGKILL). A process that has ended already
// fails with ERROR_ACCESS_DENIED, as does one this user may not signal.
BOOL WINAPI TerminateProcess(HANDLE process, UINT exitCode);

} // extern "C"
