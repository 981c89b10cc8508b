#include <vaskel/framework/exceptions.h>

#include <gtest/gtest.h>

#include <cstring>
#include <exception>
#include <functional>
#include <set>
#include <string>

using vaskel::CArchiveException;
using vaskel::CException;
using vaskel::CFileException;
using vaskel::CString;

namespace {

// Raises through the given function and checks the exception is caught both
// as the framework's base and as std::exception, with a message each way.
template <class Expected>
Expected Raised(const std::function<void()>& raise) {
    try {
        raise();
    } catch (const CException& error) {
        EXPECT_GT(std::strlen(error.what()), 0u);
        EXPECT_FALSE(error.GetErrorMessage().IsEmpty());
        const Expected* exact = dynamic_cast<const Expected*>(&error);
        if (exact)
            return *exact;
        ADD_FAILURE() << "caught a different framework exception: " << error.what();
        return Expected();
    }
    ADD_FAILURE() << "nothing was raised";
    return Expected();
}

} // namespace

TEST(CExceptionRaisers, EachRaisesItsOwnTypeAsACException) {
    Raised<vaskel::CMemoryException>([] { vaskel::AfxThrowMemoryException(); });
    Raised<vaskel::CInvalidArgException>([] { vaskel::AfxThrowInvalidArgException(); });
    Raised<vaskel::COleException>([] { vaskel::AfxThrowOleException(E_OUTOFMEMORY); });
    Raised<CArchiveException>(
        [] { vaskel::AfxThrowArchiveException(CArchiveException::badIndex); });
    Raised<CFileException>([] { vaskel::AfxThrowFileException(CFileException::diskFull); });
}

TEST(CExceptionRaisers, AreCaughtAsStdException) {
    try {
        vaskel::AfxThrowFileException(CFileException::hardIO, 5, "disk.bin");
    } catch (const std::exception& error) {
        EXPECT_STREQ(error.what(), CFileException(CFileException::hardIO).what());
        return;
    }
    FAIL() << "not caught as std::exception";
}

TEST(CExceptionRaisers, KeepTheirDetails) {
    auto archive = Raised<CArchiveException>(
        [] { vaskel::AfxThrowArchiveException(CArchiveException::badSchema, "doc.dat"); });
    EXPECT_EQ(archive.m_cause, CArchiveException::badSchema);
    EXPECT_STREQ(archive.m_strFileName, "doc.dat");

    auto file = Raised<CFileException>([] {
        vaskel::AfxThrowFileException(CFileException::sharingViolation, ERROR_SHARING_VIOLATION,
                                      "locked.txt");
    });
    EXPECT_EQ(file.m_cause, CFileException::sharingViolation);
    EXPECT_EQ(file.m_lOsError, static_cast<LONG>(ERROR_SHARING_VIOLATION));
    EXPECT_STREQ(file.m_strFileName, "locked.txt");

    auto ole = Raised<vaskel::COleException>([] { vaskel::AfxThrowOleException(E_NOINTERFACE); });
    EXPECT_EQ(ole.m_sc, E_NOINTERFACE);
}

TEST(CArchiveException, EveryCauseHasItsOwnMessage) {
    std::set<std::string> messages;
    for (int cause = CArchiveException::none; cause <= CArchiveException::bufferFull; ++cause) {
        CArchiveException error(cause);
        EXPECT_GT(std::strlen(error.what()), 0u) << cause;
        EXPECT_STREQ(error.GetErrorMessage(), error.what()) << "no file, nothing added";
        messages.insert(error.what());
    }
    EXPECT_EQ(messages.size(), 9u);
    EXPECT_STRNE(CArchiveException(CArchiveException::endOfFile).what(),
                 CArchiveException(CArchiveException::genericException).what());
}

TEST(CFileException, EveryCauseHasItsOwnMessage) {
    std::set<std::string> messages;
    for (int cause = CFileException::none; cause <= CFileException::endOfFile; ++cause) {
        CFileException error(cause);
        EXPECT_GT(std::strlen(error.what()), 0u) << cause;
        messages.insert(error.what());
    }
    EXPECT_EQ(messages.size(), 15u);
}

TEST(CExceptionMessages, UnknownCausesStillHaveAMessage) {
    for (int cause : {-1, 9, 15, 1000}) {
        EXPECT_GT(std::strlen(CArchiveException(cause).what()), 0u) << cause;
        EXPECT_GT(std::strlen(CFileException(cause).what()), 0u) << cause;
    }
}

TEST(CExceptionMessages, NameTheFileAndTheOleCode) {
    CFileException file(CFileException::accessDenied, ERROR_ACCESS_DENIED, "secret.txt");
    std::string message = file.GetErrorMessage().GetString();
    EXPECT_NE(message.find(file.what()), std::string::npos);
    EXPECT_NE(message.find("secret.txt"), std::string::npos);

    CArchiveException archive(CArchiveException::badClass, "doc.dat");
    EXPECT_NE(std::string(archive.GetErrorMessage()).find("doc.dat"), std::string::npos);

    vaskel::COleException ole(static_cast<HRESULT>(0x80004005));
    EXPECT_NE(std::string(ole.GetErrorMessage()).find("80004005"), std::string::npos);
}

TEST(CExceptionMessages, CopyIntoABufferCutsAndTerminates) {
    CFileException error(CFileException::fileNotFound, ERROR_FILE_NOT_FOUND, "a.txt");
    CString full = error.GetErrorMessage();

    char buffer[8];
    std::memset(buffer, 'x', sizeof buffer);
    UINT help = 99;
    EXPECT_TRUE(error.GetErrorMessage(buffer, 6, &help));
    EXPECT_EQ(help, 0u);
    EXPECT_EQ(std::string(buffer), std::string(full.GetString(), 5));
    EXPECT_EQ(buffer[6], 'x') << "nothing beyond the given size";

    char large[512];
    EXPECT_TRUE(error.GetErrorMessage(large, sizeof large));
    EXPECT_STREQ(large, full);

    EXPECT_TRUE(error.GetErrorMessage(buffer, 1));
    EXPECT_STREQ(buffer, "");
    EXPECT_FALSE(error.GetErrorMessage(buffer, 0));
    EXPECT_FALSE(error.GetErrorMessage(nullptr, 10));
}

TEST(CFileException, OsErrorsMapToCauses) {
    const struct {
        LONG osError;
        int cause;
    } cases[] = {
        {NO_ERROR, CFileException::none},
        {ERROR_FILE_NOT_FOUND, CFileException::fileNotFound},
        {ERROR_PATH_NOT_FOUND, CFileException::badPath},
        {ERROR_ACCESS_DENIED, CFileException::accessDenied},
        {ERROR_ALREADY_EXISTS, CFileException::accessDenied},
        {ERROR_INVALID_HANDLE, CFileException::invalidFile},
        {ERROR_NEGATIVE_SEEK, CFileException::badSeek},
        {ERROR_SHARING_VIOLATION, CFileException::sharingViolation},
        {ERROR_DISK_FULL, CFileException::diskFull},
        {ERROR_HANDLE_EOF, CFileException::endOfFile},
        {ERROR_NOT_ENOUGH_MEMORY, CFileException::genericException},
        {-1, CFileException::genericException},
    };
    for (const auto& c : cases)
        EXPECT_EQ(CFileException::OsErrorToException(c.osError), c.cause) << c.osError;
}
