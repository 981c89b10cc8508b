// Long and short path names and their buffer-size protocol, as Windows
// documents them.
#include "support/temp_dir.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cstring>
#include <fstream>
#include <string>

namespace {

using PathFunction = DWORD(WINAPI*)(LPCSTR, LPSTR, DWORD);

class LongPathNameTest : public ::testing::TestWithParam<PathFunction> {
protected:
    void SetUp() override { std::ofstream(m_dir.Path() / "a long file name.text") << "x"; }
    std::string Existing() const { return m_dir.File("a long file name.text"); }

    vaskel_test::TempDir m_dir;
};

TEST_P(LongPathNameTest, BufferSizeProtocol) {
    const PathFunction convert = GetParam();
    // The size needed, NUL included, when the buffer is too small; nothing
    // is written then.
    const DWORD needed = convert(Existing().c_str(), nullptr, 0);
    ASSERT_GT(needed, 1u);
    std::string buffer(needed, '#');
    EXPECT_EQ(convert(Existing().c_str(), &buffer[0], needed - 1), needed);
    EXPECT_EQ(buffer, std::string(needed, '#'));
    // The length without the NUL when it fits.
    EXPECT_EQ(convert(Existing().c_str(), &buffer[0], needed), needed - 1);
    EXPECT_EQ(buffer[needed - 1], '\0');
    EXPECT_EQ(std::strlen(buffer.c_str()), needed - 1);
#ifndef _WIN32
    // No short names here: both forms are the path as it is.
    EXPECT_EQ(buffer.c_str(), Existing());
#endif
    // The output may be the input's own buffer.
    std::string inPlace = Existing();
    inPlace.resize(MAX_PATH);
    EXPECT_EQ(convert(inPlace.c_str(), &inPlace[0], MAX_PATH), needed - 1);
    EXPECT_STREQ(inPlace.c_str(), buffer.c_str());
}

TEST_P(LongPathNameTest, MissingPathsFail) {
    const PathFunction convert = GetParam();
    char buffer[MAX_PATH] = "untouched";
    SetLastError(0);
    EXPECT_EQ(convert(m_dir.File("gone").c_str(), buffer, MAX_PATH), 0u);
    EXPECT_EQ(GetLastError(), DWORD(ERROR_FILE_NOT_FOUND));
    SetLastError(0);
    EXPECT_EQ(convert(m_dir.File("none\\gone").c_str(), buffer, MAX_PATH), 0u);
    EXPECT_NE(GetLastError(), 0u);
}

INSTANTIATE_TEST_SUITE_P(BothForms, LongPathNameTest,
                         ::testing::Values(&GetLongPathNameA, &GetShortPathNameA));

} // namespace
