#include <vaskel/timer.h>

#include <limits>

namespace vaskel {

COperationStatistic::COperationStatistic(const CString& name, ETimeUnit unit)
    : m_strName(name), m_nCount(0), m_dMinimum(std::numeric_limits<double>::max()), m_dMaximum(0.0),
      m_dAverage(0.0), m_eUnit(unit) {}

void COperationStatistic::LogExecution(double value) {
    // The count stops at its largest value rather than wrapping to 0, which
    // would divide the mean by zero; the mean then weighs new values alike.
    if (m_nCount != std::numeric_limits<DWORD>::max())
        ++m_nCount;
    if (value < m_dMinimum)
        m_dMinimum = value;
    if (value > m_dMaximum)
        m_dMaximum = value;
    // A running mean: no sum is kept that could grow without bound.
    m_dAverage =
        (static_cast<double>(m_nCount - 1) * m_dAverage + value) / static_cast<double>(m_nCount);
}

} // namespace vaskel
