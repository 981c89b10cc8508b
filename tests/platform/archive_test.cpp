// Tests of CArchive: the exact bytes of each type and length prefix, round
// trips through small buffers and files that deliver a few bytes per read,
// truncated and hostile input, mode misuse and flushing.
#include <vaskel/framework/archive.h>
#include <vaskel/framework/mem_file.h>

#include "support/temp_dir.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <climits>
#include <functional>
#include <initializer_list>
#include <tuple>
#include <utility>
#include <vector>

using namespace vaskel;

namespace {

using Bytes = std::vector<BYTE>;

// What a storing archive writes.
Bytes Stored(const std::function<void(CArchive&)>& write, int bufferSize = 4096) {
    CMemFile file;
    CArchive ar(&file, CArchive::store, bufferSize);
    write(ar);
    ar.Close();
    Bytes bytes(static_cast<size_t>(file.GetLength()));
    file.SeekToBegin();
    file.Read(bytes.data(), static_cast<UINT>(bytes.size()));
    return bytes;
}

// A loading archive over input in a buffer of exactly its size, so that any
// read beyond it is an access the sanitizer reports. The file hands out at
// most step bytes per Read, as a pipe or a socket would.
struct Loader {
    struct Input : CMemFile {
        Input(Bytes input, UINT readStep) : bytes(std::move(input)), step(readStep) {
            Attach(bytes.data(), static_cast<UINT>(bytes.size()));
        }
        UINT Read(void* buffer, UINT count) override {
            return CMemFile::Read(buffer, std::min(count, step));
        }
        Bytes bytes;
        UINT step;
    };
    explicit Loader(Bytes bytes, int bufferSize = 4096, UINT step = UINT_MAX)
        : file(std::move(bytes), step), ar(&file, CArchive::load, bufferSize) {}
    Input file;
    CArchive ar;
};

int CauseOf(const std::function<void()>& action) {
    try {
        action();
    } catch (const CArchiveException& error) {
        return error.m_cause;
    }
    return -1;
}

Bytes Concat(std::initializer_list<Bytes> parts) {
    Bytes all;
    for (const Bytes& part : parts)
        all.insert(all.end(), part.begin(), part.end());
    return all;
}

Bytes Utf16Le(const std::vector<unsigned>& units) {
    Bytes bytes;
    for (unsigned unit : units)
        bytes.insert(bytes.end(), {static_cast<BYTE>(unit), static_cast<BYTE>(unit >> 8)});
    return bytes;
}

} // namespace

TEST(CArchiveBytes, EachTypeIsStoredLittleEndianAndReadBack) {
    Bytes bytes = Stored([](CArchive& ar) {
        ar << BYTE(0xAB) << WORD(0x1234) << short(-2) << char(-1) << WCHAR(0x20AC) << true
           << INT_MIN << 0x12345678u << -2L << 0x89ABCDEFUL << 0x0102030405060708LL
           << 0xF0E0D0C0B0A09080ULL << -0.0f << -2.5 << CString("ab");
    });
    EXPECT_EQ(bytes, Bytes({0xAB, 0x34, 0x12, 0xFE, 0xFF, 0xFF, 0xAC, 0x20, 1,    0,    0,    0,
                            0x80, 0x78, 0x56, 0x34, 0x12, 0xFE, 0xFF, 0xFF, 0xFF, 0xEF, 0xCD, 0xAB,
                            0x89, 8,    7,    6,    5,    4,    3,    2,    1,    0x80, 0x90, 0xA0,
                            0xB0, 0xC0, 0xD0, 0xE0, 0xF0, 0,    0,    0,    0x80, 0,    0,    0,
                            0,    0,    0,    0x04, 0xC0, 2,    'a',  'b'}));
    // Each value read back and stored again gives the same bytes.
    Loader in(bytes);
    std::tuple<BYTE, WORD, short, char, WCHAR, bool, int, unsigned, long, unsigned long, long long,
               unsigned long long, float, double, CString>
        values;
    std::apply([&](auto&... value) { (in.ar >> ... >> value); }, values);
    EXPECT_EQ(
        Stored([&](CArchive& ar) { std::apply([&](auto&... v) { (ar << ... << v); }, values); }),
        bytes);
    EXPECT_EQ(std::get<long>(values), -2L) << "a long is sign-extended from its 32 bits";
}

TEST(CArchiveBytes, StringLengthPrefixGrowsAtEachThreshold) {
    const std::pair<int, Bytes> cases[] = {
        {0, {0x00}},
        {254, {0xFE}},
        {255, {0xFF, 0xFF, 0x00}},
        {0xFFFD, {0xFF, 0xFD, 0xFF}},
        {0xFFFE, {0xFF, 0xFF, 0xFF, 0xFE, 0xFF, 0x00, 0x00}},
        {0x12345, {0xFF, 0xFF, 0xFF, 0x45, 0x23, 0x01, 0x00}},
    };
    for (const auto& [length, prefix] : cases) {
        SCOPED_TRACE(length);
        Bytes body(static_cast<size_t>(length));
        for (size_t i = 0; i < body.size(); ++i)
            body[i] = static_cast<BYTE>(i * 7 + 1); // every byte value, NUL included
        CString text(reinterpret_cast<const char*>(body.data()), length);
        Bytes bytes = Stored([&](CArchive& ar) { ar << text; });
        EXPECT_EQ(bytes, Concat({prefix, body}));
        Loader in(bytes);
        CString back("stale");
        in.ar >> back;
        EXPECT_EQ(Bytes(back.GetString(), back.GetString() + back.GetLength()), body);
    }
}

TEST(CArchiveRoundTrip, SmallBuffersAndFilesThatDeliverAFewBytesPerRead) {
    const Bytes block = Stored([](CArchive& ar) { ar << CString('b', 997); });
    // Values straddle the refills of the smallest buffer; the block and the
    // last string are larger than it.
    auto write = [&](CArchive& ar) {
        for (int i = 0; i < 100; ++i)
            ar << BYTE(i) << (0x0102030405060708LL ^ i) << CString(char('a' + i % 26), i * 3) << i;
        ar.Write(block.data(), static_cast<UINT>(block.size()));
        ar << CString('s', 1000);
    };
    Bytes bytes = Stored(write, 128);
    EXPECT_EQ(bytes, Stored(write)) << "the buffer size must not change the bytes";
    for (UINT step : {UINT_MAX, 7u}) {
        SCOPED_TRACE(step);
        Loader in(bytes, 128, step);
        for (int i = 0; i < 100; ++i) {
            std::tuple<BYTE, long long, CString, int> v;
            in.ar >> std::get<0>(v) >> std::get<1>(v) >> std::get<2>(v) >> std::get<3>(v);
            ASSERT_TRUE(v == std::make_tuple(BYTE(i), 0x0102030405060708LL ^ i,
                                             CString(char('a' + i % 26), i * 3), i))
                << i;
        }
        Bytes back(block.size());
        EXPECT_EQ(in.ar.Read(back.data(), static_cast<UINT>(back.size())), back.size());
        EXPECT_EQ(back, block);
        CString text;
        in.ar >> text;
        EXPECT_EQ(text, CString('s', 1000));
        EXPECT_EQ(in.ar.Read(back.data(), 10), 0u) << "Read at the end gives what there is";
    }
}

TEST(CArchiveTruncated, EveryPrefixAndAHugeLengthPrefixEndInEndOfFile) {
    auto read = [](CArchive& ar) {
        std::tuple<BYTE, CString, int, CString, long long, CString, double, WCHAR> values;
        std::apply([&](auto&... value) { (ar >> ... >> value); }, values);
    };
    Bytes valid = Concat(
        {Stored([](CArchive& ar) { ar << BYTE(7) << CString("abc") << 10 << CString('c', 300); }),
         Stored([](CArchive& ar) { ar << 11LL; }),
         {0xFF, 0xFE, 0xFF, 0xFF, 0x2C, 0x01}, // the wide form, 300 units
         Utf16Le(std::vector<unsigned>(300, 'w')),
         Stored([](CArchive& ar) { ar << 2.0 << WCHAR(0x41); })});
    Loader whole(valid);
    ASSERT_NO_THROW(read(whole.ar));
    for (int bufferSize : {128, 4096}) {
        for (UINT step : {UINT_MAX, 7u}) {
            for (size_t length = 0; length < valid.size(); ++length) {
                Loader in(Bytes(valid.begin(), valid.begin() + length), bufferSize, step);
                ASSERT_EQ(CauseOf([&] { read(in.ar); }), CArchiveException::endOfFile)
                    << length << " bytes, buffer " << bufferSize << ", step " << step;
            }
        }
    }
    // A huge length prefix with little input behind it.
    for (DWORD length : {0x7FFFFFF0u, 0x80000000u, 0xFFFFFFFEu}) {
        Bytes prefix = {0xFF, 0xFF, 0xFF};
        for (int shift = 0; shift < 32; shift += 8)
            prefix.push_back(static_cast<BYTE>(length >> shift));
        CString text("kept");
        Loader narrow(Concat({prefix, Bytes(0x18000, 'a')})); // more than one read step
        EXPECT_EQ(CauseOf([&] { narrow.ar >> text; }), CArchiveException::endOfFile) << length;
        Loader wide(Concat({{0xFF, 0xFE, 0xFF}, prefix, {'a', 0, 'b', 0}}));
        EXPECT_EQ(CauseOf([&] { wide.ar >> text; }), CArchiveException::endOfFile) << length;
        EXPECT_STREQ(text, "kept") << "a failed read leaves the target alone";
    }
    Loader reserved({0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 'a'});
    CString text;
    EXPECT_THROW(reserved.ar >> text, CArchiveException);
}

TEST(CArchiveWide, UnitsAreConvertedAndTheLengthPrefixFollowsTheNarrowRules) {
    Loader in(Concat({{0xFF, 0xFE, 0xFF, 0x03},
                      Utf16Le({'a', 'b', 'c'}),
                      {0xFF, 0xFE, 0xFF, 0xFF, 0xFF, 0xFF, 0x05, 0x00, 0x01, 0x00},
                      Utf16Le(std::vector<unsigned>(0x10005, 'x')),
                      {0xFF, 0xFE, 0xFF, 0x00},
                      {0xFF, 0xFE, 0xFF, 0x02, 'a', 0, 'b'}})); // an odd byte count
    CString text;
    in.ar >> text;
    EXPECT_STREQ(text, "abc");
    in.ar >> text;
    EXPECT_EQ(text, CString('x', 0x10005));
    in.ar >> text;
    EXPECT_TRUE(text.IsEmpty());
    EXPECT_EQ(CauseOf([&] { in.ar >> text; }), CArchiveException::endOfFile);
#ifndef _WIN32
    // The ANSI code page is UTF-8 here.
    Loader utf8(Concat({{0xFF, 0xFE, 0xFF, 0x02}, Utf16Le({0xD83D, 0xDE00})}));
    utf8.ar >> text;
    EXPECT_STREQ(text, "\xF0\x9F\x98\x80");
#endif
}

TEST(CArchiveMode, MisuseOfTheModeAndLongsBeyond32BitsRaiseTheirCause) {
    Loader in({1, 2, 3, 4});
    EXPECT_EQ(CauseOf([&] { in.ar << BYTE(1); }), CArchiveException::readOnly);
    EXPECT_EQ(CauseOf([&] { in.ar << CString("x"); }), CArchiveException::readOnly);
    EXPECT_EQ(CauseOf([&] { in.ar.Write("x", 1); }), CArchiveException::readOnly);

    CMemFile file;
    CArchive ar(&file, CArchive::store);
    ar << 5;
    for (long long beyond : {0x100000000LL, -0x80000001LL}) { // no fit for a 32-bit slot
        if (sizeof(long) > 4) {
            EXPECT_THROW(ar << static_cast<long>(beyond), CArchiveException);
            EXPECT_THROW(ar << static_cast<unsigned long>(beyond), CArchiveException);
        }
    }
    int value;
    CString text;
    EXPECT_EQ(CauseOf([&] { ar >> value; }), CArchiveException::writeOnly);
    EXPECT_EQ(CauseOf([&] { ar >> text; }), CArchiveException::writeOnly);
    EXPECT_EQ(CauseOf([&] { ar.Read(&value, 4); }), CArchiveException::writeOnly);
    ar.Close();
    EXPECT_EQ(file.GetLength(), 4u) << "the refused calls wrote nothing";
    EXPECT_THROW(CArchive(nullptr, CArchive::load), CInvalidArgException);
}

TEST(CArchiveFlush, StoringWritesOutOnCloseAndLoadingGivesUnreadBytesBack) {
    vaskel_test::TempDir dir;
    CFile file(dir.File("archive.bin").c_str(), CFile::modeCreate | CFile::modeReadWrite);
    {
        CArchive ar(&file, CArchive::store);
        ar << 1 << 2 << 3;
        EXPECT_EQ(file.GetLength(), 0u) << "small values stay in the buffer";
    } // the destructor closes, which writes them out
    EXPECT_EQ(file.GetLength(), 12u);
    file.SeekToBegin();
    int n;
    {
        CArchive ar(&file, CArchive::load);
        ar >> n;
        ar.Flush();
        EXPECT_EQ(file.GetPosition(), 4u);
        ar >> n;
        EXPECT_EQ(n, 2) << "reading goes on after a flush";
    } // the destructor closes, which flushes
    EXPECT_EQ(file.GetPosition(), 8u);
}
