// Values: colours and rectangles.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/string.h>
#include <vaskel/win32.h>

namespace vaskel {

class CArchive;

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
