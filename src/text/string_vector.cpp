#include <vaskel/framework/archive.h>
#include <vaskel/framework/exceptions.h>
#include <vaskel/text.h>

namespace vaskel {

CString CStringVector::ToString() const {
    CDelimitedString list;
    for (const CString& element : *this)
        list.AddToken(element);
    return list;
}

void CStringVector::Serialize(CArchive& archive) {
    if (archive.IsStoring()) {
        archive << static_cast<LONG>(1) << static_cast<DWORD>(size());
        for (const CString& element : *this)
            archive << element;
        return;
    }
    LONG version = 0;
    archive >> version;
    if (version != 0 && version != 1)
        AfxThrowArchiveException(CArchiveException::badSchema);
    DWORD count = 0;
    archive >> count;
    // Nothing is reserved for the count, which the archive may not hold:
    // every string read is at least its length byte. The strings join the
    // vector only once all of them are read.
    std::vector<CString> loaded;
    for (DWORD i = 0; i < count; ++i) {
        CString element;
        archive >> element;
        loaded.push_back(element);
    }
    insert(end(), loaded.begin(), loaded.end());
}

} // namespace vaskel
