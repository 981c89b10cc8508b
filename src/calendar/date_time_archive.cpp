#include <vaskel/calendar.h>
#include <vaskel/framework/archive.h>

namespace vaskel {

CArchive& operator<<(CArchive& archive, const CDateTime& dateTime) {
    return archive << dateTime.GetValue();
}

CArchive& operator>>(CArchive& archive, CDateTime& dateTime) {
    double value = 0.0;
    archive >> value;
    dateTime = value;
    return archive;
}

} // namespace vaskel
