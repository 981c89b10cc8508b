// VARIANTs and strings marshalled by value: the exact stream bytes, round
// trips of every type with a stream form, sizes, interfaces, and streams that
// end early or describe more than they hold.
#include "support/ole_text.h"
#include "support/wine.h"

#include <vaskel/marshal.h>
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <vector>

namespace {

using vaskel::CMarshalHelper;
using vaskel_test::Ole;
using Bytes = std::vector<unsigned char>;

// A stream on global memory, released with the test.
class Stream {
public:
    Stream() { EXPECT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, &m_stream), S_OK); }
    explicit Stream(const Bytes& bytes) : Stream() {
        ULONG written = 0;
        if (!bytes.empty()) {
            EXPECT_EQ(m_stream->Write(bytes.data(), static_cast<ULONG>(bytes.size()), &written),
                      S_OK);
        }
        Rewind();
    }
    ~Stream() { m_stream->Release(); }
    Stream(const Stream&) = delete;
    Stream& operator=(const Stream&) = delete;

    IStream* get() const { return m_stream; }
    void Rewind() { Seek(0); }
    void Seek(LONGLONG position) {
        LARGE_INTEGER move;
        move.QuadPart = position;
        EXPECT_EQ(m_stream->Seek(move, STREAM_SEEK_SET, nullptr), S_OK);
    }
    ULONGLONG Position() const {
        LARGE_INTEGER zero;
        zero.QuadPart = 0;
        ULARGE_INTEGER position;
        EXPECT_EQ(m_stream->Seek(zero, STREAM_SEEK_CUR, &position), S_OK);
        return position.QuadPart;
    }
    // Everything written so far, whatever the position.
    Bytes Contents() const {
        STATSTG stat;
        EXPECT_EQ(m_stream->Stat(&stat, STATFLAG_NONAME), S_OK);
        HGLOBAL global = nullptr;
        EXPECT_EQ(GetHGlobalFromStream(m_stream, &global), S_OK);
        const auto* data = static_cast<const unsigned char*>(GlobalLock(global));
        Bytes bytes(data, data + stat.cbSize.QuadPart);
        GlobalUnlock(global);
        return bytes;
    }

private:
    IStream* m_stream = nullptr;
};

// Zeroed, so that setting only the type gives a null or zero value.
struct Variant : VARIANT {
    Variant() {
        std::memset(static_cast<VARIANT*>(this), 0, sizeof(VARIANT));
        VariantInit(this);
    }
    ~Variant() { VariantClear(this); }
    Variant(const Variant&) = delete;
    Variant& operator=(const Variant&) = delete;
};

HRESULT Write(const VARIANT& v, Stream& stream) {
    return CMarshalHelper::WriteVariantForMarshalling(v, stream.get(), MSHCTX_INPROC, nullptr,
                                                      MSHLFLAGS_NORMAL);
}

ULONG SizeOf(const VARIANT& v) {
    ULONG size = 0;
    EXPECT_EQ(CMarshalHelper::GetVariantSizeForMarshalling(v, size, MSHCTX_INPROC, nullptr,
                                                           MSHLFLAGS_NORMAL),
              S_OK);
    return size;
}

// The bytes of v, checking that its size is what the write took.
Bytes Marshal(const VARIANT& v) {
    Stream stream;
    EXPECT_EQ(Write(v, stream), S_OK);
    const Bytes bytes = stream.Contents();
    EXPECT_EQ(SizeOf(v), bytes.size());
    return bytes;
}

// Writes v and reads it back into out; the whole record must be read.
void RoundTrip(const VARIANT& v, VARIANT& out) {
    Stream stream;
    ASSERT_EQ(Write(v, stream), S_OK);
    const ULONGLONG written = stream.Position();
    EXPECT_EQ(SizeOf(v), written);
    stream.Rewind();
    ASSERT_EQ(CMarshalHelper::ReadVariantFromMarshalling(out, stream.get()), S_OK);
    EXPECT_EQ(stream.Position(), written);
}

HRESULT ReadFrom(const Bytes& bytes, VARIANT& out) {
    Stream stream(bytes);
    return CMarshalHelper::ReadVariantFromMarshalling(out, stream.get());
}

HRESULT ReleaseFrom(const Bytes& bytes) {
    Stream stream(bytes);
    return CMarshalHelper::ReleaseVariantFromMarshalling(stream.get());
}

void Append32(Bytes& bytes, ULONG value) {
    for (int b = 0; b < 4; ++b)
        bytes.push_back(static_cast<unsigned char>(value >> (8 * b)));
}

// An array record header: type, dimension count and (count, lower bound) pairs.
Bytes ArrayHeader(VARTYPE type, std::vector<SAFEARRAYBOUND> bounds) {
    Bytes bytes = {static_cast<unsigned char>(type), static_cast<unsigned char>(type >> 8),
                   static_cast<unsigned char>(bounds.size()), 0};
    for (const SAFEARRAYBOUND& bound : bounds) {
        Append32(bytes, bound.cElements);
        Append32(bytes, static_cast<ULONG>(bound.lLbound));
    }
    return bytes;
}

SAFEARRAY* Vector(VARTYPE type, LONG lower, ULONG count) {
    return SafeArrayCreateVector(type, lower, count);
}

template <typename T>
T* Data(SAFEARRAY* array) {
    return static_cast<T*>(array->pvData);
}

TEST(MarshalHelperBytes, ScalarsAreTheTypeThenTheValue) {
    Variant i4;
    i4.vt = VT_I4;
    i4.lVal = 7;
    EXPECT_EQ(Marshal(i4), (Bytes{0x03, 0x00, 0x07, 0x00, 0x00, 0x00}));
    Variant i1;
    i1.vt = VT_I1;
    i1.cVal = -1;
    EXPECT_EQ(Marshal(i1), (Bytes{0x10, 0x00, 0xFF}));
    Variant ui1;
    ui1.vt = VT_UI1;
    ui1.bVal = 0xAB;
    EXPECT_EQ(Marshal(ui1), (Bytes{0x11, 0x00, 0xAB, 0x00, 0x00, 0x00}));
    Variant empty;
    EXPECT_EQ(Marshal(empty), (Bytes{0x00, 0x00}));
}

TEST(MarshalHelperBytes, StringsAreTheByteLengthThenTheText) {
    Variant text;
    text.vt = VT_BSTR;
    text.bstrVal = SysAllocString(Ole("ab").c_str());
    EXPECT_EQ(Marshal(text), (Bytes{0x08, 0x00, 0x04, 0x00, 0x00, 0x00, 0x61, 0x00, 0x62, 0x00}));
    Variant null;
    null.vt = VT_BSTR;
    EXPECT_EQ(Marshal(null), (Bytes{0x08, 0x00, 0x00, 0x00, 0x00, 0x00}));
}

TEST(MarshalHelperBytes, ArrayElementsAreWholeRecords) {
    Variant array;
    array.vt = VT_ARRAY | VT_I2;
    array.parray = Vector(VT_I2, 0, 3);
    Data<SHORT>(array.parray)[0] = 1;
    Data<SHORT>(array.parray)[1] = -2;
    Data<SHORT>(array.parray)[2] = 0x0304;
    EXPECT_EQ(Marshal(array),
              (Bytes{0x02, 0x20, 0x01, 0x00, 0x03, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00,
                     0x02, 0x00, 0x01, 0x00, 0x02, 0x00, 0xFE, 0xFF, 0x02, 0x00, 0x04, 0x03}));
}

TEST(MarshalHelperRoundTrip, EveryScalarTypeComesBackAsWritten) {
    struct Case {
        VARTYPE type;
        ULONGLONG bits;
        ULONG valueBytes;
    };
    const Case cases[] = {
        {VT_I2, 0x8001, 2},
        {VT_BOOL, 0xFFFF, 2},
        {VT_UI2, 0xFFFE, 2},
        {VT_I4, 0x80000001u, 4},
        {VT_R4, 0x3FC00000u, 4},
        {VT_UI4, 0xFFFFFFFEu, 4},
        {VT_INT, 0x12345678u, 4},
        {VT_UINT, 0x87654321u, 4},
        {VT_UI1, 0xC3, 4},
        {VT_I1, 0x80, 1},
        {VT_R8, 0x400921FB54442D18ull, 8},
        {VT_DATE, 0x40E5F4A000000000ull, 8},
        {VT_I8, 0x8000000000000001ull, 8},
        {VT_UI8, 0xFFFFFFFFFFFFFFFEull, 8},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.type);
        Variant in;
        in.vt = c.type;
        std::memcpy(&in.llVal, &c.bits, c.valueBytes == 4 && c.type == VT_UI1 ? 1 : c.valueBytes);
        EXPECT_EQ(SizeOf(in), 2 + c.valueBytes);
        Variant out;
        RoundTrip(in, out);
        EXPECT_EQ(out.vt, c.type);
        EXPECT_EQ(out.llVal, in.llVal);
    }
}

TEST(MarshalHelperRoundTrip, DecimalsKeepScaleSignAndDigits) {
    Variant in;
    in.decVal.scale = 4;
    in.decVal.sign = DECIMAL_NEG;
    in.decVal.Hi32 = 0x01020304;
    in.decVal.Lo64 = 0x0506070809101112ull;
    in.vt = VT_DECIMAL;
    EXPECT_EQ(Marshal(in).size(), 2u + 16u);
    Variant out;
    RoundTrip(in, out);
    EXPECT_EQ(out.vt, VT_DECIMAL);
    EXPECT_EQ(std::memcmp(&out.decVal, &in.decVal, sizeof(DECIMAL)), 0);
}

TEST(MarshalHelperRoundTrip, Ui1IgnoresTheThreeUnusedBytes) {
    Variant out;
    EXPECT_EQ(ReadFrom({0x11, 0x00, 0x5A, 0xFF, 0xFF, 0xFF}, out), S_OK);
    EXPECT_EQ(out.vt, VT_UI1);
    EXPECT_EQ(out.bVal, 0x5A);
}

TEST(MarshalHelperRoundTrip, StringsKeepTheirBytesAndEmptyComesBackNull) {
    Variant in;
    in.vt = VT_BSTR;
    in.bstrVal = SysAllocStringByteLen("odd", 3); // an odd byte length survives
    Variant out;
    RoundTrip(in, out);
    ASSERT_EQ(out.vt, VT_BSTR);
    ASSERT_EQ(SysStringByteLen(out.bstrVal), 3u);
    EXPECT_EQ(std::memcmp(out.bstrVal, "odd", 3), 0);

    Variant empty;
    empty.vt = VT_BSTR;
    empty.bstrVal = SysAllocString(Ole("").c_str());
    Variant back;
    RoundTrip(empty, back);
    EXPECT_EQ(back.vt, VT_BSTR);
    EXPECT_EQ(back.bstrVal, nullptr);
}

TEST(MarshalHelperStrings, ReadFreesTheOldStringAndSizesAdd) {
    Stream stream;
    BSTR text = SysAllocString(Ole("xyz").c_str());
    ULONG size = 10;
    EXPECT_EQ(CMarshalHelper::GetBSTRSizeForMarshalling(text, size), S_OK);
    EXPECT_EQ(size, 10u + 4u + 6u);
    ASSERT_EQ(CMarshalHelper::WriteBSTRForMarshalling(text, stream.get()), S_OK);
    ASSERT_EQ(CMarshalHelper::WriteBSTRForMarshalling(nullptr, stream.get()), S_OK);
    stream.Rewind();
    BSTR back = SysAllocString(Ole("old").c_str()); // freed by the read
    ASSERT_EQ(CMarshalHelper::ReadBSTRFromMarshalling(&back, stream.get()), S_OK);
    EXPECT_EQ(Ole(back), Ole("xyz"));
    ASSERT_EQ(CMarshalHelper::ReadBSTRFromMarshalling(&back, stream.get()), S_OK);
    EXPECT_EQ(back, nullptr);
    SysFreeString(text);
}

TEST(MarshalHelperArrays, OneDimensionKeepsItsLowerBound) {
    Variant in;
    in.vt = VT_ARRAY | VT_I4;
    in.parray = Vector(VT_I4, -5, 4);
    for (LONG i = 0; i < 4; ++i)
        Data<LONG>(in.parray)[i] = (i + 1) * -1000;
    Variant out;
    RoundTrip(in, out);
    ASSERT_EQ(out.vt, VT_ARRAY | VT_I4);
    ASSERT_EQ(SafeArrayGetDim(out.parray), 1u);
    LONG lower = 0, upper = 0;
    SafeArrayGetLBound(out.parray, 1, &lower);
    SafeArrayGetUBound(out.parray, 1, &upper);
    EXPECT_EQ(lower, -5);
    EXPECT_EQ(upper, -2);
    EXPECT_EQ(std::memcmp(out.parray->pvData, in.parray->pvData, 4 * sizeof(LONG)), 0);
}

TEST(MarshalHelperArrays, TwoDimensionsKeepEachDimensionsBounds) {
    SAFEARRAYBOUND bounds[2] = {{3, 1}, {4, -2}}; // 3 rows from 1, 4 columns from -2
    Variant in;
    in.vt = VT_ARRAY | VT_R8;
    in.parray = SafeArrayCreate(VT_R8, 2, bounds);
    for (int i = 0; i < 12; ++i)
        Data<double>(in.parray)[i] = i * 0.5;
    const Bytes bytes = Marshal(in);
    EXPECT_EQ(bytes.size(), 2u + 2u + 16u + 12u * 10u);
    Variant out;
    RoundTrip(in, out);
    ASSERT_EQ(out.vt, VT_ARRAY | VT_R8);
    ASSERT_EQ(SafeArrayGetDim(out.parray), 2u);
    for (UINT dim = 1; dim <= 2; ++dim) {
        LONG lower = 0, upper = 0;
        SafeArrayGetLBound(out.parray, dim, &lower);
        SafeArrayGetUBound(out.parray, dim, &upper);
        EXPECT_EQ(lower, bounds[dim - 1].lLbound) << dim;
        EXPECT_EQ(upper, bounds[dim - 1].lLbound + LONG(bounds[dim - 1].cElements) - 1) << dim;
    }
    for (int i = 0; i < 12; ++i)
        EXPECT_EQ(Data<double>(out.parray)[i], i * 0.5);
}

TEST(MarshalHelperArrays, StringAndSmallElementsStepByTheirOwnSize) {
    Variant strings;
    strings.vt = VT_ARRAY | VT_BSTR;
    strings.parray = Vector(VT_BSTR, 0, 3);
    Data<BSTR>(strings.parray)[0] = SysAllocString(Ole("first").c_str());
    Data<BSTR>(strings.parray)[2] = SysAllocString(Ole("third").c_str());
    Variant back;
    RoundTrip(strings, back);
    ASSERT_EQ(back.vt, VT_ARRAY | VT_BSTR);
    EXPECT_EQ(Ole(Data<BSTR>(back.parray)[0]), Ole("first"));
    EXPECT_EQ(Data<BSTR>(back.parray)[1], nullptr);
    EXPECT_EQ(Ole(Data<BSTR>(back.parray)[2]), Ole("third"));

    Variant bytes;
    bytes.vt = VT_ARRAY | VT_UI1;
    bytes.parray = Vector(VT_UI1, 0, 3);
    std::memcpy(bytes.parray->pvData, "\x01\xFE\x7F", 3);
    Variant bytesBack;
    RoundTrip(bytes, bytesBack);
    EXPECT_EQ(std::memcmp(bytesBack.parray->pvData, "\x01\xFE\x7F", 3), 0);
}

TEST(MarshalHelperArrays, VariantArraysHoldMixedValuesAndNestedArrays) {
    Variant in;
    in.vt = VT_ARRAY | VT_VARIANT;
    in.parray = Vector(VT_VARIANT, 1, 4);
    VARIANT* items = Data<VARIANT>(in.parray);
    items[0].vt = VT_I4;
    items[0].lVal = 42;
    items[1].vt = VT_BSTR;
    items[1].bstrVal = SysAllocString(Ole("text").c_str());
    // items[2] stays empty
    items[3].vt = VT_ARRAY | VT_I2;
    items[3].parray = Vector(VT_I2, 7, 2);
    Data<SHORT>(items[3].parray)[0] = 11;
    Data<SHORT>(items[3].parray)[1] = 12;
    Variant out;
    RoundTrip(in, out);
    ASSERT_EQ(out.vt, VT_ARRAY | VT_VARIANT);
    const VARIANT* got = Data<VARIANT>(out.parray);
    EXPECT_EQ(got[0].vt, VT_I4);
    EXPECT_EQ(got[0].lVal, 42);
    ASSERT_EQ(got[1].vt, VT_BSTR);
    EXPECT_EQ(Ole(got[1].bstrVal), Ole("text"));
    EXPECT_EQ(got[2].vt, VT_EMPTY);
    ASSERT_EQ(got[3].vt, VT_ARRAY | VT_I2);
    LONG lower = 0;
    SafeArrayGetLBound(got[3].parray, 1, &lower);
    EXPECT_EQ(lower, 7);
    EXPECT_EQ(Data<SHORT>(got[3].parray)[1], 12);
}

TEST(MarshalHelperUnsupported, TypesWithoutAStreamFormWriteOnlyTheirType) {
    // The last carries the reserved flag 0x8000 beside a valid array type.
    const VARTYPE types[] = {VT_NULL,
                             VT_CY,
                             VT_ERROR,
                             VT_BYREF | VT_I4,
                             VT_ARRAY | VT_BYREF | VT_I4,
                             VT_ARRAY | VT_CY,
                             0x8000 | VT_ARRAY | VT_VARIANT};
    LONG target = 0;
    for (VARTYPE type : types) {
        SCOPED_TRACE(type);
        VARIANT v; // not cleared: it owns nothing
        VariantInit(&v);
        v.vt = type;
        v.plVal = &target;
        EXPECT_EQ(SizeOf(v), 2u);
        Stream stream;
        EXPECT_EQ(Write(v, stream), E_NOTIMPL);
        EXPECT_EQ(stream.Contents(),
                  (Bytes{static_cast<unsigned char>(type), static_cast<unsigned char>(type >> 8)}));
        Variant out;
        EXPECT_EQ(ReadFrom(stream.Contents(), out), E_NOTIMPL);
        EXPECT_EQ(out.vt, VT_EMPTY);
    }
}

TEST(MarshalHelperRelease, StepsOverEachRecordToTheNext) {
    Stream stream;
    Variant text;
    text.vt = VT_BSTR;
    text.bstrVal = SysAllocString(Ole("skip me").c_str());
    Variant array;
    array.vt = VT_ARRAY | VT_VARIANT;
    array.parray = Vector(VT_VARIANT, 0, 2);
    Data<VARIANT>(array.parray)[0].vt = VT_R8;
    Variant last;
    last.vt = VT_I2;
    last.iVal = 99;
    ASSERT_EQ(Write(text, stream), S_OK);
    ASSERT_EQ(Write(array, stream), S_OK);
    ASSERT_EQ(Write(last, stream), S_OK);
    stream.Rewind();
    EXPECT_EQ(CMarshalHelper::ReleaseVariantFromMarshalling(stream.get()), S_OK);
    EXPECT_EQ(CMarshalHelper::ReleaseVariantFromMarshalling(stream.get()), S_OK);
    Variant out;
    ASSERT_EQ(CMarshalHelper::ReadVariantFromMarshalling(out, stream.get()), S_OK);
    EXPECT_EQ(out.vt, VT_I2);
    EXPECT_EQ(out.iVal, 99);
}

// Streams cut short: every read fails cleanly, leaves the VARIANT empty and
// leaks nothing (the sanitizer build checks the last).
TEST(MarshalHelperBadStreams, ShortStreamsAreUnexpected) {
    Variant text;
    text.vt = VT_BSTR;
    text.bstrVal = SysAllocString(Ole("abcdef").c_str());
    Variant array;
    array.vt = VT_ARRAY | VT_BSTR;
    array.parray = Vector(VT_BSTR, 0, 3);
    for (int i = 0; i < 3; ++i)
        Data<BSTR>(array.parray)[i] = SysAllocString(Ole("element").c_str());
    Variant r8;
    r8.vt = VT_R8;
    const Bytes records[] = {Marshal(text), Marshal(array), Marshal(r8)};
    for (const Bytes& record : records) {
        for (size_t cut = 0; cut < record.size(); ++cut) {
            SCOPED_TRACE(cut);
            const Bytes shortened(record.begin(), record.begin() + cut);
            Variant out;
            out.vt = VT_I4; // cleared by the read
            EXPECT_EQ(ReadFrom(shortened, out), E_UNEXPECTED);
            EXPECT_EQ(out.vt, VT_EMPTY);
            EXPECT_EQ(ReleaseFrom(shortened), E_UNEXPECTED);
        }
    }
    BSTR s = nullptr;
    Stream oneByte(Bytes{0x08});
    EXPECT_EQ(CMarshalHelper::ReadBSTRFromMarshalling(&s, oneByte.get()), E_UNEXPECTED);
    EXPECT_EQ(s, nullptr);
}

TEST(MarshalHelperBadStreams, HostileCountsFailWithoutAllocating) {
    const VARTYPE i4Array = VT_ARRAY | VT_I4;
    Bytes tooMany = ArrayHeader(i4Array, {{0xFFFFFFFFu, 0}});
    Bytes overflowing = ArrayHeader(i4Array, {{0x10000, 0}, {0x10000, 0}, {0x10000, 0}});
    Bytes beyondStream = ArrayHeader(VT_ARRAY | VT_VARIANT, {{4, 0}});
    beyondStream.insert(beyondStream.end(), {0, 0, 0, 0, 0, 0}); // three of four elements
    Bytes noDimensions = ArrayHeader(i4Array, {});
    Bytes longString = {0x08, 0x00};
    Append32(longString, 0x7FFFFFF0u);
    longString.insert(longString.end(), 16, 0x41);
    Bytes wrongElement = ArrayHeader(VT_ARRAY | VT_I2, {{1, 0}});
    wrongElement.insert(wrongElement.end(), {0x05, 0x00, 1, 2, 3, 4, 5, 6, 7, 8}); // a VT_R8
    Bytes wrongString = ArrayHeader(VT_ARRAY | VT_BSTR, {{1, 0}});
    wrongString.insert(wrongString.end(), {0x03, 0x00, 1, 2, 3, 4}); // a VT_I4
    // Arrays of VARIANTs each holding the next, deeper than any writer goes.
    Bytes deep;
    for (int i = 0; i < 100; ++i) {
        const Bytes header = ArrayHeader(VT_ARRAY | VT_VARIANT, {{1, 0}});
        deep.insert(deep.end(), header.begin(), header.end());
    }
    deep.insert(deep.end(), {0, 0});
    const Bytes cases[] = {tooMany,    overflowing,  beyondStream, noDimensions,
                           longString, wrongElement, wrongString,  deep};
    for (const Bytes& bytes : cases) {
        SCOPED_TRACE(&bytes - cases);
        Variant out;
        EXPECT_EQ(ReadFrom(bytes, out), E_UNEXPECTED);
        EXPECT_EQ(out.vt, VT_EMPTY);
        EXPECT_EQ(ReleaseFrom(bytes), E_UNEXPECTED);
    }
}

TEST(MarshalHelperBadStreams, ArraysNestedToTheLimitStillRead) {
    Bytes nested;
    for (int i = 0; i < 64; ++i) {
        const Bytes header = ArrayHeader(VT_ARRAY | VT_VARIANT, {{1, 0}});
        nested.insert(nested.end(), header.begin(), header.end());
    }
    nested.insert(nested.end(), {0, 0});
    Variant out;
    EXPECT_EQ(ReadFrom(nested, out), S_OK);
    Variant copy;
    RoundTrip(out, copy);
    EXPECT_EQ(ReleaseFrom(nested), S_OK);
}

// A COM object that counts its references and never deletes itself.
class CountingDispatch : public IDispatch {
public:
    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) override {
        if (riid == IID_IUnknown || riid == IID_IDispatch) {
            *object = static_cast<IDispatch*>(this);
            AddRef();
            return S_OK;
        }
        *object = nullptr;
        return E_NOINTERFACE;
    }
    ULONG STDMETHODCALLTYPE AddRef() override { return InterlockedIncrement(&references); }
    ULONG STDMETHODCALLTYPE Release() override { return InterlockedDecrement(&references); }
    HRESULT STDMETHODCALLTYPE GetTypeInfoCount(UINT* count) override {
        *count = 0;
        return S_OK;
    }
    HRESULT STDMETHODCALLTYPE GetTypeInfo(UINT, LCID, ITypeInfo**) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE GetIDsOfNames(REFIID, LPOLESTR*, UINT, LCID, DISPID*) override {
        return E_NOTIMPL;
    }
    HRESULT STDMETHODCALLTYPE Invoke(DISPID, REFIID, LCID, WORD, DISPPARAMS*, VARIANT*, EXCEPINFO*,
                                     UINT*) override {
        return E_NOTIMPL;
    }

    LONG references = 1;
};

class MarshalHelperInterfaces : public ::testing::Test {
protected:
    void SetUp() override { ASSERT_EQ(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED), S_OK); }
    void TearDown() override { CoUninitialize(); }
};

TEST_F(MarshalHelperInterfaces, RoundTripsKeepReferencesBalanced) {
    for (VARTYPE type : {VARTYPE{VT_UNKNOWN}, VARTYPE{VT_DISPATCH}}) {
        SCOPED_TRACE(type);
        CountingDispatch object;
        {
            VARIANT in;
            VariantInit(&in);
            in.vt = type;
            in.pdispVal = &object;
            Stream stream;
            ASSERT_EQ(Write(in, stream), S_OK);
            EXPECT_GT(object.references, 1) << "the packet holds the object";
            EXPECT_GE(SizeOf(in), stream.Position());
            stream.Rewind();
            Variant out;
            ASSERT_EQ(CMarshalHelper::ReadVariantFromMarshalling(out, stream.get()), S_OK);
            EXPECT_EQ(out.vt, type);
            ASSERT_NE(out.punkVal, nullptr);
        }
        EXPECT_EQ(object.references, 1);
    }
}

TEST_F(MarshalHelperInterfaces, ReleaseFreesThePacketsReference) {
    CountingDispatch object;
    {
        Variant array; // pointer-sized elements, and the packets inside a record
        array.vt = VT_ARRAY | VT_UNKNOWN;
        array.parray = Vector(VT_UNKNOWN, 0, 2);
        for (int i = 0; i < 2; ++i) {
            object.AddRef();
            Data<IUnknown*>(array.parray)[i] = &object;
        }
        Stream stream;
        ASSERT_EQ(Write(array, stream), S_OK);
        EXPECT_GT(object.references, 3);
        stream.Rewind();
        EXPECT_EQ(CMarshalHelper::ReleaseVariantFromMarshalling(stream.get()), S_OK);
    }
    EXPECT_EQ(object.references, 1);
}

TEST_F(MarshalHelperInterfaces, InterfaceArraysRoundTrip) {
    CountingDispatch object;
    {
        Variant array;
        array.vt = VT_ARRAY | VT_DISPATCH;
        array.parray = Vector(VT_DISPATCH, 0, 2);
        for (int i = 0; i < 2; ++i) {
            object.AddRef();
            Data<IDispatch*>(array.parray)[i] = &object;
        }
        Variant out;
        RoundTrip(array, out);
        ASSERT_EQ(out.vt, VT_ARRAY | VT_DISPATCH);
        EXPECT_NE(Data<IDispatch*>(out.parray)[1], nullptr);
    }
    EXPECT_EQ(object.references, 1);
}

} // namespace
