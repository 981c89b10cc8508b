// CBlob: sharing and copy-on-write, Base64 text against an independent
// encoder's output, the file frame (also from files that cannot tell their
// length, and frames that claim more than the file holds) and global-memory
// media.
#include <vaskel/diag.h>
#include <vaskel/framework/exceptions.h>
#include <vaskel/framework/mem_file.h>
#include <vaskel/value.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <random>
#include <string>
#include <thread>
#include <vector>

using vaskel::CBlob;
using vaskel::CFile;
using vaskel::CFileException;
using vaskel::CMemFile;
using vaskel::COleException;
using vaskel::CString;
using Bytes = std::vector<unsigned char>;

namespace {

CBlob BlobOf(const std::string& text) {
    return CBlob(text.data(), static_cast<DWORD>(text.size()));
}

Bytes BytesOf(const CBlob& blob) {
    return Bytes(blob.GetData(), blob.GetData() + blob.GetSize());
}

Bytes RandomBytes(std::mt19937& random, size_t size) {
    Bytes bytes(size);
    for (unsigned char& byte : bytes)
        byte = static_cast<unsigned char>(random());
    return bytes;
}

CBlob BlobOf(const Bytes& bytes) {
    return CBlob(bytes.data(), static_cast<DWORD>(bytes.size()));
}

Bytes FromHex(const std::string& hex) {
    Bytes bytes;
    for (size_t i = 0; i + 1 < hex.size(); i += 2)
        bytes.push_back(static_cast<unsigned char>(std::stoi(hex.substr(i, 2), nullptr, 16)));
    return bytes;
}

Bytes Contents(CMemFile& file) {
    Bytes contents(static_cast<size_t>(file.GetLength()));
    file.SeekToBegin();
    if (!contents.empty())
        file.Read(contents.data(), static_cast<UINT>(contents.size()));
    return contents;
}

Bytes Frame(DWORD length, const std::string& data) {
    Bytes frame = {'B', 'I', 'N', 'B', 'L', 'O', 'C', 'K', 0};
    for (int i = 0; i < 4; ++i)
        frame.push_back(static_cast<unsigned char>(length >> (8 * i)));
    frame.insert(frame.end(), data.begin(), data.end());
    return frame;
}

// A file over bytes that records the largest read asked of it and, as a pipe
// does, may refuse to tell its length or position.
class ReadOnlyFile : public CMemFile {
public:
    ReadOnlyFile(Bytes bytes, bool canTellLength)
        : m_bytes(std::move(bytes)), m_canTellLength(canTellLength) {
        m_bytes.push_back(0); // so that even no bytes have an address
        Attach(m_bytes.data(), static_cast<UINT>(m_bytes.size() - 1));
    }
    UINT Read(void* buffer, UINT count) override {
        m_largestRead = std::max(m_largestRead, count);
        return CMemFile::Read(buffer, count);
    }
    ULONGLONG GetLength() const override {
        if (!m_canTellLength)
            vaskel::AfxThrowFileException(CFileException::badSeek);
        return CMemFile::GetLength();
    }
    ULONGLONG GetPosition() const override {
        if (!m_canTellLength)
            vaskel::AfxThrowFileException(CFileException::badSeek);
        return CMemFile::GetPosition();
    }
    UINT LargestRead() const { return m_largestRead; }

private:
    Bytes m_bytes;
    bool m_canTellLength;
    UINT m_largestRead = 0;
};

struct Base64Case {
    const char* hex;
    const char* text;
};

const Base64Case pythonCases[] = {
#include "value/blob_base64_cases.inc"
};

} // namespace

// ---------------------------------------------------------------------------
// Sharing and copy-on-write

TEST(CBlobSharing, CopiesShareOneBufferUntilOneIsWrittenThrough) {
    CBlob first = BlobOf("0123456789");
    CBlob copy = first;
    EXPECT_EQ(copy.GetData(), first.GetData());

    copy.GetBuffer()[0] = 'X';
    EXPECT_NE(copy.GetData(), first.GetData());
    EXPECT_EQ(BytesOf(first), BytesOf(BlobOf("0123456789")));
    EXPECT_EQ(BytesOf(copy), BytesOf(BlobOf("X123456789")));

    CBlob third;
    third = first;
    third = first; // the same buffer again changes nothing
    third.GetBuffer(4);
    EXPECT_EQ(BytesOf(third), BytesOf(BlobOf("0123")));
    EXPECT_EQ(first.GetSize(), 10u);
}

TEST(CBlobSharing, GetBufferKeepsAnUnsharedBufferUnlessItMustGrow) {
    CBlob empty;
    EXPECT_EQ(empty.GetBuffer(0), nullptr);
    EXPECT_TRUE(empty.IsEmpty());

    CBlob blob = BlobOf("0123456789");
    const unsigned char* original = blob.GetData();
    EXPECT_EQ(blob.GetBuffer(0), original);
    EXPECT_EQ(blob.GetSize(), 0u);
    EXPECT_FALSE(blob.IsEmpty());
    EXPECT_TRUE(blob == empty);
    // Growing back within the room keeps the bytes that were there.
    EXPECT_EQ(blob.GetBuffer(10), original);
    EXPECT_EQ(BytesOf(blob), BytesOf(BlobOf("0123456789")));

    unsigned char* grown = blob.GetBuffer(12);
    EXPECT_EQ(std::memcmp(grown, "0123456789", 10), 0);
    EXPECT_EQ(blob.GetSize(), 12u);

    unsigned char* fresh = empty.GetBuffer(3);
    ASSERT_NE(fresh, nullptr);
    EXPECT_EQ(empty.GetSize(), 3u);
}

TEST(CBlobSharing, CopyAndCloneGiveBuffersOfTheirOwn) {
    CBlob source = BlobOf("abc");
    CBlob copied;
    copied.Copy(source);
    CBlob cloned = source.Clone();
    EXPECT_NE(copied.GetData(), source.GetData());
    EXPECT_NE(cloned.GetData(), source.GetData());
    EXPECT_TRUE(copied == source);
    EXPECT_TRUE(cloned == source);
    copied.Copy(CBlob());
    EXPECT_TRUE(copied.IsEmpty());
    EXPECT_TRUE(CBlob().Clone().IsEmpty());
}

TEST(CBlobSharing, BlobsSharingABufferMayBeCopiedAndDroppedOnManyThreads) {
    const CBlob shared = BlobOf("shared bytes");
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t) {
        threads.emplace_back([&shared] {
            for (int i = 0; i < 20000; ++i) {
                CBlob copy = shared;
                CBlob another(copy);
                copy.Empty();
            }
        });
    }
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_EQ(BytesOf(shared), BytesOf(BlobOf("shared bytes")));
    // Had a count been lost, this write would not see the buffer as its own.
    CBlob last = shared;
    last.GetBuffer()[0] = 'S';
    EXPECT_EQ(BytesOf(shared), BytesOf(BlobOf("shared bytes")));
}

// ---------------------------------------------------------------------------
// Replacing and comparing

TEST(CBlobSetData, NoBytesEmptiesAndNullBytesAreRefused) {
    CBlob blob = BlobOf("abc");
    EXPECT_THROW(blob.SetData(nullptr, 3), vaskel::unexpected_error);
    EXPECT_EQ(BytesOf(blob), BytesOf(BlobOf("abc")));
    blob.SetData(nullptr, 0);
    EXPECT_TRUE(blob.IsEmpty());
}

TEST(CBlobSetData, ReplacesInPlaceOnlyWhatIsNotShared) {
    CBlob blob = BlobOf("0123456789");
    const unsigned char* original = blob.GetData();
    blob.SetData(blob.GetData() + 2, 5); // overlapping its own bytes
    EXPECT_EQ(blob.GetData(), original);
    EXPECT_EQ(BytesOf(blob), BytesOf(BlobOf("23456")));

    CBlob other = blob;
    other.SetData("xy", 2);
    EXPECT_EQ(BytesOf(blob), BytesOf(BlobOf("23456")));
    EXPECT_EQ(BytesOf(other), BytesOf(BlobOf("xy")));
}

TEST(CBlobCompare, EqualityIsByContentAndOrderByIdentity) {
    CBlob empty, none = BlobOf("x");
    none.GetBuffer(0);
    EXPECT_TRUE(empty == none);
    EXPECT_FALSE(empty != none);

    CBlob a = BlobOf("abc"), b = BlobOf("abc"), c = BlobOf("abd"), d = BlobOf("ab");
    EXPECT_TRUE(a == b);
    EXPECT_TRUE(a != c);
    EXPECT_TRUE(a != d);
    EXPECT_NE(a < b, b < a); // different buffers: exactly one way round
    CBlob shared = a;
    EXPECT_FALSE(a < shared);
    EXPECT_FALSE(shared < a);
    EXPECT_TRUE(empty < a);
    EXPECT_FALSE(a < empty);
}

// ---------------------------------------------------------------------------
// Base64

TEST(CBlobText, EncodesTheStandardVectors) {
    const char* const vectors[][2] = {{"", ""},
                                      {"f", "Zg=="},
                                      {"fo", "Zm8="},
                                      {"foo", "Zm9v"},
                                      {"foob", "Zm9vYg=="},
                                      {"fooba", "Zm9vYmE="},
                                      {"foobar", "Zm9vYmFy"},
                                      {"abc", "YWJj"}};
    for (const auto& vector : vectors) {
        EXPECT_STREQ(BlobOf(vector[0]).ToString(), vector[1]) << vector[0];
        CBlob decoded;
        EXPECT_TRUE(decoded.FromString(vector[1]));
        EXPECT_TRUE(decoded == BlobOf(vector[0])) << vector[1];
    }
    EXPECT_STREQ(BlobOf(std::string(1, '\0')).ToString(), "AA==");
    CBlob none = BlobOf("x");
    none.GetBuffer(0);
    EXPECT_STREQ(none.ToString(), "");
}

TEST(CBlobText, LinesHoldSeventySixCharactersAndEndInCrLfOnlyWhenFull) {
    auto layout = [](size_t size) {
        std::string text = BlobOf(std::string(size, 'z')).ToString().GetString();
        std::string shape; // the line lengths, each followed by '|' where a CR LF stood
        size_t start = 0;
        for (size_t end; (end = text.find("\r\n", start)) != std::string::npos; start = end + 2)
            shape += std::to_string(end - start) + "|";
        return shape + std::to_string(text.size() - start);
    };
    EXPECT_EQ(layout(57), "76|0");
    EXPECT_EQ(layout(56), "76"); // 76 characters, but the last four are a padded tail
    EXPECT_EQ(layout(58), "76|4");
    EXPECT_EQ(layout(60), "76|4");
    EXPECT_EQ(layout(114), "76|76|0");
    EXPECT_EQ(layout(115), "76|76|4");
}

TEST(CBlobText, MatchesAnIndependentEncoder) {
    for (const Base64Case& test : pythonCases) {
        CBlob blob = BlobOf(FromHex(test.hex));
        EXPECT_STREQ(blob.ToString(), test.text) << test.hex;
        CBlob decoded;
        EXPECT_TRUE(decoded.FromString(test.text));
        EXPECT_TRUE(decoded == blob) << test.text;
    }
}

TEST(CBlobText, DecodingSkipsForeignCharactersAndStopsAtTheLengthOrANul) {
    const char* const spellings[] = {"YWJj",    "YW\r\nJj", " Y W J j ",
                                     "Y-W_J*j", "=YW=Jj==", "YWJj\x80\xFF"};
    for (const char* text : spellings) {
        CBlob blob;
        EXPECT_TRUE(blob.FromString(text));
        EXPECT_TRUE(blob == BlobOf("abc")) << text;
    }
    CBlob blob;
    EXPECT_TRUE(blob.FromString("YWJjZGVm", 4));
    EXPECT_TRUE(blob == BlobOf("abc"));
    EXPECT_TRUE(blob.FromString("YWJj\0ZGVm", 9));
    EXPECT_TRUE(blob == BlobOf("abc"));
    EXPECT_TRUE(blob.FromString(CString("YWJjZA")));
    EXPECT_TRUE(blob == BlobOf("abcd"));
    // A tail of three, two or one characters gives two, one or no bytes.
    EXPECT_TRUE(blob.FromString("YWJjZGU"));
    EXPECT_TRUE(blob == BlobOf("abcde"));
    EXPECT_TRUE(blob.FromString("YWJjZ"));
    EXPECT_TRUE(blob == BlobOf("abc"));
    EXPECT_TRUE(blob.FromString("\r\n= ")); // nothing to decode: no bytes
    EXPECT_EQ(blob.GetSize(), 0u);
    // Null or empty text, or none of it, empties the blob.
    for (const char* text : {"", static_cast<const char*>(nullptr)}) {
        blob = BlobOf("abc");
        EXPECT_TRUE(blob.FromString(text));
        EXPECT_TRUE(blob.IsEmpty());
    }
    blob = BlobOf("abc");
    EXPECT_TRUE(blob.FromString("YWJj", 0));
    EXPECT_TRUE(blob.IsEmpty());
}

TEST(CBlobText, DecodingLeavesSharersAloneAndMayReadTheBlobsOwnBytes) {
    CBlob blob = BlobOf("YWJjZGVm");
    CBlob sharer = blob;
    EXPECT_TRUE(blob.FromString(reinterpret_cast<const char*>(blob.GetData()), 4));
    EXPECT_TRUE(blob == BlobOf("abc"));
    EXPECT_TRUE(sharer == BlobOf("YWJjZGVm"));
    EXPECT_TRUE(sharer.FromString(reinterpret_cast<const char*>(sharer.GetData()), 8));
    EXPECT_TRUE(sharer == BlobOf("abcdef"));
}

TEST(CBlobText, RandomBytesSurviveTheRoundTrip) {
    std::mt19937 random(7);
    std::vector<size_t> sizes;
    for (size_t size = 0; size <= 300; ++size)
        sizes.push_back(size);
    sizes.insert(sizes.end(), {4095, 65537, (1u << 20) + 1});
    for (size_t size : sizes) {
        CBlob blob = BlobOf(RandomBytes(random, size));
        CString text = blob.ToString();
        CBlob decoded;
        ASSERT_TRUE(decoded.FromString(text));
        ASSERT_TRUE(decoded == blob) << size << " bytes";
    }
}

TEST(CBlobText, TextOfHalfAGigabyteOrMoreIsRefused) {
    CBlob huge;
    huge.GetBuffer(1u << 29); // never written: the refusal comes first
    try {
        huge.ToString();
        ADD_FAILURE() << "no exception";
    } catch (const COleException& error) {
        EXPECT_EQ(error.m_sc, E_FAIL);
    }
}

// ---------------------------------------------------------------------------
// The file frame

TEST(CBlobFile, AFrameIsMarkerLengthAndBytes) {
    CMemFile file;
    EXPECT_TRUE(BlobOf("xyz").WriteToFile(file));
    EXPECT_TRUE(CBlob().WriteToFile(file));
    Bytes expected = Frame(3, "xyz"), empty = Frame(0, "");
    expected.insert(expected.end(), empty.begin(), empty.end());
    EXPECT_EQ(Contents(file), expected);

    file.SeekToBegin();
    CBlob blob = BlobOf("old");
    EXPECT_TRUE(blob.ReadFromFile(file));
    EXPECT_TRUE(blob == BlobOf("xyz"));
    EXPECT_TRUE(blob.ReadFromFile(file));
    EXPECT_TRUE(blob.IsEmpty());
    EXPECT_FALSE(blob.ReadFromFile(file)); // at the end
}

TEST(CBlobFile, RandomBytesSurviveTheRoundTrip) {
    std::mt19937 random(11);
    CMemFile file;
    std::vector<CBlob> written;
    for (size_t size : {0, 1, 2, 3, 200, 300, 70000}) {
        written.push_back(BlobOf(RandomBytes(random, size)));
        written.back().WriteToFile(file);
    }
    for (bool canTellLength : {true, false}) {
        ReadOnlyFile in(Contents(file), canTellLength);
        for (const CBlob& expected : written) {
            CBlob blob;
            ASSERT_TRUE(blob.ReadFromFile(in));
            EXPECT_TRUE(blob == expected) << expected.GetSize() << " bytes";
        }
    }
}

TEST(CBlobFile, AWrongMarkerOrAShortFrameChangesNothing) {
    Bytes wrongMarker = Frame(3, "xyz");
    wrongMarker[7] = 'X';
    Bytes noNul = Frame(3, "xyz");
    noNul[8] = ' ';
    Bytes shortMarker = Frame(3, ""), shortLength = Frame(3, "");
    shortMarker.resize(8);
    shortLength.resize(11);
    const Bytes failing[] = {wrongMarker, noNul,          shortMarker,
                             shortLength, Frame(3, "xy"), Frame(200000, std::string(150000, 'q'))};
    for (const Bytes& bytes : failing) {
        for (bool canTellLength : {true, false}) {
            ReadOnlyFile file(bytes, canTellLength);
            CBlob blob = BlobOf("kept");
            EXPECT_FALSE(blob.ReadFromFile(file)) << bytes.size() << " bytes";
            EXPECT_TRUE(blob == BlobOf("kept"));
        }
    }
}

TEST(CBlobFile, AClaimedLengthBeyondTheFileIsNotAllocated) {
    for (bool canTellLength : {true, false}) {
        ReadOnlyFile file(Frame(0xFFFFFFFF, "abc"), canTellLength);
        CBlob blob = BlobOf("kept");
        EXPECT_FALSE(blob.ReadFromFile(file));
        EXPECT_TRUE(blob == BlobOf("kept"));
        // No read asked for room anywhere near the claim, so none was made.
        EXPECT_LT(file.LargestRead(), 1u << 20);

        ReadOnlyFile again(Frame(0xFFFFFFFF, "abc"), canTellLength);
        STGMEDIUM medium = BlobOf("kept").ToStgMedium();
        const HGLOBAL before = medium.hGlobal;
        EXPECT_FALSE(CBlob::ReadFromFile(again, medium));
        EXPECT_EQ(medium.hGlobal, before);
        EXPECT_TRUE(CBlob(medium) == BlobOf("kept"));
        EXPECT_LT(again.LargestRead(), 1u << 20);
        CBlob::FreeStgMedium(medium);
    }
}

// ---------------------------------------------------------------------------
// Global-memory media

TEST(CBlobMedium, AMediumHoldsAFixedCopyOfTheBytes) {
    CBlob blob = BlobOf("medium bytes");
    STGMEDIUM medium = blob.ToStgMedium();
    EXPECT_EQ(medium.tymed, static_cast<DWORD>(TYMED_HGLOBAL));
    EXPECT_EQ(medium.pUnkForRelease, nullptr);
    ASSERT_NE(medium.hGlobal, nullptr);
    EXPECT_EQ(GlobalSize(medium.hGlobal), blob.GetSize());
    EXPECT_EQ(GlobalLock(medium.hGlobal), medium.hGlobal); // a fixed block
    GlobalUnlock(medium.hGlobal);
    EXPECT_NE(static_cast<const void*>(medium.hGlobal), static_cast<const void*>(blob.GetData()));
    EXPECT_TRUE(CBlob(medium) == blob);
    CBlob::FreeStgMedium(medium);
    EXPECT_EQ(medium.hGlobal, nullptr);

    STGMEDIUM none = CBlob().ToStgMedium();
    EXPECT_EQ(none.tymed, static_cast<DWORD>(TYMED_HGLOBAL));
    EXPECT_EQ(none.hGlobal, nullptr);
    CBlob::FreeStgMedium(none);
    EXPECT_EQ(none.hGlobal, nullptr);
    // Nothing is taken from a medium of another type or without a block.
    none.tymed = TYMED_HGLOBAL;
    blob.SetData(none);
    STGMEDIUM file = {};
    file.tymed = TYMED_FILE;
    blob.SetData(file);
    EXPECT_TRUE(blob == BlobOf("medium bytes"));
    CMemFile out;
    EXPECT_FALSE(CBlob::WriteToFile(out, file));
    EXPECT_EQ(out.GetLength(), 0u);
}

TEST(CBlobMedium, FramesOfMediaMatchFramesOfBlobs) {
    CBlob blob = BlobOf("framed");
    STGMEDIUM medium = blob.ToStgMedium();
    CMemFile fromMedium, fromBlob;
    EXPECT_TRUE(CBlob::WriteToFile(fromMedium, medium));
    blob.WriteToFile(fromBlob);
    EXPECT_EQ(Contents(fromMedium), Contents(fromBlob));

    // Reading replaces the medium's block with a new one of the frame's bytes.
    CMemFile file;
    BlobOf("replacement").WriteToFile(file);
    CBlob().WriteToFile(file);
    file.SeekToBegin();
    EXPECT_TRUE(CBlob::ReadFromFile(file, medium));
    EXPECT_EQ(medium.tymed, static_cast<DWORD>(TYMED_HGLOBAL));
    EXPECT_TRUE(CBlob(medium) == BlobOf("replacement"));
    // An empty frame frees the block.
    EXPECT_TRUE(CBlob::ReadFromFile(file, medium));
    EXPECT_EQ(medium.hGlobal, nullptr);
    EXPECT_EQ(medium.tymed, static_cast<DWORD>(TYMED_HGLOBAL));

    STGMEDIUM other = {};
    other.tymed = TYMED_FILE;
    file.SeekToBegin();
    EXPECT_TRUE(CBlob::ReadFromFile(file, other));
    EXPECT_EQ(other.tymed, static_cast<DWORD>(TYMED_HGLOBAL));
    EXPECT_TRUE(CBlob(other) == BlobOf("replacement"));
    CBlob::FreeStgMedium(other);
}
