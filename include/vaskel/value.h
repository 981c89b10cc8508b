// Values: the shared byte blob, colours and rectangles.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/string.h>
#include <vaskel/win32.h>

namespace vaskel {

class CArchive;
class CFile;

// A run of bytes of any length. Copies share one reference-counted buffer; a
// blob about to be written through takes a buffer of its own first, so blobs
// pass by value at the cost of a pointer. Buffers may be shared between
// threads; a blob object is used by one thread at a time.
class VASKEL_API CBlob {
public:
    CBlob() noexcept : m_pBuffer(nullptr) {}
    CBlob(const CBlob& other) noexcept;
    CBlob(const void* data, DWORD size);
    // As SetData(medium).
    CBlob(const STGMEDIUM& medium);
    ~CBlob();
    const CBlob& operator=(const CBlob& other);

    void Empty() { Release(); }
    // This blob gets its own copy of the other's bytes.
    void Copy(const CBlob& other);
    CBlob Clone() const;

    // Null when empty.
    const unsigned char* GetData() const;
    DWORD GetSize() const;
    LONG GetLength() const { return static_cast<LONG>(GetSize()); }
    // True when the blob holds no buffer; a buffer of no bytes is not empty,
    // though it equals an empty blob.
    bool IsEmpty() const { return m_pBuffer == nullptr; }

    // Writable room for exactly size bytes, the first of them kept: shrinking
    // a buffer held alone keeps it, anything else moves to a new buffer of
    // exactly that size. Null only when an empty blob stays empty (size 0).
    unsigned char* GetBuffer(DWORD size);
    unsigned char* GetBuffer() { return GetBuffer(GetSize()); }
    // A copy of the bytes; size 0 empties the blob whatever data is, and a
    // null data with bytes to copy raises unexpected_error.
    void SetData(const void* data, DWORD size);
    // A global-memory medium with a handle: the whole block, as GlobalSize
    // gives it. Any other medium leaves the blob as it is.
    void SetData(const STGMEDIUM& medium);

    // Equal blobs hold the same bytes; an empty blob equals one of no bytes.
    bool operator==(const CBlob& other) const;
    bool operator!=(const CBlob& other) const { return !(*this == other); }
    // Orders by the identity of the buffer, not by content: for containers
    // of blobs. An empty blob comes first.
    bool operator<(const CBlob& other) const;

    // Base64 with "=" padding, in lines of 76 characters each ended by CR LF;
    // a last line shorter than 76 has no line end. A blob of 2^29 bytes or
    // more raises COleException(E_FAIL): its text would not fit an int.
    CString ToString() const;
    // Decodes up to length characters (all of them when negative) or the
    // first NUL, skipping every character outside the Base64 alphabet. A
    // final two or three characters give one or two bytes. Null or empty
    // text empties the blob.
    bool FromString(const char* text, int length);
    bool FromString(const char* text) { return FromString(text, -1); }
    bool FromString(const CString& text) { return FromString(text, text.GetLength()); }

    // The frame "BINBLOCK", a NUL, the byte count as a little-endian 32-bit
    // number and the bytes. Reading gives false, and changes nothing, on a
    // wrong marker or a frame shorter than its count says; room for the bytes
    // is made only once the file shows it holds them, or as they arrive.
    // Errors of the file itself propagate.
    bool WriteToFile(CFile& file) const;
    bool ReadFromFile(CFile& file);
    // The same frame for a global-memory medium; other media are not written.
    static bool WriteToFile(CFile& file, const STGMEDIUM& medium);
    // A frame of bytes gives the medium a new fixed block, freeing a global
    // block it held; an empty frame frees that block and leaves the type.
    static bool ReadFromFile(CFile& file, STGMEDIUM& medium);

    // A new fixed global-memory block with a copy of the bytes, owned by the
    // caller; the handle is null for a blob of no bytes or when memory is short.
    STGMEDIUM ToStgMedium() const;
    // Frees a global-memory medium's block and nulls its handle.
    static void FreeStgMedium(STGMEDIUM& medium);

protected:
    void AddRef();
    void Release();

private:
    struct Buffer;

    // Drops the held buffer for this one.
    void Adopt(Buffer* buffer);

    Buffer* m_pBuffer;
};

// A colour as 0x00BBGGRR: red in bits 0-7, green 8-15, blue 16-23.
class VASKEL_API CRGBColor {
public:
    CRGBColor(DWORD color = 0) : m_color(color) {}

    void SetColor(DWORD color) { m_color = color; }
    void SetColor(unsigned char red, unsigned char green, unsigned char blue) {
        m_color = static_cast<DWORD>(red) | static_cast<DWORD>(green) << 8 |
                  static_cast<DWORD>(blue) << 16;
    }
    DWORD GetColor() const { return m_color; }
    operator DWORD() const { return m_color; }

    int GetRed() const { return static_cast<int>(m_color & 0xFF); }
    int GetGreen() const { return static_cast<int>((m_color >> 8) & 0xFF); }
    int GetBlue() const { return static_cast<int>((m_color >> 16) & 0xFF); }
    // Each rebuilds the value from the three components; bits 24-31 become 0.
    void SetRed(unsigned char red) {
        SetColor(red, static_cast<unsigned char>(GetGreen()),
                 static_cast<unsigned char>(GetBlue()));
    }
    void SetGreen(unsigned char green) {
        SetColor(static_cast<unsigned char>(GetRed()), green,
                 static_cast<unsigned char>(GetBlue()));
    }
    void SetBlue(unsigned char blue) {
        SetColor(static_cast<unsigned char>(GetRed()), static_cast<unsigned char>(GetGreen()),
                 blue);
    }

    // "{red,green,blue}" in decimal.
    CString ToString() const;

private:
    DWORD m_color;
};

// A rectangle in floating-point coordinates.
struct CVKRectF {
    double left;
    double top;
    double right;
    double bottom;
};

// The archive holds top, bottom, left, right, each a little-endian double.
VASKEL_API CArchive& operator<<(CArchive& archive, const CVKRectF& rect);
VASKEL_API CArchive& operator>>(CArchive& archive, CVKRectF& rect);

} // namespace vaskel
