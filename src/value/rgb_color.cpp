#include <vaskel/value.h>

namespace vaskel {

CString CRGBColor::ToString() const {
    CString text;
    text.Format("{%d,%d,%d}", GetRed(), GetGreen(), GetBlue());
    return text;
}

} // namespace vaskel
