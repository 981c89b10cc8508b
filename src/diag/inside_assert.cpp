#include <vaskel/diag.h>

namespace vaskel {

volatile DWORD CVKInsideAssert::m_nInsideAssert = 0;

CVKInsideAssert::CVKInsideAssert() {
    InterlockedIncrement(reinterpret_cast<volatile LONG*>(&m_nInsideAssert));
}

CVKInsideAssert::~CVKInsideAssert() {
    InterlockedDecrement(reinterpret_cast<volatile LONG*>(&m_nInsideAssert));
}

bool CVKInsideAssert::IsInsideAssert() {
    return m_nInsideAssert > 0;
}

} // namespace vaskel
