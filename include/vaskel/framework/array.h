// CArray and CStringArray: the framework's growable arrays, indexed from 0.
// An index outside the array raises the invalid-argument exception.
#pragma once

#include <vaskel/framework/exceptions.h>
#include <vaskel/framework/string.h>

#include <cstddef>
#include <utility>
#include <vector>

namespace vaskel {

template <class TYPE, class ARG_TYPE = const TYPE&>
class CArray {
public:
    CArray() = default;

    INT_PTR GetSize() const { return static_cast<INT_PTR>(m_items.size()); }
    INT_PTR GetCount() const { return GetSize(); }
    bool IsEmpty() const { return m_items.empty(); }
    INT_PTR GetUpperBound() const { return GetSize() - 1; }

    // The growth step is accepted for compatibility; growth is geometric.
    void SetSize(INT_PTR newSize, INT_PTR growBy = -1) {
        (void)growBy;
        if (newSize < 0)
            AfxThrowInvalidArgException();
        m_items.resize(static_cast<size_t>(newSize));
    }
    void FreeExtra() { m_items.shrink_to_fit(); }
    void RemoveAll() { m_items.clear(); }

    const TYPE& GetAt(INT_PTR index) const { return m_items[Checked(index)]; }
    TYPE& GetAt(INT_PTR index) { return m_items[Checked(index)]; }
    void SetAt(INT_PTR index, ARG_TYPE element) { m_items[Checked(index)] = element; }
    TYPE& ElementAt(INT_PTR index) { return m_items[Checked(index)]; }
    const TYPE& ElementAt(INT_PTR index) const { return m_items[Checked(index)]; }
    const TYPE& operator[](INT_PTR index) const { return GetAt(index); }
    TYPE& operator[](INT_PTR index) { return GetAt(index); }
    const TYPE* GetData() const { return m_items.data(); }
    TYPE* GetData() { return m_items.data(); }

    void SetAtGrow(INT_PTR index, ARG_TYPE element) {
        if (index < 0)
            AfxThrowInvalidArgException();
        if (static_cast<size_t>(index) >= m_items.size()) {
            TYPE copy(element); // the element may live in this array
            m_items.resize(static_cast<size_t>(index) + 1);
            m_items[static_cast<size_t>(index)] = std::move(copy);
        } else {
            m_items[static_cast<size_t>(index)] = element;
        }
    }
    INT_PTR Add(ARG_TYPE element) {
        m_items.push_back(element);
        return GetUpperBound();
    }
    // Appends the other array's elements; returns the index of the first.
    INT_PTR Append(const CArray& other) {
        INT_PTR first = GetSize();
        if (&other == this) {
            std::vector<TYPE> copy(other.m_items);
            m_items.insert(m_items.end(), copy.begin(), copy.end());
        } else {
            m_items.insert(m_items.end(), other.m_items.begin(), other.m_items.end());
        }
        return first;
    }
    void Copy(const CArray& other) {
        if (&other != this)
            m_items = other.m_items;
    }
    // Inserts count copies before index; an index past the end grows the array.
    void InsertAt(INT_PTR index, ARG_TYPE element, INT_PTR count = 1) {
        if (index < 0 || count < 0)
            AfxThrowInvalidArgException();
        TYPE copy(element);
        if (static_cast<size_t>(index) > m_items.size())
            m_items.resize(static_cast<size_t>(index));
        m_items.insert(m_items.begin() + index, static_cast<size_t>(count), copy);
    }
    void InsertAt(INT_PTR startIndex, const CArray* other) {
        if (other == nullptr || startIndex < 0)
            AfxThrowInvalidArgException();
        std::vector<TYPE> copy(other->m_items);
        if (static_cast<size_t>(startIndex) > m_items.size())
            m_items.resize(static_cast<size_t>(startIndex));
        m_items.insert(m_items.begin() + startIndex, copy.begin(), copy.end());
    }
    void RemoveAt(INT_PTR index, INT_PTR count = 1) {
        if (index < 0 || count < 0 || count > GetSize() - index)
            AfxThrowInvalidArgException();
        m_items.erase(m_items.begin() + index, m_items.begin() + index + count);
    }

private:
    size_t Checked(INT_PTR index) const {
        if (index < 0 || index >= GetSize())
            AfxThrowInvalidArgException();
        return static_cast<size_t>(index);
    }

    std::vector<TYPE> m_items;
};

class CStringArray : public CArray<CString, const CString&> {};

} // namespace vaskel
