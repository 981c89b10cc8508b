#include <vaskel/diag.h>

#include <gtest/gtest.h>

#include <cstring>
#include <stdexcept>

using vaskel::resource_error;
using vaskel::unexpected_error;

template <class Error>
class LibraryErrorTest : public ::testing::Test {};
using LibraryErrors = ::testing::Types<resource_error, unexpected_error>;
TYPED_TEST_SUITE(LibraryErrorTest, LibraryErrors);

TYPED_TEST(LibraryErrorTest, IsCaughtAsStdExceptionWithTheDefaultText) {
    try {
        throw TypeParam();
    } catch (const std::exception& error) {
        EXPECT_STREQ(error.what(), std::exception().what());
        EXPECT_NE(dynamic_cast<const TypeParam*>(&error), nullptr);
        return;
    }
    FAIL() << "not caught as std::exception";
}

TYPED_TEST(LibraryErrorTest, CopiesAreUsable) {
    TypeParam original;
    TypeParam copy(original);
    copy = original;
    EXPECT_STREQ(copy.what(), original.what());
}

TEST(LibraryErrors, AreDistinctTypes) {
    EXPECT_THROW(
        {
            try {
                throw unexpected_error();
            } catch (const resource_error&) {
                FAIL() << "an unexpected_error was caught as resource_error";
            }
        },
        unexpected_error);
}
