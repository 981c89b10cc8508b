// Interface marshalling within the process: packets that give back the same
// object, that are consumed or kept as their flags say, that release their
// reference, and that refuse to be forged, cut short or read by a thread
// outside COM.
#include "support/persist_object.h"
#include "support/wine.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <atomic>
#include <cstring>
#include <future>
#include <thread>
#include <vector>

namespace {

using vaskel_test::PersistObject;

// An object that answers IUnknown only.
class PlainObject : public IUnknown {
public:
    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) override {
        if (riid == IID_IUnknown) {
            AddRef();
            *object = this;
            return S_OK;
        }
        *object = nullptr;
        return E_NOINTERFACE;
    }
    ULONG STDMETHODCALLTYPE AddRef() override { return ++references; }
    ULONG STDMETHODCALLTYPE Release() override { return --references; }

    std::atomic<ULONG> references{1};
};

// Wine leaves the output of a failed unmarshal as it was, so the tests start
// it at null and check that it stays so.
IStream* NewStream() {
    IStream* stream = nullptr;
    EXPECT_EQ(CreateStreamOnHGlobal(nullptr, TRUE, &stream), S_OK);
    return stream;
}

void Rewind(IStream* stream) {
    LARGE_INTEGER start{};
    ASSERT_EQ(stream->Seek(start, STREAM_SEEK_SET, nullptr), S_OK);
}

ULONGLONG Position(IStream* stream) {
    LARGE_INTEGER none{};
    ULARGE_INTEGER position{};
    EXPECT_EQ(stream->Seek(none, STREAM_SEEK_CUR, &position), S_OK);
    return position.QuadPart;
}

// Marshals the object's interface into the stream for this process.
HRESULT Marshal(IStream* stream, REFIID iid, IUnknown* object, DWORD flags) {
    return CoMarshalInterface(stream, iid, object, MSHCTX_INPROC, nullptr, flags);
}

// The packet at the stream's start no longer reads, and leaves the output null.
void ExpectUnreadable(IStream* stream, REFIID iid) {
    Rewind(stream);
    void* out = nullptr;
    EXPECT_TRUE(FAILED(CoUnmarshalInterface(stream, iid, &out)));
    EXPECT_EQ(out, nullptr);
}

std::vector<unsigned char> Contents(IStream* stream) {
    STATSTG stat{};
    EXPECT_EQ(stream->Stat(&stat, STATFLAG_NONAME), S_OK);
    std::vector<unsigned char> bytes(static_cast<size_t>(stat.cbSize.QuadPart));
    Rewind(stream);
    ULONG read = 0;
    EXPECT_EQ(stream->Read(bytes.data(), static_cast<ULONG>(bytes.size()), &read), S_OK);
    EXPECT_EQ(read, bytes.size());
    Rewind(stream);
    return bytes;
}

IStream* StreamOf(const std::vector<unsigned char>& bytes) {
    IStream* stream = NewStream();
    ULONG written = 0;
    if (!bytes.empty()) {
        EXPECT_EQ(stream->Write(bytes.data(), static_cast<ULONG>(bytes.size()), &written), S_OK);
    }
    Rewind(stream);
    return stream;
}

// The tests' thread is in a single-threaded apartment, so that no
// multithreaded apartment exists for other threads to join implicitly. Each
// test releases what it marshalled before its objects go out of scope.
class MarshalTest : public ::testing::Test {
protected:
    void SetUp() override { ASSERT_TRUE(SUCCEEDED(CoInitialize(nullptr))); }
    void TearDown() override { CoUninitialize(); }
};

TEST_F(MarshalTest, NormalPacketGivesTheSameObjectOnceAndBalancesReferences) {
    PersistObject object;
    IStream* stream = NewStream();
    ULONG size = 0;
    ASSERT_EQ(
        CoGetMarshalSizeMax(&size, IID_IPersist, &object, MSHCTX_INPROC, nullptr, MSHLFLAGS_NORMAL),
        S_OK);
    ASSERT_EQ(Marshal(stream, IID_IPersist, &object, MSHLFLAGS_NORMAL), S_OK);
    EXPECT_LE(Position(stream), size) << "the size is an upper bound";
    EXPECT_GT(object.references.load(), 1u) << "the packet holds the object";

    Rewind(stream);
    IPersist* persist = nullptr;
    ASSERT_EQ(CoUnmarshalInterface(stream, IID_IPersist, reinterpret_cast<void**>(&persist)), S_OK);
    EXPECT_EQ(persist, static_cast<IPersist*>(&object)) << "same apartment: the object itself";
    IUnknown* identity = nullptr;
    ASSERT_EQ(persist->QueryInterface(IID_IUnknown, reinterpret_cast<void**>(&identity)), S_OK);
    EXPECT_EQ(identity, static_cast<IUnknown*>(&object));
    identity->Release();
    persist->Release();
    EXPECT_EQ(object.references.load(), 1u) << "reading a normal packet consumes it";

    ExpectUnreadable(stream, IID_IPersist);
    EXPECT_EQ(object.references.load(), 1u);
    stream->Release();
}

TEST_F(MarshalTest, NullIidGivesTheMarshalledInterface) {
    PersistObject object;
    IStream* stream = NewStream();
    ASSERT_EQ(Marshal(stream, IID_IPersist, &object, MSHLFLAGS_NORMAL), S_OK);
    Rewind(stream);
    void* out = nullptr;
    ASSERT_EQ(CoUnmarshalInterface(stream, IID_NULL, &out), S_OK);
    EXPECT_EQ(out, static_cast<IPersist*>(&object));
    static_cast<IUnknown*>(out)->Release();
    EXPECT_EQ(object.references.load(), 1u);
    stream->Release();
}

TEST_F(MarshalTest, ReleasedPacketDropsItsReferenceAndCannotBeRead) {
    PersistObject object;
    IStream* stream = NewStream();
    ASSERT_EQ(Marshal(stream, IID_IUnknown, &object, MSHLFLAGS_NORMAL), S_OK);
    const ULONGLONG packetEnd = Position(stream);
    Rewind(stream);
    ASSERT_EQ(CoReleaseMarshalData(stream), S_OK);
    EXPECT_EQ(Position(stream), packetEnd) << "the stream is left after the packet";
    EXPECT_EQ(object.references.load(), 1u);

    ExpectUnreadable(stream, IID_IUnknown);
    EXPECT_EQ(object.references.load(), 1u);
    stream->Release();
}

TEST_F(MarshalTest, TablePacketReadsManyTimesUntilReleased) {
    PersistObject object;
    IStream* stream = NewStream();
    ASSERT_EQ(Marshal(stream, IID_IPersist, &object, MSHLFLAGS_TABLESTRONG), S_OK);
    for (int i = 0; i < 3; ++i) {
        Rewind(stream);
        IUnknown* out = nullptr;
        ASSERT_EQ(CoUnmarshalInterface(stream, IID_IUnknown, reinterpret_cast<void**>(&out)), S_OK)
            << "read " << i;
        EXPECT_EQ(out, static_cast<IUnknown*>(&object));
        out->Release();
        EXPECT_GT(object.references.load(), 1u) << "the table still holds it";
    }
    Rewind(stream);
    ASSERT_EQ(CoReleaseMarshalData(stream), S_OK);
    EXPECT_EQ(object.references.load(), 1u);
    stream->Release();
}

TEST_F(MarshalTest, ObjectWithoutTheInterfaceIsRefusedAtMarshalTime) {
    PlainObject object;
    IStream* stream = NewStream();
    EXPECT_EQ(Marshal(stream, IID_IPersist, &object, MSHLFLAGS_NORMAL), E_NOINTERFACE);
    EXPECT_EQ(Position(stream), 0u) << "nothing written";
    EXPECT_EQ(object.references.load(), 1u);
    stream->Release();
}

TEST_F(MarshalTest, WrongInterfaceAtUnmarshalTimeFailsAndLeavesATablePacket) {
    PlainObject object;
    IStream* stream = NewStream();
    ASSERT_EQ(Marshal(stream, IID_IUnknown, &object, MSHLFLAGS_TABLESTRONG), S_OK);
    Rewind(stream);
    void* out = nullptr;
    EXPECT_EQ(CoUnmarshalInterface(stream, IID_IPersist, &out), E_NOINTERFACE);
    EXPECT_EQ(out, nullptr);
    Rewind(stream);
    ASSERT_EQ(CoReleaseMarshalData(stream), S_OK);
    EXPECT_EQ(object.references.load(), 1u);
    stream->Release();
}

TEST_F(MarshalTest, DamagedPacketsAreRefused) {
    PersistObject object;
    IStream* stream = NewStream();
    ASSERT_EQ(Marshal(stream, IID_IPersist, &object, MSHLFLAGS_TABLESTRONG), S_OK);
    const std::vector<unsigned char> packet = Contents(stream);
    ASSERT_GT(packet.size(), 8u);

    // A changed signature, a packet cut short, an empty stream and a stream of
    // garbage as long as the packet.
    std::vector<unsigned char> badSignature = packet;
    badSignature[0] ^= 0xFF;
    std::vector<unsigned char> truncated(packet.begin(), packet.begin() + packet.size() / 2);
    std::vector<unsigned char> garbage(packet.size(), 0x5A);
    const std::vector<unsigned char> cases[] = {badSignature, truncated, {}, garbage};
    for (const auto& bytes : cases) {
        IStream* bad = StreamOf(bytes);
        void* out = nullptr;
        EXPECT_TRUE(FAILED(CoUnmarshalInterface(bad, IID_IPersist, &out))) << bytes.size();
        EXPECT_EQ(out, nullptr);
        Rewind(bad);
        EXPECT_TRUE(FAILED(CoReleaseMarshalData(bad))) << bytes.size();
        bad->Release();
    }

    ASSERT_EQ(CoReleaseMarshalData(stream), S_OK) << "the real packet is untouched";
    EXPECT_EQ(object.references.load(), 1u);
    stream->Release();
}

#ifndef _WIN32
// Windows trusts the bytes of a packet; here every byte is checked, so that a
// packet cannot name another entry or come from another process.
TEST_F(MarshalTest, EveryAlteredByteIsRefusedWithoutTouchingTheObject) {
    PersistObject object;
    IStream* stream = NewStream();
    ASSERT_EQ(Marshal(stream, IID_IPersist, &object, MSHLFLAGS_TABLESTRONG), S_OK);
    const std::vector<unsigned char> packet = Contents(stream);
    for (size_t i = 0; i < packet.size(); ++i) {
        std::vector<unsigned char> forged = packet;
        forged[i] ^= 0x01;
        IStream* bad = StreamOf(forged);
        void* out = nullptr;
        HRESULT hr = CoUnmarshalInterface(bad, IID_IUnknown, &out);
        EXPECT_TRUE(hr == RPC_E_INVALID_OBJREF || hr == CO_E_OBJNOTCONNECTED) << "byte " << i;
        EXPECT_EQ(out, nullptr);
        Rewind(bad);
        EXPECT_TRUE(FAILED(CoReleaseMarshalData(bad))) << "byte " << i;
        bad->Release();
    }
    IStream* cut = StreamOf(std::vector<unsigned char>(packet.begin(), packet.end() - 1));
    void* out = nullptr;
    EXPECT_EQ(CoUnmarshalInterface(cut, IID_IUnknown, &out), STG_E_READFAULT);
    cut->Release();

    ASSERT_EQ(CoReleaseMarshalData(stream), S_OK);
    EXPECT_EQ(object.references.load(), 1u);
    IStream* stale = StreamOf(packet);
    EXPECT_EQ(CoUnmarshalInterface(stale, IID_IUnknown, &out), CO_E_OBJNOTCONNECTED);
    stale->Release();
    stream->Release();
}

TEST_F(MarshalTest, SizeOfAnInterfaceTheObjectLacksIsRefused) {
    PlainObject object;
    ULONG size = 1;
    EXPECT_EQ(
        CoGetMarshalSizeMax(&size, IID_IPersist, &object, MSHCTX_INPROC, nullptr, MSHLFLAGS_NORMAL),
        E_NOINTERFACE);
    EXPECT_EQ(size, 0u);
}
#endif

TEST_F(MarshalTest, PacketReadInTheSameMultithreadedApartmentGivesTheObject) {
    PersistObject object;
    std::thread owner([&] {
        ASSERT_EQ(CoInitializeEx(nullptr, COINIT_MULTITHREADED), S_OK);
        IStream* stream = NewStream();
        ASSERT_EQ(Marshal(stream, IID_IPersist, &object, MSHLFLAGS_TABLESTRONG), S_OK);
        std::thread reader([&] {
            ASSERT_EQ(CoInitializeEx(nullptr, COINIT_MULTITHREADED), S_OK);
            IStream* clone = nullptr;
            ASSERT_EQ(stream->Clone(&clone), S_OK);
            Rewind(clone);
            IPersist* persist = nullptr;
            EXPECT_EQ(CoUnmarshalInterface(clone, IID_IPersist, reinterpret_cast<void**>(&persist)),
                      S_OK);
            EXPECT_EQ(persist, static_cast<IPersist*>(&object));
            if (persist)
                persist->Release();
            clone->Release();
            CoUninitialize();
        });
        reader.join();
        Rewind(stream);
        EXPECT_EQ(CoReleaseMarshalData(stream), S_OK);
        stream->Release();
        CoUninitialize();
    });
    owner.join();
    EXPECT_EQ(object.references.load(), 1u);
}

// The test's single-threaded apartment reads what the multithreaded one
// marshalled: Windows gives a proxy, this platform the object itself; either
// answers for its identity, and every reference is gone once the owner's
// apartment ends.
TEST_F(MarshalTest, PacketReadInAnotherApartmentGivesAUsableInterface) {
    PlainObject object;
    IStream* stream = NewStream();
    std::promise<void> marshalled;
    std::promise<void> done;
    std::thread owner([&] {
        ASSERT_EQ(CoInitializeEx(nullptr, COINIT_MULTITHREADED), S_OK);
        EXPECT_EQ(Marshal(stream, IID_IUnknown, &object, MSHLFLAGS_NORMAL), S_OK);
        marshalled.set_value();
        done.get_future().wait();
        CoUninitialize();
    });
    marshalled.get_future().wait();
    Rewind(stream);
    IUnknown* read = nullptr;
    EXPECT_EQ(CoUnmarshalInterface(stream, IID_IUnknown, reinterpret_cast<void**>(&read)), S_OK);
    EXPECT_NE(read, nullptr);
    if (read) {
        IUnknown* identity = nullptr;
        EXPECT_EQ(read->QueryInterface(IID_IUnknown, reinterpret_cast<void**>(&identity)), S_OK);
        if (identity)
            identity->Release();
        read->Release();
    }
    done.set_value();
    owner.join();
    stream->Release();
    EXPECT_EQ(object.references.load(), 1u);
}

TEST_F(MarshalTest, LeavingTheApartmentReleasesWhatItMarshalled) {
    PersistObject object;
    std::thread owner([&] {
        ASSERT_EQ(CoInitialize(nullptr), S_OK);
        IStream* stream = NewStream();
        ASSERT_EQ(Marshal(stream, IID_IPersist, &object, MSHLFLAGS_TABLESTRONG), S_OK);
        EXPECT_GT(object.references.load(), 1u);
        CoUninitialize();
        EXPECT_EQ(object.references.load(), 1u);
        stream->Release();
    });
    owner.join();
}

TEST_F(MarshalTest, ThreadOutsideComIsRefused) {
    PersistObject object;
    IStream* stream = NewStream();
    ASSERT_EQ(Marshal(stream, IID_IPersist, &object, MSHLFLAGS_NORMAL), S_OK);
    std::thread outsider([&] {
        IStream* clone = nullptr;
        ASSERT_EQ(stream->Clone(&clone), S_OK);
        Rewind(clone);
        void* out = nullptr;
        EXPECT_EQ(CoUnmarshalInterface(clone, IID_IPersist, &out), CO_E_NOTINITIALIZED);
        EXPECT_EQ(out, nullptr);
        // Wine releases the packet for a thread outside COM too.
        if (!vaskel_test::RunningOnWine()) {
            Rewind(clone);
            EXPECT_EQ(CoReleaseMarshalData(clone), CO_E_NOTINITIALIZED);
        }
        clone->Release();
        PersistObject other;
        IStream* target = NewStream();
        EXPECT_EQ(Marshal(target, IID_IPersist, &other, MSHLFLAGS_NORMAL), CO_E_NOTINITIALIZED);
        EXPECT_EQ(other.references.load(), 1u);
        target->Release();
    });
    outsider.join();
    Rewind(stream);
    EXPECT_EQ(CoReleaseMarshalData(stream), S_OK) << "the packet is still there";
    EXPECT_EQ(object.references.load(), 1u);
    stream->Release();
}

} // namespace
