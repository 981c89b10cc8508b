#include <vaskel/framework/archive.h>
#include <vaskel/value.h>

namespace vaskel {

CArchive& operator<<(CArchive& archive, const CVKRectF& rect) {
    return archive << rect.top << rect.bottom << rect.left << rect.right;
}

CArchive& operator>>(CArchive& archive, CVKRectF& rect) {
    // Read whole before storing, so a short archive leaves the rectangle as it was.
    CVKRectF loaded = {};
    archive >> loaded.top >> loaded.bottom >> loaded.left >> loaded.right;
    rect = loaded;
    return archive;
}

} // namespace vaskel
