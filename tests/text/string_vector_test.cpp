// Tests of string vectors: the joined text and the archived form, including
// hostile counts and versions.
#include <vaskel/framework/archive.h>
#include <vaskel/framework/exceptions.h>
#include <vaskel/framework/mem_file.h>
#include <vaskel/text.h>

#include <gtest/gtest.h>

#include <vector>

using namespace vaskel;

namespace {

using Bytes = std::vector<BYTE>;

Bytes Stored(CStringVector& vector) {
    CMemFile file;
    CArchive ar(&file, CArchive::store);
    vector.Serialize(ar);
    ar.Close();
    Bytes bytes(static_cast<size_t>(file.GetLength()));
    file.SeekToBegin();
    file.Read(bytes.data(), static_cast<UINT>(bytes.size()));
    return bytes;
}

void Load(const Bytes& bytes, CStringVector& vector) {
    CMemFile file;
    file.Write(bytes.data(), static_cast<UINT>(bytes.size()));
    file.SeekToBegin();
    CArchive ar(&file, CArchive::load);
    vector.Serialize(ar);
}

int LoadFailure(const Bytes& bytes, CStringVector& vector) {
    try {
        Load(bytes, vector);
    } catch (const CArchiveException& e) {
        return e.m_cause;
    }
    return CArchiveException::none;
}

TEST(CStringVectorTest, ToStringJoinsNonEmptyElements) {
    CStringVector vector;
    EXPECT_TRUE(vector.ToString().IsEmpty());
    vector.push_back("a");
    vector.push_back("");
    vector.push_back("b c");
    EXPECT_EQ(vector.ToString(), "a,b c");
    EXPECT_EQ(CStringVector(3, "x").ToString(), "x,x,x");
    EXPECT_EQ(CStringVector(vector.begin() + 1, vector.end()).ToString(), "b c");
    const std::vector<CString> plain{" y ", "z,w"};
    EXPECT_EQ(CStringVector(plain).ToString(), " y ,z,w") << "elements are written as they are";
}

TEST(CStringVectorTest, ArchivedFormAndLoadingAppends) {
    CStringVector one(1, "x");
    const Bytes bytes = Stored(one);
    EXPECT_EQ(bytes, (Bytes{1, 0, 0, 0, 1, 0, 0, 0, 1, 'x'}));

    CStringVector target(1, "y");
    Load(bytes, target);
    ASSERT_EQ(target.size(), 2u);
    EXPECT_EQ(target[0], "y");
    EXPECT_EQ(target[1], "x");

    // Version 0 reads like version 1; long strings take the longer prefixes.
    CStringVector longer;
    longer.push_back(CString('a', 300));
    longer.push_back("");
    Bytes versionZero = Stored(longer);
    versionZero[0] = 0;
    CStringVector loaded;
    Load(versionZero, loaded);
    ASSERT_EQ(loaded.size(), 2u);
    EXPECT_EQ(loaded[0].GetLength(), 300);
    EXPECT_TRUE(loaded[1].IsEmpty());
}

TEST(CStringVectorTest, HostileArchivesFailAndLeaveTheVectorAsItWas) {
    CStringVector vector(1, "kept");
    EXPECT_EQ(LoadFailure({2, 0, 0, 0, 0, 0, 0, 0}, vector), CArchiveException::badSchema);
    EXPECT_EQ(LoadFailure({0xFF, 0xFF, 0xFF, 0xFF, 0, 0, 0, 0}, vector),
              CArchiveException::badSchema);
    // A count far beyond what the archive holds: end of file, nothing reserved
    // for the count, and no partial result.
    EXPECT_EQ(LoadFailure({1, 0, 0, 0, 0xFF, 0xFF, 0xFF, 0xFF, 1, 'a'}, vector),
              CArchiveException::endOfFile);
    EXPECT_EQ(LoadFailure({1, 0, 0}, vector), CArchiveException::endOfFile);
    ASSERT_EQ(vector.size(), 1u);
    EXPECT_EQ(vector[0], "kept");
}

} // namespace
