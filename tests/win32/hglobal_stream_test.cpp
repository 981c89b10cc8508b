// Streams on global memory: reading, writing and seeking, growth of the block,
// clones that share it, copying to other streams, and who frees the block.
#include "support/wine.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cstring>
#include <string>

namespace {

// A stream that is not made on global memory: it keeps what is written to it,
// and takes at most `room` bytes in all.
class StringStream : public IStream {
public:
    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) override {
        if (riid == IID_IUnknown || riid == IID_ISequentialStream || riid == IID_IStream) {
            *object = static_cast<IStream*>(this);
            AddRef();
            return S_OK;
        }
        *object = nullptr;
        return E_NOINTERFACE;
    }
    ULONG STDMETHODCALLTYPE AddRef() override { return ++references; }
    ULONG STDMETHODCALLTYPE Release() override { return --references; }
    HRESULT STDMETHODCALLTYPE Read(void*, ULONG, ULONG* read) override {
        if (read)
            *read = 0;
        return S_OK;
    }
    HRESULT STDMETHODCALLTYPE Write(const void* data, ULONG count, ULONG* written) override {
        ULONG taken = count < room - bytes.size() ? count : static_cast<ULONG>(room - bytes.size());
        bytes.append(static_cast<const char*>(data), taken);
        if (written)
            *written = taken;
        return taken == count ? S_OK : STG_E_MEDIUMFULL;
    }
    HRESULT STDMETHODCALLTYPE Seek(LARGE_INTEGER, DWORD, ULARGE_INTEGER*) override {
        return STG_E_INVALIDFUNCTION;
    }
    HRESULT STDMETHODCALLTYPE SetSize(ULARGE_INTEGER) override { return STG_E_INVALIDFUNCTION; }
    HRESULT STDMETHODCALLTYPE CopyTo(IStream*, ULARGE_INTEGER, ULARGE_INTEGER*,
                                     ULARGE_INTEGER*) override {
        return STG_E_INVALIDFUNCTION;
    }
    HRESULT STDMETHODCALLTYPE Commit(DWORD) override { return S_OK; }
    HRESULT STDMETHODCALLTYPE Revert() override { return S_OK; }
    HRESULT STDMETHODCALLTYPE LockRegion(ULARGE_INTEGER, ULARGE_INTEGER, DWORD) override {
        return STG_E_INVALIDFUNCTION;
    }
    HRESULT STDMETHODCALLTYPE UnlockRegion(ULARGE_INTEGER, ULARGE_INTEGER, DWORD) override {
        return STG_E_INVALIDFUNCTION;
    }
    HRESULT STDMETHODCALLTYPE Stat(STATSTG*, DWORD) override { return STG_E_INVALIDFUNCTION; }
    HRESULT STDMETHODCALLTYPE Clone(IStream**) override { return STG_E_INVALIDFUNCTION; }

    std::string bytes;
    std::string::size_type room = std::string::npos;
    ULONG references = 1;
};

LARGE_INTEGER Move(LONGLONG value) {
    LARGE_INTEGER move;
    move.QuadPart = value;
    return move;
}

ULARGE_INTEGER Size(ULONGLONG value) {
    ULARGE_INTEGER size;
    size.QuadPart = value;
    return size;
}

ULONGLONG SeekTo(IStream* stream, LONGLONG move, DWORD origin) {
    ULARGE_INTEGER position;
    position.QuadPart = 0xBAD;
    EXPECT_EQ(stream->Seek(Move(move), origin, &position), S_OK);
    return position.QuadPart;
}

ULONGLONG StreamSize(IStream* stream) {
    STATSTG stat;
    std::memset(&stat, 0xCC, sizeof stat);
    EXPECT_EQ(stream->Stat(&stat, STATFLAG_NONAME), S_OK);
    return stat.cbSize.QuadPart;
}

std::string ReadAll(IStream* stream, ULONG most = 1024) {
    std::string text(most, '\0');
    ULONG read = 0xBAD;
    EXPECT_EQ(stream->Read(&text[0], most, &read), S_OK);
    text.resize(read <= most ? read : 0);
    return text;
}

void WriteText(IStream* stream, const std::string& text) {
    ULONG written = 0xBAD;
    ASSERT_EQ(stream->Write(text.data(), static_cast<ULONG>(text.size()), &written), S_OK);
    EXPECT_EQ(written, text.size());
}

// A movable block holding text, as a caller hands one to a stream.
HGLOBAL BlockHolding(const std::string& text) {
    HGLOBAL block = GlobalAlloc(GMEM_MOVEABLE, text.size());
    if (block) {
        std::memcpy(GlobalLock(block), text.data(), text.size());
        GlobalUnlock(block);
    }
    return block;
}

std::string BlockText(HGLOBAL block, SIZE_T bytes) {
    const char* data = static_cast<const char*>(GlobalLock(block));
    if (!data)
        return "<not lockable>";
    std::string text(data, bytes);
    GlobalUnlock(block);
    return text;
}

TEST(HGlobalStreamTest, ANewStreamGrowsAsItIsWrittenAndReadsBack) {
    IStream* stream = nullptr;
    ASSERT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, &stream), S_OK);
    ASSERT_NE(stream, nullptr);
    EXPECT_EQ(StreamSize(stream), 0u);
    EXPECT_EQ(ReadAll(stream), "");

    WriteText(stream, "hello");
    WriteText(stream, " world");
    EXPECT_EQ(StreamSize(stream), 11u);
    EXPECT_EQ(SeekTo(stream, 0, STREAM_SEEK_CUR), 11u);
    EXPECT_EQ(SeekTo(stream, 0, STREAM_SEEK_SET), 0u);
    EXPECT_EQ(ReadAll(stream, 5), "hello");
    EXPECT_EQ(ReadAll(stream), " world"); // stops at the end, still S_OK
    EXPECT_EQ(ReadAll(stream), "");

    // The block holds the bytes; it may be larger than the stream.
    HGLOBAL block = nullptr;
    ASSERT_EQ(GetHGlobalFromStream(stream, &block), S_OK);
    ASSERT_NE(block, nullptr);
    EXPECT_GE(GlobalSize(block), 11u);
    EXPECT_EQ(BlockText(block, 11), "hello world");

    // Nothing to write is no change, wherever the pointer is.
    SeekTo(stream, 100, STREAM_SEEK_SET);
    ULONG written = 0xBAD;
    EXPECT_EQ(stream->Write("x", 0, &written), S_OK);
    EXPECT_EQ(written, 0u);
    EXPECT_EQ(StreamSize(stream), 11u);
    EXPECT_EQ(stream->Release(), 0u);
}

TEST(HGlobalStreamTest, AGivenBlockIsTheFirstContentsAndOutlivesTheStreamUnlessOwned) {
    HGLOBAL block = BlockHolding("abcdefgh");
    ASSERT_NE(block, nullptr);
    IStream* stream = nullptr;
    ASSERT_EQ(CreateStreamOnHGlobal(block, FALSE, &stream), S_OK);
    EXPECT_EQ(StreamSize(stream), 8u);
    EXPECT_EQ(SeekTo(stream, 0, STREAM_SEEK_CUR), 0u); // starts at the beginning
    EXPECT_EQ(ReadAll(stream, 3), "abc");
    WriteText(stream, "DE");
    HGLOBAL same = nullptr;
    ASSERT_EQ(GetHGlobalFromStream(stream, &same), S_OK);
    EXPECT_EQ(same, block);
    EXPECT_EQ(stream->Release(), 0u);

    // Not the stream's to free: still valid, with the stream's writes.
    EXPECT_EQ(GlobalSize(block), 8u);
    EXPECT_EQ(BlockText(block, 8), "abcDEfgh");
    EXPECT_EQ(GlobalFree(block), nullptr);
}

TEST(HGlobalStreamTest, AnOwnedBlockIsFreedWithTheLastStreamThatSharesIt) {
    HGLOBAL block = BlockHolding("shared");
    ASSERT_NE(block, nullptr);
    IStream* stream = nullptr;
    ASSERT_EQ(CreateStreamOnHGlobal(block, TRUE, &stream), S_OK);
    IStream* clone = nullptr;
    ASSERT_EQ(stream->Clone(&clone), S_OK);
    ASSERT_NE(clone, nullptr);

    EXPECT_EQ(stream->Release(), 0u);
    EXPECT_EQ(GlobalSize(block), 6u); // the clone still uses it
    EXPECT_EQ(ReadAll(clone), "shared");
    EXPECT_EQ(clone->Release(), 0u);
    EXPECT_EQ(GlobalSize(block), 0u);
}

TEST(HGlobalStreamTest, ReadsStopAtTheEndAndWritesPastItGrowTheStream) {
    IStream* stream = nullptr;
    ASSERT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, &stream), S_OK);
    WriteText(stream, "12345678");

    EXPECT_EQ(SeekTo(stream, 6, STREAM_SEEK_SET), 6u);
    EXPECT_EQ(ReadAll(stream, 100), "78");
    EXPECT_EQ(SeekTo(stream, 0, STREAM_SEEK_CUR), 8u);

    // Seeking past the end does not grow the stream.
    EXPECT_EQ(SeekTo(stream, 4, STREAM_SEEK_END), 12u);
    EXPECT_EQ(StreamSize(stream), 8u);

    // Writing there grows it to the end of the write; the gap's bytes are undefined.
    WriteText(stream, "xy");
    EXPECT_EQ(StreamSize(stream), 14u);
    EXPECT_EQ(SeekTo(stream, -2, STREAM_SEEK_END), 12u);
    EXPECT_EQ(ReadAll(stream), "xy");
    EXPECT_EQ(SeekTo(stream, 0, STREAM_SEEK_SET), 0u);
    EXPECT_EQ(ReadAll(stream, 8), "12345678");

    // Growth by many writes keeps every byte.
    SeekTo(stream, 0, STREAM_SEEK_SET);
    std::string expected;
    for (int i = 0; i < 2000; ++i) {
        std::string piece = std::to_string(i) + ",";
        WriteText(stream, piece);
        expected += piece;
    }
    EXPECT_EQ(StreamSize(stream), expected.size());
    SeekTo(stream, 0, STREAM_SEEK_SET);
    EXPECT_EQ(ReadAll(stream, 100000), expected);
    EXPECT_EQ(stream->Release(), 0u);
}

TEST(HGlobalStreamTest, ReadingPastTheEndFindsNothing) {
    if (vaskel_test::RunningOnWine())
        GTEST_SKIP() << "Wine reads beyond the block when the seek pointer is past the end";
    IStream* stream = nullptr;
    ASSERT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, &stream), S_OK);
    WriteText(stream, "0123456789");
    EXPECT_EQ(SeekTo(stream, 4, STREAM_SEEK_END), 14u);
    EXPECT_EQ(ReadAll(stream), "");
    EXPECT_EQ(SeekTo(stream, 0, STREAM_SEEK_CUR), 14u);

    // Shrinking the stream under the pointer leaves the pointer past the end.
    SeekTo(stream, 8, STREAM_SEEK_SET);
    EXPECT_EQ(stream->SetSize(Size(4)), S_OK);
    EXPECT_EQ(SeekTo(stream, 0, STREAM_SEEK_CUR), 8u);
    EXPECT_EQ(ReadAll(stream), "");
    EXPECT_EQ(stream->Release(), 0u);
}

TEST(HGlobalStreamTest, SeekingBeforeTheStartFailsAndLeavesThePointer) {
    IStream* stream = nullptr;
    ASSERT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, &stream), S_OK);
    WriteText(stream, "12345678");
    EXPECT_EQ(SeekTo(stream, 5, STREAM_SEEK_SET), 5u);
    EXPECT_EQ(SeekTo(stream, -2, STREAM_SEEK_CUR), 3u);
    EXPECT_EQ(SeekTo(stream, -3, STREAM_SEEK_CUR), 0u);
    EXPECT_EQ(SeekTo(stream, -8, STREAM_SEEK_END), 0u);
    EXPECT_EQ(stream->Seek(Move(2), STREAM_SEEK_SET, nullptr), S_OK); // no output wanted

    ULARGE_INTEGER position;
    position.QuadPart = 0xBAD;
    EXPECT_EQ(stream->Seek(Move(-3), STREAM_SEEK_CUR, &position), STG_E_SEEKERROR);
    EXPECT_EQ(stream->Seek(Move(-9), STREAM_SEEK_END, &position), STG_E_SEEKERROR);
    EXPECT_EQ(stream->Seek(Move(1), STREAM_SEEK_END + 1, &position), STG_E_SEEKERROR);
    EXPECT_EQ(SeekTo(stream, 0, STREAM_SEEK_CUR), 2u);
    EXPECT_EQ(ReadAll(stream, 1), "3");
    EXPECT_EQ(stream->Release(), 0u);
}

TEST(HGlobalStreamTest, AHugeSeekNeverWrapsNorAllocatesAbsurdly) {
    IStream* stream = nullptr;
    ASSERT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, &stream), S_OK);
    WriteText(stream, "12345678");

    // The seek pointer is 64 bits in the interface but the block holds at most
    // 4 GiB - 1; a write whose end lies beyond must fail without touching it.
    const LONGLONG offsets[] = {LONGLONG(1) << 62, LONGLONG(0x7FFFFFFFFFFFFFFF), 0xFFFFFFFF};
    for (LONGLONG offset : offsets) {
        SCOPED_TRACE(offset);
        stream->Seek(Move(offset), STREAM_SEEK_SET, nullptr);
        ULONG written = 0xBAD;
        HRESULT hr = stream->Write("ab", 2, &written);
        if (FAILED(hr)) {
            EXPECT_EQ(written, 0u);
            EXPECT_EQ(StreamSize(stream), 8u);
        } else {
            // A platform that keeps 32-bit seek pointers drops the high part.
            EXPECT_LE(StreamSize(stream), 10u);
        }
        stream->SetSize(Size(8));
    }
    // Past 2^64 - 1 there is no position to go to: the pointer must not wrap.
    // (A platform that keeps 32-bit seek pointers never gets this far.)
    const ULONGLONG quarter = ULONGLONG(1) << 62;
    if (SeekTo(stream, static_cast<LONGLONG>(quarter), STREAM_SEEK_SET) == quarter) {
        EXPECT_EQ(SeekTo(stream, static_cast<LONGLONG>(quarter), STREAM_SEEK_CUR), 2 * quarter);
        EXPECT_EQ(SeekTo(stream, static_cast<LONGLONG>(quarter), STREAM_SEEK_CUR), 3 * quarter);
        ULARGE_INTEGER position;
        EXPECT_EQ(stream->Seek(Move(static_cast<LONGLONG>(quarter)), STREAM_SEEK_CUR, &position),
                  STG_E_SEEKERROR);
        EXPECT_EQ(position.QuadPart, 3 * quarter);
        // Reading out there finds nothing.
        EXPECT_EQ(ReadAll(stream), "");
    }
    EXPECT_EQ(stream->Release(), 0u);
}

TEST(HGlobalStreamTest, SetSizeShrinksAndGrowsKeepingTheBytesThatRemain) {
    IStream* stream = nullptr;
    ASSERT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, &stream), S_OK);
    WriteText(stream, "0123456789");

    EXPECT_EQ(stream->SetSize(Size(4)), S_OK);
    EXPECT_EQ(StreamSize(stream), 4u);
    EXPECT_EQ(SeekTo(stream, 0, STREAM_SEEK_CUR), 10u); // the pointer stays
    SeekTo(stream, 0, STREAM_SEEK_SET);
    EXPECT_EQ(ReadAll(stream), "0123");

    EXPECT_EQ(stream->SetSize(Size(16)), S_OK);
    EXPECT_EQ(StreamSize(stream), 16u);
    SeekTo(stream, 0, STREAM_SEEK_SET);
    EXPECT_EQ(ReadAll(stream, 4), "0123");
    EXPECT_EQ(ReadAll(stream).size(), 12u);

    EXPECT_EQ(stream->SetSize(Size(0)), S_OK);
    EXPECT_EQ(StreamSize(stream), 0u);
    SeekTo(stream, 0, STREAM_SEEK_SET);
    WriteText(stream, "again");
    SeekTo(stream, 0, STREAM_SEEK_SET);
    EXPECT_EQ(ReadAll(stream), "again");

    // Beyond 4 GiB - 1 the block cannot go.
    if (vaskel_test::RunningOnWine()) {
        stream->Release();
        GTEST_SKIP() << "Wine drops the high 32 bits of the new size";
    }
    EXPECT_TRUE(FAILED(stream->SetSize(Size(ULONGLONG(1) << 32))));
    EXPECT_EQ(StreamSize(stream), 5u);
    EXPECT_EQ(stream->Release(), 0u);
}

TEST(HGlobalStreamTest, StatDescribesAnUnnamedStream) {
    IStream* stream = nullptr;
    ASSERT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, &stream), S_OK);
    WriteText(stream, "abc");
    for (DWORD flag : {DWORD(STATFLAG_DEFAULT), DWORD(STATFLAG_NONAME)}) {
        STATSTG stat;
        std::memset(&stat, 0xCC, sizeof stat);
        ASSERT_EQ(stream->Stat(&stat, flag), S_OK);
        EXPECT_EQ(stat.type, static_cast<DWORD>(STGTY_STREAM));
        EXPECT_EQ(stat.cbSize.QuadPart, 3u);
        EXPECT_EQ(stat.pwcsName, nullptr);
    }
    EXPECT_EQ(stream->Release(), 0u);
}

TEST(HGlobalStreamTest, ACloneSharesTheBytesWithAPointerOfItsOwn) {
    IStream* stream = nullptr;
    ASSERT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, &stream), S_OK);
    WriteText(stream, "abcdef");
    SeekTo(stream, 2, STREAM_SEEK_SET);
    IStream* clone = nullptr;
    ASSERT_EQ(stream->Clone(&clone), S_OK);
    EXPECT_EQ(SeekTo(clone, 0, STREAM_SEEK_CUR), 2u); // starts where the original is

    EXPECT_EQ(ReadAll(clone, 2), "cd");
    EXPECT_EQ(SeekTo(stream, 0, STREAM_SEEK_CUR), 2u);
    WriteText(stream, "CDEFGH"); // grows the shared block
    EXPECT_EQ(StreamSize(clone), 8u);
    EXPECT_EQ(ReadAll(clone), "EFGH");

    HGLOBAL original = nullptr;
    HGLOBAL cloned = nullptr;
    ASSERT_EQ(GetHGlobalFromStream(stream, &original), S_OK);
    ASSERT_EQ(GetHGlobalFromStream(clone, &cloned), S_OK);
    EXPECT_EQ(original, cloned);

    EXPECT_EQ(clone->SetSize(Size(3)), S_OK);
    EXPECT_EQ(StreamSize(stream), 3u);
    EXPECT_EQ(clone->Release(), 0u);
    EXPECT_EQ(stream->Release(), 0u);
}

TEST(HGlobalStreamTest, CopyToWritesWhatItReadsFromThePointerOn) {
    IStream* stream = nullptr;
    ASSERT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, &stream), S_OK);
    std::string text;
    for (int i = 0; i < 30000; ++i)
        text += static_cast<char>('a' + i % 26); // more than one buffer's worth
    WriteText(stream, text);
    SeekTo(stream, 10, STREAM_SEEK_SET);

    StringStream target;
    ULARGE_INTEGER read;
    ULARGE_INTEGER written;
    ASSERT_EQ(stream->CopyTo(&target, Size(5), &read, &written), S_OK);
    EXPECT_EQ(read.QuadPart, 5u);
    EXPECT_EQ(written.QuadPart, 5u);
    EXPECT_EQ(target.bytes, text.substr(10, 5));
    EXPECT_EQ(SeekTo(stream, 0, STREAM_SEEK_CUR), 15u);

    // Asking for more than there is copies the rest.
    ASSERT_EQ(stream->CopyTo(&target, Size(~0ull), &read, &written), S_OK);
    EXPECT_EQ(read.QuadPart, text.size() - 15);
    EXPECT_EQ(written.QuadPart, text.size() - 15);
    EXPECT_EQ(target.bytes, text.substr(10));
    EXPECT_EQ(target.references, 1u);

    // Into another stream on global memory, without wanting the counts.
    IStream* other = nullptr;
    ASSERT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, &other), S_OK);
    SeekTo(stream, 0, STREAM_SEEK_SET);
    ASSERT_EQ(stream->CopyTo(other, Size(text.size()), nullptr, nullptr), S_OK);
    SeekTo(other, 0, STREAM_SEEK_SET);
    EXPECT_EQ(ReadAll(other, 100000), text);
    EXPECT_EQ(other->Release(), 0u);
    EXPECT_EQ(stream->Release(), 0u);
}

TEST(HGlobalStreamTest, CopyToReportsAShortWrite) {
    IStream* stream = nullptr;
    ASSERT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, &stream), S_OK);
    WriteText(stream, "0123456789");
    SeekTo(stream, 0, STREAM_SEEK_SET);
    StringStream target;
    target.room = 4;
    ULARGE_INTEGER read;
    ULARGE_INTEGER written;
    EXPECT_TRUE(FAILED(stream->CopyTo(&target, Size(10), &read, &written)));
    EXPECT_EQ(target.bytes, "0123");
    EXPECT_EQ(stream->Release(), 0u);
}

TEST(HGlobalStreamTest, TransactionsDoNothingAndRegionLocksAreNotSupported) {
    IStream* stream = nullptr;
    ASSERT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, &stream), S_OK);
    WriteText(stream, "kept");
    EXPECT_EQ(stream->Commit(STGC_DEFAULT), S_OK);
    EXPECT_EQ(stream->Revert(), S_OK);
    EXPECT_EQ(StreamSize(stream), 4u);
    EXPECT_EQ(stream->LockRegion(Size(0), Size(4), LOCK_WRITE), STG_E_INVALIDFUNCTION);
    if (vaskel_test::RunningOnWine()) {
        stream->Release();
        GTEST_SKIP() << "Wine reports success for UnlockRegion though it supports no locks";
    }
    EXPECT_EQ(stream->UnlockRegion(Size(0), Size(4), LOCK_WRITE), STG_E_INVALIDFUNCTION);
    EXPECT_EQ(stream->Release(), 0u);
}

TEST(HGlobalStreamTest, QueryInterfaceGivesTheStreamInterfacesOnly) {
    IStream* stream = nullptr;
    ASSERT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, &stream), S_OK);
    for (const IID* iid : {&IID_IUnknown, &IID_ISequentialStream, &IID_IStream}) {
        void* object = nullptr;
        ASSERT_EQ(stream->QueryInterface(*iid, &object), S_OK);
        EXPECT_EQ(object, static_cast<void*>(stream));
        EXPECT_EQ(static_cast<IUnknown*>(object)->Release(), 1u);
    }
    void* object = &object;
    EXPECT_EQ(stream->QueryInterface(IID_IDispatch, &object), E_NOINTERFACE);
    EXPECT_EQ(object, nullptr);
    EXPECT_EQ(stream->AddRef(), 2u);
    EXPECT_EQ(stream->Release(), 1u);
    EXPECT_EQ(stream->Release(), 0u);
}

TEST(HGlobalStreamTest, BadArgumentsFailCleanly) {
    EXPECT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, nullptr), E_INVALIDARG);

    IStream* stream = nullptr;
    ASSERT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, &stream), S_OK);
    HGLOBAL block = reinterpret_cast<HGLOBAL>(1);
    EXPECT_EQ(GetHGlobalFromStream(nullptr, &block), E_INVALIDARG);
    EXPECT_EQ(GetHGlobalFromStream(stream, nullptr), E_INVALIDARG);

    // A stream of another kind has no block to give, and is not mistaken for one.
    StringStream foreign;
    block = reinterpret_cast<HGLOBAL>(1);
    EXPECT_EQ(GetHGlobalFromStream(&foreign, &block), E_INVALIDARG);
    EXPECT_EQ(block, nullptr);

    if (vaskel_test::RunningOnWine()) {
        stream->Release();
        GTEST_SKIP() << "Wine copies from a null buffer instead of giving STG_E_INVALIDPOINTER";
    }
    ULONG written = 0xBAD;
    EXPECT_EQ(stream->Write(nullptr, 4, &written), STG_E_INVALIDPOINTER);
    EXPECT_EQ(written, 0u);
    EXPECT_EQ(StreamSize(stream), 0u);
    EXPECT_EQ(stream->Release(), 0u);
}

} // namespace
