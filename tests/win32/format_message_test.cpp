// System error texts: the exact English texts, the caller's and the
// allocated buffer, inserts with and without arguments, and the failures for
// codes and languages without a text; and local memory, which holds an
// allocated text.
#include "support/wine.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cstdarg>
#include <cstring>
#include <string>

namespace {

const DWORD untouched = 0xDEADBEEF; // set before a call whose last error is checked
const DWORD kFromSystem = FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS;

struct Text {
    DWORD code;
    const char* text;
};

const Text kTexts[] = {
    {ERROR_SUCCESS, "The operation completed successfully.\r\n"},
    {ERROR_FILE_NOT_FOUND, "The system cannot find the file specified.\r\n"},
    {ERROR_ACCESS_DENIED, "Access is denied.\r\n"},
    {ERROR_INVALID_HANDLE, "The handle is invalid.\r\n"},
    {ERROR_INVALID_PARAMETER, "The parameter is incorrect.\r\n"},
    {ERROR_INSUFFICIENT_BUFFER, "The data area passed to a system call is too small.\r\n"},
    {ERROR_ALREADY_EXISTS, "Cannot create a file when that file already exists.\r\n"},
    {ERROR_NO_MORE_ITEMS, "No more data is available.\r\n"},
};

std::string Message(DWORD code, DWORD language = 0, DWORD flags = kFromSystem) {
    char text[512];
    const DWORD length = FormatMessageA(flags, nullptr, code, language, text, sizeof text, nullptr);
    if (length == 0)
        return "(failed " + std::to_string(GetLastError()) + ")";
    EXPECT_EQ(length, std::strlen(text));
    return text;
}

DWORD WithArguments(DWORD code, char* text, DWORD size, ...) {
    va_list arguments;
    va_start(arguments, size);
    const DWORD length =
        FormatMessageA(FORMAT_MESSAGE_FROM_SYSTEM, nullptr, code, 0, text, size, &arguments);
    va_end(arguments);
    return length;
}

bool EndsWith(const std::string& text, const std::string& end) {
    return text.size() >= end.size() &&
           text.compare(text.size() - end.size(), end.size(), end) == 0;
}

// Wine's message table has texts of its own, shorter than the system's.
bool ExactTextsAvailable() {
    return !vaskel_test::RunningOnWine();
}

} // namespace

TEST(SystemErrorText, SystemTextsAreExactInTheNeutralDefaultAndEnglishLanguages) {
    for (DWORD language : {0x0000u, 0x0400u, 0x0409u}) {
        for (const Text& expected : kTexts) {
            const std::string text = Message(expected.code, language);
            EXPECT_TRUE(EndsWith(text, ".\r\n")) << expected.code << ": " << text;
            if (ExactTextsAvailable()) {
                EXPECT_EQ(text, expected.text) << expected.code << " in " << language;
            }
        }
    }
    if (!ExactTextsAvailable())
        GTEST_SKIP() << "Wine's message texts differ from the system's; only their form is checked";
}

TEST(SystemErrorText, CallersBufferMustHoldTheTextAndItsNul) {
    const std::string text = Message(ERROR_FILE_NOT_FOUND);
    const DWORD length = static_cast<DWORD>(text.size());
    char buffer[512];
    EXPECT_EQ(
        FormatMessageA(kFromSystem, nullptr, ERROR_FILE_NOT_FOUND, 0, buffer, length + 1, nullptr),
        length);
    EXPECT_EQ(buffer, text);

    SetLastError(untouched);
    EXPECT_EQ(
        FormatMessageA(kFromSystem, nullptr, ERROR_FILE_NOT_FOUND, 0, buffer, length, nullptr), 0u);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INSUFFICIENT_BUFFER));
    SetLastError(untouched);
    EXPECT_EQ(FormatMessageA(kFromSystem, nullptr, ERROR_FILE_NOT_FOUND, 0, nullptr, 0, nullptr),
              0u);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INSUFFICIENT_BUFFER));
}

TEST(SystemErrorText, AllocatedBufferIsLocalMemory) {
    char* text = nullptr;
    const DWORD length =
        FormatMessageA(kFromSystem | FORMAT_MESSAGE_ALLOCATE_BUFFER, nullptr,
                       ERROR_INVALID_PARAMETER, 0, reinterpret_cast<LPSTR>(&text), 0, nullptr);
    ASSERT_NE(text, nullptr);
    EXPECT_EQ(length, std::strlen(text));
    EXPECT_EQ(text, Message(ERROR_INVALID_PARAMETER));
    EXPECT_EQ(LocalFree(text), nullptr);

    // The size asked for is a minimum.
    text = nullptr;
    ASSERT_GT(FormatMessageA(kFromSystem | FORMAT_MESSAGE_ALLOCATE_BUFFER, nullptr,
                             ERROR_FILE_NOT_FOUND, 0, reinterpret_cast<LPSTR>(&text), 300, nullptr),
              0u);
    ASSERT_NE(text, nullptr);
    text[299] = 'x';
    EXPECT_EQ(LocalFree(text), nullptr);
}

TEST(SystemErrorText, CodesWithoutATextFail) {
    for (DWORD code : {0x12345678u, 15999u, 0xFFFFFFFFu}) {
        char text[64];
        SetLastError(untouched);
        EXPECT_EQ(FormatMessageA(kFromSystem, nullptr, code, 0, text, sizeof text, nullptr), 0u);
        EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_MR_MID_NOT_FOUND)) << code;

        // Nothing is allocated, and the caller's pointer says so.
        char* allocated = text;
        SetLastError(untouched);
        EXPECT_EQ(FormatMessageA(kFromSystem | FORMAT_MESSAGE_ALLOCATE_BUFFER, nullptr, code, 0,
                                 reinterpret_cast<LPSTR>(&allocated), 0, nullptr),
                  0u);
        EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_MR_MID_NOT_FOUND));
        EXPECT_EQ(allocated, nullptr);
    }
}

TEST(SystemErrorText, ALanguageWithoutTextsFails) {
    char text[256];
    SetLastError(untouched);
    EXPECT_EQ(FormatMessageA(kFromSystem, nullptr, ERROR_FILE_NOT_FOUND, 0x03FF, text, sizeof text,
                             nullptr),
              0u);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_RESOURCE_LANG_NOT_FOUND));
}

TEST(SystemErrorText, InsertsAreKeptFilledOrRefused) {
    // Kept as they are when ignored.
    const std::string kept = Message(ERROR_BAD_EXE_FORMAT);
    EXPECT_NE(kept.find("%1"), std::string::npos) << kept;
    if (ExactTextsAvailable()) {
        EXPECT_EQ(kept, "%1 is not a valid Win32 application.\r\n");
    }

    // Filled from an array of pointer-sized values.
    const char* name = "tool.exe";
    const DWORD_PTR array[] = {reinterpret_cast<DWORD_PTR>(name)};
    char text[256];
    ASSERT_GT(FormatMessageA(FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_ARGUMENT_ARRAY, nullptr,
                             ERROR_BAD_EXE_FORMAT, 0, text, sizeof text,
                             reinterpret_cast<va_list*>(const_cast<DWORD_PTR*>(array))),
              0u);
    EXPECT_NE(std::string(text).find("tool.exe"), std::string::npos) << text;
    EXPECT_EQ(std::string(text).find('%'), std::string::npos) << text;
    if (ExactTextsAvailable()) {
        EXPECT_STREQ(text, "tool.exe is not a valid Win32 application.\r\n");
    }

    // Filled from a va_list, by number.
    ASSERT_GT(WithArguments(ERROR_MR_MID_NOT_FOUND, text, sizeof text, "1F", "lib.dll"), 0u);
    EXPECT_NE(std::string(text).find("0x1F"), std::string::npos) << text;
    EXPECT_NE(std::string(text).find("lib.dll"), std::string::npos) << text;
    if (ExactTextsAvailable()) {
        EXPECT_STREQ(text, "The system cannot find message text for message number 0x1F in the "
                           "message file for lib.dll.\r\n");
    }

    // Without arguments a text with inserts cannot be formatted; one without
    // inserts can.
    SetLastError(untouched);
    EXPECT_EQ(FormatMessageA(FORMAT_MESSAGE_FROM_SYSTEM, nullptr, ERROR_BAD_EXE_FORMAT, 0, text,
                             sizeof text, nullptr),
              0u);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_PARAMETER));
    EXPECT_EQ(Message(ERROR_FILE_NOT_FOUND, 0, FORMAT_MESSAGE_FROM_SYSTEM),
              Message(ERROR_FILE_NOT_FOUND));
}

TEST(SystemErrorText, NoWidthLimitTurnsTheTextsLineBreaksIntoSpaces) {
    const std::string text =
        Message(ERROR_FILE_NOT_FOUND, 0, kFromSystem | FORMAT_MESSAGE_MAX_WIDTH_MASK);
    EXPECT_TRUE(EndsWith(text, ". ")) << text;
    EXPECT_EQ(text.find('\r'), std::string::npos);
    if (ExactTextsAvailable()) {
        EXPECT_EQ(text, "The system cannot find the file specified. ");
    }
}

TEST(LocalMemory, BlocksAreFreedOnceAndForeignPointersAreRefused) {
    auto* block = static_cast<unsigned char*>(LocalAlloc(LMEM_ZEROINIT, 32));
    ASSERT_NE(block, nullptr);
    for (int i = 0; i < 32; ++i)
        EXPECT_EQ(block[i], 0) << i;
    EXPECT_EQ(LocalFree(block), nullptr);

    HLOCAL empty = LocalAlloc(LMEM_FIXED, 0);
    EXPECT_NE(empty, nullptr);
    EXPECT_EQ(LocalFree(empty), nullptr);

    SetLastError(untouched);
    EXPECT_EQ(LocalFree(nullptr), nullptr);
    EXPECT_EQ(GetLastError(), untouched);

    char onTheStack[16];
    SetLastError(untouched);
    EXPECT_EQ(LocalFree(onTheStack + 3), static_cast<HLOCAL>(onTheStack + 3));
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_HANDLE));
}
