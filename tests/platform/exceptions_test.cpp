// Tests of the framework's exceptions: how each raiser's exception is caught,
// the details it keeps, and the messages of every cause.
#include <vaskel/framework/exceptions.h>

#include <gtest/gtest.h>

#include <string>

using namespace vaskel;

namespace {

// What raise throws, caught as std::exception: it must be an Expected, and so
// a CException, with a message.
template <class Expected>
Expected Caught(void (*raise)()) {
    try {
        raise();
    } catch (const std::exception& error) {
        const CException* framework = dynamic_cast<const CException*>(&error);
        EXPECT_TRUE(framework && !framework->GetErrorMessage().IsEmpty());
        if (const Expected* exact = dynamic_cast<const Expected*>(&error))
            return *exact;
    }
    ADD_FAILURE() << "no exception of the expected type was raised";
    return Expected();
}

TEST(CExceptionTest, EachRaiserThrowsItsTypeWithItsDetailsAndMessage) {
    Caught<CMemoryException>([] { AfxThrowMemoryException(); });
    Caught<CInvalidArgException>([] { AfxThrowInvalidArgException(); });
    COleException ole = Caught<COleException>([] { AfxThrowOleException(E_FAIL); });
    EXPECT_NE(ole.GetErrorMessage().Find("80004005"), -1);
    auto archive = Caught<CArchiveException>(
        [] { AfxThrowArchiveException(CArchiveException::badSchema, "doc.dat"); });
    EXPECT_EQ(archive.m_cause, CArchiveException::badSchema);
    EXPECT_NE(archive.GetErrorMessage().Find("doc.dat"), -1);
    auto file = Caught<CFileException>(
        [] { AfxThrowFileException(CFileException::diskFull, ERROR_DISK_FULL, "x.txt"); });
    EXPECT_EQ(file.m_cause, CFileException::diskFull);
    EXPECT_EQ(file.m_lOsError, static_cast<LONG>(ERROR_DISK_FULL));
    EXPECT_STREQ(file.m_strFileName, "x.txt");
    EXPECT_STREQ(CArchiveException(-1).what(), CArchiveException(1).what()) << "unknown: generic";
    EXPECT_STREQ(CFileException(CFileException::endOfFile + 1).what(), CFileException(1).what());
    // A message copied into a buffer is cut to fit.
    char buffer[8] = "xxxxxxx";
    EXPECT_TRUE(file.GetErrorMessage(buffer, 6));
    EXPECT_EQ(std::string(buffer), std::string(file.GetErrorMessage()).substr(0, 5));
    EXPECT_EQ(buffer[6], 'x') << "nothing beyond the given size";
    EXPECT_FALSE(file.GetErrorMessage(buffer, 0));
}

} // namespace
