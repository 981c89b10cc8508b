#include <vaskel/framework/archive.h>
#include <vaskel/framework/mem_file.h>

#include "support/temp_dir.h"

#include <gtest/gtest.h>

#include <climits>
#include <cmath>
#include <cstring>
#include <functional>
#include <limits>
#include <string>
#include <vector>

using vaskel::CArchive;
using vaskel::CArchiveException;
using vaskel::CFile;
using vaskel::CMemFile;
using vaskel::CString;

namespace {

using Bytes = std::vector<BYTE>;

Bytes Contents(CFile& file) {
    Bytes bytes(static_cast<size_t>(file.GetLength()));
    file.SeekToBegin();
    if (!bytes.empty()) {
        EXPECT_EQ(file.Read(bytes.data(), static_cast<UINT>(bytes.size())), bytes.size());
    }
    return bytes;
}

// What a storing archive writes.
Bytes Stored(const std::function<void(CArchive&)>& write, int bufferSize = 4096) {
    CMemFile file;
    {
        CArchive ar(&file, CArchive::store, bufferSize);
        write(ar);
        ar.Close();
    }
    return Contents(file);
}

// A loading archive over a buffer of exactly the input's size, so that any
// read beyond the input is an out-of-bounds access the sanitizer reports.
class Loader {
public:
    explicit Loader(Bytes input, int bufferSize = 4096)
        : m_input(std::move(input)), m_file(m_input.data(), static_cast<UINT>(m_input.size())),
          m_ar(&m_file, CArchive::load, bufferSize) {}
    CArchive& ar() { return m_ar; }
    CMemFile& file() { return m_file; }

private:
    Bytes m_input;
    CMemFile m_file;
    CArchive m_ar;
};

int CauseOf(const std::function<void()>& action) {
    try {
        action();
    } catch (const CArchiveException& error) {
        return error.m_cause;
    }
    return -1;
}

Bytes Concat(Bytes head, const Bytes& tail) {
    head.insert(head.end(), tail.begin(), tail.end());
    return head;
}

Bytes Utf16Le(const std::vector<unsigned>& units) {
    Bytes bytes;
    for (unsigned unit : units) {
        bytes.push_back(static_cast<BYTE>(unit & 0xFF));
        bytes.push_back(static_cast<BYTE>(unit >> 8));
    }
    return bytes;
}

} // namespace

TEST(CArchiveBytes, NumbersAreLittleEndian) {
    EXPECT_EQ(Stored([](CArchive& ar) { ar << BYTE(0xAB); }), Bytes({0xAB}));
    EXPECT_EQ(Stored([](CArchive& ar) { ar << WORD(0x1234); }), Bytes({0x34, 0x12}));
    EXPECT_EQ(Stored([](CArchive& ar) { ar << short(-2); }), Bytes({0xFE, 0xFF}));
    EXPECT_EQ(Stored([](CArchive& ar) { ar << 'x'; }), Bytes({'x'}));
    EXPECT_EQ(Stored([](CArchive& ar) { ar << WCHAR(0x20AC); }), Bytes({0xAC, 0x20}));
    EXPECT_EQ(Stored([](CArchive& ar) { ar << true << false; }), Bytes({1, 0}));
    EXPECT_EQ(Stored([](CArchive& ar) { ar << -2; }), Bytes({0xFE, 0xFF, 0xFF, 0xFF}));
    EXPECT_EQ(Stored([](CArchive& ar) { ar << 0x12345678u; }), Bytes({0x78, 0x56, 0x34, 0x12}));
    EXPECT_EQ(Stored([](CArchive& ar) { ar << -1L; }), Bytes({0xFF, 0xFF, 0xFF, 0xFF}));
    EXPECT_EQ(Stored([](CArchive& ar) { ar << 0x89ABCDEFUL; }), Bytes({0xEF, 0xCD, 0xAB, 0x89}));
    EXPECT_EQ(Stored([](CArchive& ar) { ar << 0x0102030405060708LL; }),
              Bytes({8, 7, 6, 5, 4, 3, 2, 1}));
    EXPECT_EQ(Stored([](CArchive& ar) { ar << 0xF0E0D0C0B0A09080ULL; }),
              Bytes({0x80, 0x90, 0xA0, 0xB0, 0xC0, 0xD0, 0xE0, 0xF0}));
    EXPECT_EQ(Stored([](CArchive& ar) { ar << 1.0f; }), Bytes({0, 0, 0x80, 0x3F}));
    EXPECT_EQ(Stored([](CArchive& ar) { ar << 1.0; }), Bytes({0, 0, 0, 0, 0, 0, 0xF0, 0x3F}));
    EXPECT_EQ(Stored([](CArchive& ar) { ar << -2.5; }), Bytes({0, 0, 0, 0, 0, 0, 0x04, 0xC0}));
}

TEST(CArchiveBytes, StringLengthPrefixGrowsAtEachThreshold) {
    const struct {
        int length;
        Bytes prefix;
    } cases[] = {
        {0, {0x00}},
        {3, {0x03}},
        {254, {0xFE}},
        {255, {0xFF, 0xFF, 0x00}},
        {300, {0xFF, 0x2C, 0x01}},
        {0xFFFD, {0xFF, 0xFD, 0xFF}},
        {0xFFFE, {0xFF, 0xFF, 0xFF, 0xFE, 0xFF, 0x00, 0x00}},
        {0x12345, {0xFF, 0xFF, 0xFF, 0x45, 0x23, 0x01, 0x00}},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.length);
        CString text('a', c.length);
        Bytes bytes = Stored([&](CArchive& ar) { ar << text; });
        ASSERT_EQ(bytes.size(), c.prefix.size() + static_cast<size_t>(c.length));
        EXPECT_EQ(Bytes(bytes.begin(), bytes.begin() + c.prefix.size()), c.prefix);
        EXPECT_EQ(Bytes(bytes.begin() + c.prefix.size(), bytes.end()),
                  Bytes(static_cast<size_t>(c.length), 'a'));
    }
}

TEST(CArchiveRoundTrip, EveryOverloadReadsBackWhatWasStored) {
    Bytes bytes = Stored([](CArchive& ar) {
        ar << BYTE(0xFF) << WORD(0xFFFF) << std::numeric_limits<short>::min() << char(-1)
           << WCHAR(0xD83D) << true << std::numeric_limits<int>::min() << UINT_MAX << -123456L
           << 4000000000UL << std::numeric_limits<long long>::min() << ULLONG_MAX << -0.0f
           << std::numeric_limits<double>::denorm_min() << CString("text");
    });
    Loader in(bytes);
    BYTE b = 0;
    WORD w = 0;
    short s = 0;
    char c = 0;
    WCHAR wc = 0;
    bool flag = false;
    int i = 0;
    unsigned u = 0;
    long l = 0;
    unsigned long ul = 0;
    long long ll = 0;
    unsigned long long ull = 0;
    float f = 1;
    double d = 0;
    CString text;
    in.ar() >> b >> w >> s >> c >> wc >> flag >> i >> u >> l >> ul >> ll >> ull >> f >> d >> text;
    EXPECT_EQ(b, 0xFF);
    EXPECT_EQ(w, 0xFFFF);
    EXPECT_EQ(s, std::numeric_limits<short>::min());
    EXPECT_EQ(c, char(-1));
    EXPECT_EQ(static_cast<unsigned>(wc), 0xD83Du);
    EXPECT_TRUE(flag);
    EXPECT_EQ(i, std::numeric_limits<int>::min());
    EXPECT_EQ(u, UINT_MAX);
    EXPECT_EQ(l, -123456L) << "a long is sign-extended from its 32 bits";
    EXPECT_EQ(ul, 4000000000UL);
    EXPECT_EQ(ll, std::numeric_limits<long long>::min());
    EXPECT_EQ(ull, ULLONG_MAX);
    EXPECT_EQ(f, 0.0f);
    EXPECT_TRUE(std::signbit(f));
    EXPECT_EQ(d, std::numeric_limits<double>::denorm_min());
    EXPECT_STREQ(text, "text");
    EXPECT_TRUE(in.ar().IsBufferEmpty());
}

TEST(CArchiveRoundTrip, NonFiniteDoublesKeepTheirBits) {
    const double values[] = {
        std::numeric_limits<double>::infinity(), -std::numeric_limits<double>::infinity(),
        std::numeric_limits<double>::quiet_NaN(), -0.0, std::numeric_limits<double>::max()};
    Bytes bytes = Stored([&](CArchive& ar) {
        for (double v : values)
            ar << v;
    });
    Loader in(bytes);
    for (double expected : values) {
        double actual;
        in.ar() >> actual;
        EXPECT_EQ(std::memcmp(&actual, &expected, sizeof actual), 0) << expected;
    }
}

TEST(CArchiveRoundTrip, StringsOfEveryPrefixFormAndBinaryContent) {
    std::vector<CString> texts;
    for (int length : {0, 1, 254, 255, 0xFFFD, 0xFFFE, 0xFFFF, 70000, 200000}) {
        CString text;
        char* chars = text.GetBuffer(length);
        for (int i = 0; i < length; ++i)
            chars[i] = static_cast<char>(i * 7 + length);
        text.ReleaseBuffer(length);
        texts.push_back(text);
    }
    Bytes bytes = Stored([&](CArchive& ar) {
        for (const CString& text : texts)
            ar << text;
    });
    Loader in(bytes);
    for (const CString& expected : texts) {
        CString actual("stale");
        in.ar() >> actual;
        ASSERT_EQ(actual.GetLength(), expected.GetLength());
        EXPECT_EQ(std::memcmp(actual.GetString(), expected.GetString(),
                              static_cast<size_t>(expected.GetLength())),
                  0)
            << "length " << expected.GetLength();
    }
}

TEST(CArchiveRoundTrip, ValuesStraddlingTheBufferBoundary) {
    // The smallest buffer makes multi-byte values split across refills.
    auto write = [](CArchive& ar) {
        for (int i = 0; i < 500; ++i)
            ar << BYTE(i) << (0x0102030405060708LL ^ i) << CString(char('a' + i % 26), i % 300)
               << i;
    };
    Bytes bytes = Stored(write, 128);
    EXPECT_EQ(bytes, Stored(write)) << "the buffer size must not change the bytes";
    Loader in(bytes, 128);
    for (int i = 0; i < 500; ++i) {
        BYTE b;
        long long ll;
        CString text;
        int n;
        in.ar() >> b >> ll >> text >> n;
        ASSERT_EQ(b, BYTE(i));
        ASSERT_EQ(ll, (0x0102030405060708LL ^ i));
        ASSERT_EQ(text, CString(char('a' + i % 26), i % 300));
        ASSERT_EQ(n, i);
    }
}

TEST(CArchiveRoundTrip, BlocksLargerThanTheBuffer) {
    Bytes block(10000);
    for (size_t i = 0; i < block.size(); ++i)
        block[i] = static_cast<BYTE>(i * 31);
    // The buffer is partly filled before the block, and the block is both
    // written and read around the buffer.
    Bytes bytes = Stored(
        [&](CArchive& ar) {
            ar << BYTE(1) << WORD(2);
            ar.Write(block.data(), static_cast<UINT>(block.size()));
            ar << 3;
        },
        128);
    ASSERT_EQ(bytes.size(), 3 + block.size() + 4);
    EXPECT_EQ(Bytes(bytes.begin() + 3, bytes.end() - 4), block);

    Loader in(bytes, 128);
    BYTE b;
    WORD w;
    in.ar() >> b >> w;
    Bytes back(block.size());
    EXPECT_EQ(in.ar().Read(back.data(), static_cast<UINT>(back.size())), back.size());
    EXPECT_EQ(back, block);
    int tail;
    in.ar() >> tail;
    EXPECT_EQ(tail, 3);

    Bytes rest(100, 0xEE);
    EXPECT_EQ(in.ar().Read(rest.data(), 100), 0u) << "Read at the end gives what there is";
}

TEST(CArchiveRoundTrip, ThroughADiskFile) {
    vaskel_test::TempDir dir;
    std::string path = dir.File("archive.bin");
    CString big('q', 100000);
    {
        CFile file(path.c_str(), CFile::modeCreate | CFile::modeWrite);
        CArchive ar(&file, CArchive::store);
        ar << 42 << big << 2.5;
    } // the archive's destructor writes its buffer out before the file closes
    CFile file(path.c_str(), CFile::modeRead);
    EXPECT_EQ(file.GetLength(), 4u + 7u + 100000u + 8u);
    CArchive ar(&file, CArchive::load);
    int n;
    CString text;
    double d;
    ar >> n >> text >> d;
    EXPECT_EQ(n, 42);
    EXPECT_EQ(text, big);
    EXPECT_EQ(d, 2.5);
}

TEST(CArchiveRoundTrip, LongsBeyond32BitsAreRefused) {
    if (sizeof(long) <= 4)
        GTEST_SKIP() << "every long fits 32 bits here";
    long long tooBig = 0x100000000LL;
    long long tooSmall = -0x80000001LL;
    CMemFile file;
    CArchive ar(&file, CArchive::store);
    EXPECT_EQ(CauseOf([&] { ar << static_cast<long>(tooBig); }),
              CArchiveException::genericException);
    EXPECT_EQ(CauseOf([&] { ar << static_cast<long>(tooSmall); }),
              CArchiveException::genericException);
    EXPECT_EQ(CauseOf([&] { ar << static_cast<unsigned long>(tooBig); }),
              CArchiveException::genericException);
    ar << static_cast<long>(INT_MIN) << static_cast<unsigned long>(UINT_MAX);
    ar.Close();
    EXPECT_EQ(Contents(file), Bytes({0, 0, 0, 0x80, 0xFF, 0xFF, 0xFF, 0xFF}))
        << "a refused long writes nothing";
}

TEST(CArchiveTruncated, EveryPrefixEndsInEndOfFile) {
    auto read = [](CArchive& ar) {
        BYTE b;
        WORD w;
        int i;
        long long ll;
        float f;
        double d;
        CString a, c, wide;
        WCHAR wc;
        bool flag;
        ar >> b >> a >> w >> i >> c >> ll >> f >> wide >> d >> wc >> flag;
    };
    Bytes wideForm =
        Concat({0xFF, 0xFE, 0xFF, 0xFF, 0x2C, 0x01}, Utf16Le(std::vector<unsigned>(300, 'w')));
    Bytes valid =
        Concat(Stored([](CArchive& ar) {
                   ar << BYTE(7) << CString("abc") << WORD(9) << 10 << CString('c', 300) << 11LL
                      << 1.5f;
               }),
               Concat(wideForm, Stored([](CArchive& ar) { ar << 2.0 << WCHAR(0x41) << true; })));
    {
        Loader whole(valid);
        read(whole.ar());
        EXPECT_TRUE(whole.ar().IsBufferEmpty());
    }
    for (int bufferSize : {128, 4096}) {
        for (size_t length = 0; length < valid.size(); ++length) {
            Loader in(Bytes(valid.begin(), valid.begin() + length), bufferSize);
            ASSERT_EQ(CauseOf([&] { read(in.ar()); }), CArchiveException::endOfFile)
                << "prefix of " << length << " bytes, buffer " << bufferSize;
        }
    }
}

TEST(CArchiveTruncated, LongStringCutAnywhere) {
    // A 32-bit prefix and a body longer than one read step.
    Bytes valid = Stored([](CArchive& ar) { ar << CString('z', 0x20000); });
    const size_t cuts[] = {
        0, 1, 3, 6, 7, 8, 0x8000, 7 + 0x10000, 8 + 0x10000, 6 + 0x10000, 0x1FFFF, valid.size() - 1};
    for (size_t cut : cuts) {
        Loader in(Bytes(valid.begin(), valid.begin() + cut));
        CString text("kept");
        EXPECT_EQ(CauseOf([&] { in.ar() >> text; }), CArchiveException::endOfFile) << cut;
        EXPECT_STREQ(text, "kept") << "a failed read leaves the target alone";
    }
}

TEST(CArchiveTruncated, HugeLengthPrefixWithLittleInputFailsCleanly) {
    const DWORD lengths[] = {0x7FFFFFF0, 0x80000000, 0xFFFFFFFE};
    for (DWORD length : lengths) {
        SCOPED_TRACE(length);
        Bytes prefix = {0xFF,
                        0xFF,
                        0xFF,
                        static_cast<BYTE>(length),
                        static_cast<BYTE>(length >> 8),
                        static_cast<BYTE>(length >> 16),
                        static_cast<BYTE>(length >> 24)};
        Loader narrow(Concat(prefix, {'a', 'b', 'c'}));
        CString text;
        EXPECT_EQ(CauseOf([&] { narrow.ar() >> text; }), CArchiveException::endOfFile);

        Loader wide(Concat(Concat({0xFF, 0xFE, 0xFF}, prefix), {'a', 0, 'b', 0}));
        EXPECT_EQ(CauseOf([&] { wide.ar() >> text; }), CArchiveException::endOfFile);
    }
    Loader reserved({0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 'a'});
    CString text;
    EXPECT_THROW(reserved.ar() >> text, CArchiveException);
}

TEST(CArchiveWide, UnitsAreConvertedToText) {
    Loader in(Concat({0xFF, 0xFE, 0xFF, 0x03}, Utf16Le({'a', 'b', 'c'})));
    CString text;
    in.ar() >> text;
    EXPECT_STREQ(text, "abc");
    EXPECT_TRUE(in.ar().IsBufferEmpty());
}

TEST(CArchiveWide, LengthPrefixFollowsTheNarrowRules) {
    std::vector<unsigned> units(300);
    for (size_t i = 0; i < units.size(); ++i)
        units[i] = 'A' + i % 26;
    Bytes medium = Concat({0xFF, 0xFE, 0xFF, 0xFF, 0x2C, 0x01}, Utf16Le(units));
    std::vector<unsigned> many(0x10005, 'x');
    Bytes large =
        Concat({0xFF, 0xFE, 0xFF, 0xFF, 0xFF, 0xFF, 0x05, 0x00, 0x01, 0x00}, Utf16Le(many));
    Bytes empty = {0xFF, 0xFE, 0xFF, 0x00};
    Loader in(Concat(Concat(medium, large), Concat(empty, {0x01, 'n'})));
    CString text;
    in.ar() >> text;
    ASSERT_EQ(text.GetLength(), 300);
    for (int i = 0; i < 300; ++i)
        ASSERT_EQ(text[i], 'A' + i % 26);
    in.ar() >> text;
    EXPECT_EQ(text, CString('x', 0x10005));
    text = "stale";
    in.ar() >> text;
    EXPECT_TRUE(text.IsEmpty());
    in.ar() >> text;
    EXPECT_STREQ(text, "n") << "the narrow form follows directly";
}

TEST(CArchiveWide, OddByteCountIsEndOfFile) {
    Loader in({0xFF, 0xFE, 0xFF, 0x02, 'a', 0, 'b'});
    CString text;
    EXPECT_EQ(CauseOf([&] { in.ar() >> text; }), CArchiveException::endOfFile);
}

#ifndef _WIN32
// The ANSI code page is UTF-8 here.
TEST(CArchiveWide, NonAsciiBecomesUtf8) {
    Loader in(Concat({0xFF, 0xFE, 0xFF, 0x05}, Utf16Le({0xE9, 0x20AC, 0xD83D, 0xDE00, 'z'})));
    CString text;
    in.ar() >> text;
    EXPECT_STREQ(text, "\xC3\xA9\xE2\x82\xAC\xF0\x9F\x98\x80z");
}
#endif

TEST(CArchiveMode, WritingToALoadingArchiveIsReadOnly) {
    Loader in({1, 2, 3, 4});
    CArchive& ar = in.ar();
    EXPECT_EQ(CauseOf([&] { ar << BYTE(1); }), CArchiveException::readOnly);
    EXPECT_EQ(CauseOf([&] { ar << 1; }), CArchiveException::readOnly);
    EXPECT_EQ(CauseOf([&] { ar << 1L; }), CArchiveException::readOnly);
    EXPECT_EQ(CauseOf([&] { ar << 1UL; }), CArchiveException::readOnly);
    EXPECT_EQ(CauseOf([&] { ar << 1.0; }), CArchiveException::readOnly);
    EXPECT_EQ(CauseOf([&] { ar << CString("x"); }), CArchiveException::readOnly);
    EXPECT_EQ(CauseOf([&] { ar.Write("x", 1); }), CArchiveException::readOnly);
    int value;
    ar >> value;
    EXPECT_EQ(value, 0x04030201) << "the failed writes changed nothing";
}

TEST(CArchiveMode, ReadingFromAStoringArchiveIsWriteOnly) {
    CMemFile file;
    CArchive ar(&file, CArchive::store);
    ar << 5;
    BYTE b;
    int i;
    long l;
    double d;
    CString text;
    char raw[4];
    EXPECT_EQ(CauseOf([&] { ar >> b; }), CArchiveException::writeOnly);
    EXPECT_EQ(CauseOf([&] { ar >> i; }), CArchiveException::writeOnly);
    EXPECT_EQ(CauseOf([&] { ar >> l; }), CArchiveException::writeOnly);
    EXPECT_EQ(CauseOf([&] { ar >> d; }), CArchiveException::writeOnly);
    EXPECT_EQ(CauseOf([&] { ar >> text; }), CArchiveException::writeOnly);
    EXPECT_EQ(CauseOf([&] { ar.Read(raw, 4); }), CArchiveException::writeOnly);
    ar.Close();
    EXPECT_EQ(Contents(file), Bytes({5, 0, 0, 0}));
}

TEST(CArchiveMode, ANullFileIsAnInvalidArgument) {
    EXPECT_THROW(CArchive(nullptr, CArchive::load), vaskel::CInvalidArgException);
}

TEST(CArchiveLoadFlush, FlushAndCloseLeaveTheFileBehindTheConsumedBytes) {
    Bytes data(100);
    for (size_t i = 0; i < data.size(); ++i)
        data[i] = static_cast<BYTE>(i);
    CMemFile file(data.data(), static_cast<UINT>(data.size()));
    {
        CArchive ar(&file, CArchive::load);
        BYTE b;
        WORD w;
        ar >> b >> w;
        ar.Flush();
        EXPECT_EQ(file.GetPosition(), 3u);
        int i;
        ar >> i;
        EXPECT_EQ(i, 0x06050403) << "reading goes on after a flush";
        ar.Close();
        EXPECT_EQ(file.GetPosition(), 7u);
        EXPECT_EQ(ar.GetFile(), nullptr);
    }
    EXPECT_EQ(file.GetPosition(), 7u) << "a closed archive leaves the file alone";

    file.SeekToBegin();
    {
        CArchive ar(&file, CArchive::load);
        long long ll;
        ar >> ll;
    }
    EXPECT_EQ(file.GetPosition(), 8u) << "the destructor closes";

    file.SeekToBegin();
    {
        CArchive ar(&file, CArchive::load | CArchive::bNoFlushOnDelete);
        BYTE b;
        ar >> b;
    }
    EXPECT_EQ(file.GetPosition(), 100u) << "without the flush the buffered bytes stay consumed";
}

TEST(CArchiveLoadFlush, DiskFileIsPositionedBehindTheConsumedBytes) {
    vaskel_test::TempDir dir;
    std::string path = dir.File("load.bin");
    {
        CFile file(path.c_str(), CFile::modeCreate | CFile::modeWrite);
        Bytes data(10000, 0x11);
        file.Write(data.data(), static_cast<UINT>(data.size()));
    }
    CFile file(path.c_str(), CFile::modeRead);
    CArchive ar(&file, CArchive::load, 512);
    Bytes block(1000);
    ar.Read(block.data(), 10);
    ar.Read(block.data(), 1000);
    ar.Flush();
    EXPECT_EQ(file.GetPosition(), 1010u);
}

TEST(CArchiveStoreFlush, TheDestructorWritesUnlessToldNotTo) {
    CMemFile file;
    {
        CArchive ar(&file, CArchive::store);
        ar << 1 << 2;
        EXPECT_FALSE(ar.IsBufferEmpty());
        EXPECT_EQ(file.GetLength(), 0u) << "small values stay in the buffer";
        ar.Flush();
        EXPECT_TRUE(ar.IsBufferEmpty());
        EXPECT_EQ(file.GetLength(), 8u);
        ar << 3;
    }
    EXPECT_EQ(file.GetLength(), 12u);
    {
        CArchive ar(&file, CArchive::store | CArchive::bNoFlushOnDelete);
        ar << 4;
    }
    EXPECT_EQ(file.GetLength(), 12u);
    {
        CArchive ar(&file, CArchive::store);
        ar << 5;
        ar.Abort();
        EXPECT_EQ(ar.GetFile(), nullptr);
    }
    EXPECT_EQ(file.GetLength(), 12u) << "an aborted archive writes nothing";
}
