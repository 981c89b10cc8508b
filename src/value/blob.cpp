#include <vaskel/diag.h>
#include <vaskel/framework/exceptions.h>
#include <vaskel/framework/file.h>
#include <vaskel/value.h>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <limits>
#include <memory>
#include <new>
#include <vector>

namespace vaskel {

// One heap block: this header, then capacity data bytes.
struct CBlob::Buffer {
    LONG refs;
    DWORD length;
    DWORD capacity;

    unsigned char* Data() { return reinterpret_cast<unsigned char*>(this + 1); }

    static Buffer* Allocate(DWORD capacity) {
        // On a 32-bit system the header can push the block past the address space.
        if (std::uint64_t{capacity} + sizeof(Buffer) > std::numeric_limits<std::size_t>::max())
            throw std::bad_alloc();
        unsigned char* block = new unsigned char[sizeof(Buffer) + capacity];
        return new (block) Buffer{1, capacity, capacity};
    }
    static void Free(Buffer* buffer) {
        buffer->~Buffer();
        delete[] reinterpret_cast<unsigned char*>(buffer);
    }
    // Read with an interlocked operation, as other threads may be changing it;
    // the exchange never happens, since a live buffer's count is not 0.
    bool IsShared() { return InterlockedCompareExchange(&refs, 0, 0) > 1; }
};

namespace {

// ---------------------------------------------------------------------------
// Base64

constexpr char alphabet[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
const DWORD groupsPerLine = 19; // 76 characters
const DWORD bytesPerLine = 3 * groupsPerLine;
const DWORD maxEncodedBytes = 1u << 29; // from here on the text's length passes INT_MAX

// The two characters of every 12-bit value, so that half a group is one lookup.
struct PairTable {
    char pairs[4096][2];
    constexpr PairTable() : pairs() {
        for (int i = 0; i < 4096; ++i) {
            pairs[i][0] = alphabet[i >> 6];
            pairs[i][1] = alphabet[i & 63];
        }
    }
};
constexpr PairTable pairTable;

const unsigned char skip = 0x80;

// The six bits of each alphabet character; skip for every other character.
struct DecodeTable {
    unsigned char values[256];
    constexpr DecodeTable() : values() {
        for (int i = 0; i < 256; ++i)
            values[i] = skip;
        for (int i = 0; i < 64; ++i)
            values[static_cast<unsigned char>(alphabet[i])] = static_cast<unsigned char>(i);
    }
};
constexpr DecodeTable decodeTable;

char* EncodeGroups(const unsigned char* in, DWORD groups, char* out) {
    for (; groups > 0; --groups, in += 3, out += 4) {
        std::uint32_t bits = static_cast<std::uint32_t>(in[0]) << 16 |
                             static_cast<std::uint32_t>(in[1]) << 8 | in[2];
        std::memcpy(out, pairTable.pairs[bits >> 12], 2);
        std::memcpy(out + 2, pairTable.pairs[bits & 0xFFF], 2);
    }
    return out;
}

std::size_t EncodedLength(DWORD size) {
    DWORD groups = size / 3;
    return 4 * static_cast<std::size_t>(groups) + 2 * (groups / groupsPerLine) + (size % 3 ? 4 : 0);
}

void Encode(const unsigned char* in, DWORD size, char* out) {
    for (; size >= bytesPerLine; size -= bytesPerLine, in += bytesPerLine) {
        out = EncodeGroups(in, groupsPerLine, out);
        *out++ = '\r';
        *out++ = '\n';
    }
    out = EncodeGroups(in, size / 3, out);
    in += size / 3 * 3;
    switch (size % 3) {
    case 1:
        out[0] = alphabet[in[0] >> 2];
        out[1] = alphabet[(in[0] & 3) << 4];
        out[2] = out[3] = '=';
        break;
    case 2:
        out[0] = alphabet[in[0] >> 2];
        out[1] = alphabet[(in[0] & 3) << 4 | in[1] >> 4];
        out[2] = alphabet[(in[1] & 15) << 2];
        out[3] = '=';
        break;
    }
}

// At most this many bytes come from count characters.
DWORD DecodedBound(std::size_t count) {
    return static_cast<DWORD>(count / 4 * 3 + (count % 4 > 1 ? count % 4 - 1 : 0));
}

// Decodes count characters, none of them NUL; returns the number of bytes.
DWORD Decode(const unsigned char* in, std::size_t count, unsigned char* out) {
    const unsigned char* const end = in + count;
    unsigned char* const start = out;
    const unsigned char* values = decodeTable.values;
    for (;;) {
        // Runs of four alphabet characters, which is nearly all of the text.
        while (end - in >= 4) {
            unsigned a = values[in[0]], b = values[in[1]], c = values[in[2]], d = values[in[3]];
            if ((a | b | c | d) & skip)
                break;
            std::uint32_t bits = a << 18 | b << 12 | c << 6 | d;
            out[0] = static_cast<unsigned char>(bits >> 16);
            out[1] = static_cast<unsigned char>(bits >> 8);
            out[2] = static_cast<unsigned char>(bits);
            in += 4;
            out += 3;
        }
        // A group broken up by other characters, or the end of the text.
        std::uint32_t bits = 0;
        int taken = 0;
        while (taken < 4 && in < end) {
            unsigned value = values[*in++];
            if (value & skip)
                continue;
            bits = bits << 6 | value;
            ++taken;
        }
        if (taken == 4) {
            out[0] = static_cast<unsigned char>(bits >> 16);
            out[1] = static_cast<unsigned char>(bits >> 8);
            out[2] = static_cast<unsigned char>(bits);
            out += 3;
            continue;
        }
        if (taken == 2) {
            *out++ = static_cast<unsigned char>(bits >> 4);
        } else if (taken == 3) {
            *out++ = static_cast<unsigned char>(bits >> 10);
            *out++ = static_cast<unsigned char>(bits >> 2);
        }
        return static_cast<DWORD>(out - start);
    }
}

// ---------------------------------------------------------------------------
// Global memory

// A global block locked for reading; unlocked when done with.
class LockedGlobal {
public:
    explicit LockedGlobal(HGLOBAL handle)
        : m_handle(handle), m_data(static_cast<const unsigned char*>(GlobalLock(handle))) {}
    ~LockedGlobal() {
        if (m_data)
            GlobalUnlock(m_handle);
    }
    LockedGlobal(const LockedGlobal&) = delete;
    LockedGlobal& operator=(const LockedGlobal&) = delete;
    const unsigned char* Data() const { return m_data; }

private:
    HGLOBAL m_handle;
    const unsigned char* m_data;
};

// A new fixed block being filled: freed unless handed over.
class NewGlobal {
public:
    explicit NewGlobal(SIZE_T size)
        : m_handle(GlobalAlloc(GMEM_FIXED, size)),
          m_data(m_handle ? static_cast<unsigned char*>(GlobalLock(m_handle)) : nullptr) {}
    ~NewGlobal() {
        if (m_data)
            GlobalUnlock(m_handle);
        if (m_handle)
            GlobalFree(m_handle);
    }
    NewGlobal(const NewGlobal&) = delete;
    NewGlobal& operator=(const NewGlobal&) = delete;
    // Null when the block could not be made.
    unsigned char* Data() const { return m_data; }
    HGLOBAL HandOver() {
        GlobalUnlock(m_handle);
        m_data = nullptr;
        HGLOBAL handle = m_handle;
        m_handle = nullptr;
        return handle;
    }

private:
    HGLOBAL m_handle;
    unsigned char* m_data;
};

// ---------------------------------------------------------------------------
// The file frame

const unsigned char frameMarker[9] = {'B', 'I', 'N', 'B', 'L', 'O', 'C', 'K', 0};
const DWORD chunkBytes = 64 * 1024;

// Reads until count bytes arrived or the file ends; returns how many arrived.
DWORD ReadUpTo(CFile& file, unsigned char* into, DWORD count) {
    DWORD total = 0;
    while (total < count) {
        UINT read = file.Read(into + total, count - total);
        if (read == 0)
            break;
        total += read;
    }
    return total;
}

bool WriteFrame(CFile& file, DWORD length, const unsigned char* data) {
    unsigned char head[sizeof frameMarker + 4];
    std::memcpy(head, frameMarker, sizeof frameMarker);
    for (int i = 0; i < 4; ++i)
        head[sizeof frameMarker + i] = static_cast<unsigned char>(length >> (8 * i));
    file.Write(head, sizeof head);
    if (length > 0)
        file.Write(data, length);
    return true;
}

bool ReadFrameHead(CFile& file, DWORD& length) {
    unsigned char marker[sizeof frameMarker];
    if (ReadUpTo(file, marker, sizeof marker) < sizeof marker ||
        std::memcmp(marker, frameMarker, sizeof marker) != 0)
        return false;
    unsigned char field[4];
    if (ReadUpTo(file, field, sizeof field) < sizeof field)
        return false;
    length = static_cast<DWORD>(field[0]) | static_cast<DWORD>(field[1]) << 8 |
             static_cast<DWORD>(field[2]) << 16 | static_cast<DWORD>(field[3]) << 24;
    return true;
}

// Whether the file shows at least count bytes after its position. A file
// that cannot tell (a pipe, a device) raises its exception, which says no.
bool HoldsAtLeast(CFile& file, DWORD count) {
    try {
        ULONGLONG length = file.GetLength();
        ULONGLONG position = file.GetPosition();
        return position <= length && length - position >= count;
    } catch (const CException&) {
        return false;
    }
}

// Reads a frame's length bytes into the room that allocate() returns (null
// when it cannot make any). The length field alone never decides an
// allocation: unless the file shows it holds that many bytes, they are read
// in chunks first, so memory follows what arrives, and a frame that claims
// more than the file has fails before the room for it is made.
template <class Allocate>
bool ReadPayload(CFile& file, DWORD length, Allocate allocate) {
    if (HoldsAtLeast(file, length)) {
        unsigned char* into = allocate();
        return into && ReadUpTo(file, into, length) == length;
    }
    std::vector<std::vector<unsigned char>> chunks;
    for (DWORD left = length; left > 0;) {
        DWORD step = std::min(left, chunkBytes);
        chunks.emplace_back(step);
        if (ReadUpTo(file, chunks.back().data(), step) < step)
            return false;
        left -= step;
    }
    unsigned char* into = allocate();
    if (!into)
        return false;
    for (const std::vector<unsigned char>& chunk : chunks) {
        std::memcpy(into, chunk.data(), chunk.size());
        into += chunk.size();
    }
    return true;
}

bool IsGlobalMedium(const STGMEDIUM& medium) {
    return medium.tymed == TYMED_HGLOBAL;
}

} // namespace

// ---------------------------------------------------------------------------
// Sharing

CBlob::CBlob(const CBlob& other) noexcept : m_pBuffer(other.m_pBuffer) {
    AddRef();
}

CBlob::CBlob(const void* data, DWORD size) : m_pBuffer(nullptr) {
    SetData(data, size);
}

CBlob::CBlob(const STGMEDIUM& medium) : m_pBuffer(nullptr) {
    SetData(medium);
}

CBlob::~CBlob() {
    Release();
}

const CBlob& CBlob::operator=(const CBlob& other) {
    if (m_pBuffer != other.m_pBuffer) {
        Release();
        m_pBuffer = other.m_pBuffer;
        AddRef();
    }
    return *this;
}

void CBlob::AddRef() {
    if (m_pBuffer)
        InterlockedIncrement(&m_pBuffer->refs);
}

void CBlob::Release() {
    if (m_pBuffer && InterlockedDecrement(&m_pBuffer->refs) == 0)
        Buffer::Free(m_pBuffer);
    m_pBuffer = nullptr;
}

void CBlob::Adopt(Buffer* buffer) {
    Release();
    m_pBuffer = buffer;
}

void CBlob::Copy(const CBlob& other) {
    SetData(other.GetData(), other.GetSize());
}

CBlob CBlob::Clone() const {
    return CBlob(GetData(), GetSize());
}

// ---------------------------------------------------------------------------
// Access

const unsigned char* CBlob::GetData() const {
    return m_pBuffer ? m_pBuffer->Data() : nullptr;
}

DWORD CBlob::GetSize() const {
    return m_pBuffer ? m_pBuffer->length : 0;
}

unsigned char* CBlob::GetBuffer(DWORD size) {
    DWORD capacity = m_pBuffer ? m_pBuffer->capacity : 0;
    if ((m_pBuffer && m_pBuffer->IsShared()) || capacity < size) {
        Buffer* fresh = Buffer::Allocate(size);
        if (m_pBuffer)
            std::memcpy(fresh->Data(), m_pBuffer->Data(), std::min(m_pBuffer->length, size));
        Adopt(fresh);
    }
    if (!m_pBuffer)
        return nullptr;
    m_pBuffer->length = size;
    return m_pBuffer->Data();
}

void CBlob::SetData(const void* data, DWORD size) {
    if (size == 0) {
        Release();
        return;
    }
    if (!data)
        throw unexpected_error();
    if (m_pBuffer && !m_pBuffer->IsShared() && m_pBuffer->capacity >= size) {
        // The bytes may be this blob's own.
        std::memmove(m_pBuffer->Data(), data, size);
        m_pBuffer->length = size;
        return;
    }
    Buffer* fresh = Buffer::Allocate(size);
    std::memcpy(fresh->Data(), data, size);
    Adopt(fresh);
}

void CBlob::SetData(const STGMEDIUM& medium) {
    if (!IsGlobalMedium(medium) || !medium.hGlobal)
        return;
    SIZE_T size = GlobalSize(medium.hGlobal);
    if (size > std::numeric_limits<DWORD>::max())
        throw unexpected_error(); // beyond what a blob can count
    if (size == 0) {
        Release();
        return;
    }
    LockedGlobal block(medium.hGlobal);
    if (block.Data())
        SetData(block.Data(), static_cast<DWORD>(size));
}

// ---------------------------------------------------------------------------
// Comparison

bool CBlob::operator==(const CBlob& other) const {
    if (m_pBuffer == other.m_pBuffer)
        return true;
    DWORD size = GetSize();
    return size == other.GetSize() &&
           (size == 0 || std::memcmp(GetData(), other.GetData(), size) == 0);
}

bool CBlob::operator<(const CBlob& other) const {
    return reinterpret_cast<std::uintptr_t>(m_pBuffer) <
           reinterpret_cast<std::uintptr_t>(other.m_pBuffer);
}

// ---------------------------------------------------------------------------
// Text

CString CBlob::ToString() const {
    DWORD size = GetSize();
    if (size == 0)
        return CString();
    if (size >= maxEncodedBytes)
        AfxThrowOleException(E_FAIL);
    int length = static_cast<int>(EncodedLength(size));
    CString text;
    Encode(GetData(), size, text.GetBuffer(length));
    text.ReleaseBuffer(length);
    return text;
}

bool CBlob::FromString(const char* text, int length) {
    if (!text || length == 0 || *text == '\0') {
        Release();
        return true;
    }
    std::size_t count;
    if (length < 0) {
        count = std::strlen(text);
    } else {
        const void* nul = std::memchr(text, '\0', static_cast<std::size_t>(length));
        count = nul ? static_cast<std::size_t>(static_cast<const char*>(nul) - text)
                    : static_cast<std::size_t>(length);
    }
    const unsigned char* in = reinterpret_cast<const unsigned char*>(text);
    DWORD bound = DecodedBound(count);
    // The old bytes do not matter, but the text may lie among them.
    bool inBuffer =
        m_pBuffer && in < m_pBuffer->Data() + m_pBuffer->capacity && in + count > m_pBuffer->Data();
    if (m_pBuffer && !inBuffer && !m_pBuffer->IsShared() && m_pBuffer->capacity >= bound) {
        m_pBuffer->length = Decode(in, count, m_pBuffer->Data());
        return true;
    }
    Buffer* fresh = Buffer::Allocate(bound);
    fresh->length = Decode(in, count, fresh->Data());
    Adopt(fresh);
    return true;
}

// ---------------------------------------------------------------------------
// Files

bool CBlob::WriteToFile(CFile& file) const {
    return WriteFrame(file, GetSize(), GetData());
}

bool CBlob::WriteToFile(CFile& file, const STGMEDIUM& medium) {
    if (!IsGlobalMedium(medium))
        return false;
    SIZE_T size = GlobalSize(medium.hGlobal);
    // The frame counts in 32 bits; a cut frame would lose bytes.
    if (size > std::numeric_limits<DWORD>::max())
        return false;
    if (size == 0)
        return WriteFrame(file, 0, nullptr);
    LockedGlobal block(medium.hGlobal);
    if (!block.Data())
        return false;
    return WriteFrame(file, static_cast<DWORD>(size), block.Data());
}

bool CBlob::ReadFromFile(CFile& file) {
    DWORD length;
    if (!ReadFrameHead(file, length))
        return false;
    if (length == 0) {
        Release();
        return true;
    }
    struct Owner {
        Buffer* buffer = nullptr;
        ~Owner() {
            if (buffer)
                Buffer::Free(buffer);
        }
    } fresh;
    if (!ReadPayload(file, length, [&] {
            fresh.buffer = Buffer::Allocate(length);
            return fresh.buffer->Data();
        }))
        return false;
    Adopt(fresh.buffer);
    fresh.buffer = nullptr;
    return true;
}

bool CBlob::ReadFromFile(CFile& file, STGMEDIUM& medium) {
    DWORD length;
    if (!ReadFrameHead(file, length))
        return false;
    if (length == 0) {
        FreeStgMedium(medium);
        return true;
    }
    std::unique_ptr<NewGlobal> block;
    if (!ReadPayload(file, length, [&] {
            block = std::make_unique<NewGlobal>(length);
            return block->Data();
        }))
        return false;
    FreeStgMedium(medium);
    medium.tymed = TYMED_HGLOBAL;
    medium.hGlobal = block->HandOver();
    medium.pUnkForRelease = nullptr;
    return true;
}

// ---------------------------------------------------------------------------
// Storage media

STGMEDIUM CBlob::ToStgMedium() const {
    STGMEDIUM medium = {};
    medium.tymed = TYMED_HGLOBAL;
    // A blob of no bytes equals an empty one and gets no block either.
    if (GetSize() == 0)
        return medium;
    NewGlobal block(GetSize());
    if (!block.Data())
        return medium;
    std::memcpy(block.Data(), GetData(), GetSize());
    medium.hGlobal = block.HandOver();
    return medium;
}

void CBlob::FreeStgMedium(STGMEDIUM& medium) {
    if (IsGlobalMedium(medium) && medium.hGlobal) {
        GlobalFree(medium.hGlobal);
        medium.hGlobal = nullptr;
    }
}

} // namespace vaskel
