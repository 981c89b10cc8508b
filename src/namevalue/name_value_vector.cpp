#include <vaskel/namevalue.h>

#include <stdexcept>

namespace vaskel {

namespace {

[[noreturn]] void ThrowSubscript() {
    throw std::out_of_range("invalid vector<T> subscript");
}

void CheckGrowth(std::size_t count, std::size_t limit) {
    if (count > limit)
        throw std::length_error("vector<T> too long");
}

template <class Equal>
CVKNameValueVector::const_iterator FindFirst(const CVKNameValueVector& pairs, const char* name,
                                             Equal equal) {
    if (name == nullptr)
        name = "";
    for (auto it = pairs.begin(); it != pairs.end(); ++it) {
        if (equal(it->GetName(), name))
            return it;
    }
    return pairs.end();
}

bool EqualWithCase(const CString& a, const char* b) {
    return a.Compare(b) == 0;
}

bool EqualNoCase(const CString& a, const char* b) {
    return a.CompareNoCase(b) == 0;
}

} // namespace

CVKNameValueVector::reference CVKNameValueVector::at(size_type index) {
    if (index >= size())
        ThrowSubscript();
    return (*this)[index];
}

CVKNameValueVector::const_reference CVKNameValueVector::at(size_type index) const {
    if (index >= size())
        ThrowSubscript();
    return (*this)[index];
}

void CVKNameValueVector::reserve(size_type count) {
    CheckGrowth(count, max_size());
    std::vector<CVKNameValue>::reserve(count);
}

void CVKNameValueVector::resize(size_type count) {
    CheckGrowth(count, max_size());
    std::vector<CVKNameValue>::resize(count);
}

void CVKNameValueVector::resize(size_type count, const CVKNameValue& value) {
    CheckGrowth(count, max_size());
    std::vector<CVKNameValue>::resize(count, value);
}

CVKNameValueVector::const_iterator CVKNameValueVector::Find(const char* name) const {
    return FindFirst(*this, name, EqualWithCase);
}

const CVKNameValue* CVKNameValueVector::Get(const char* name) const {
    auto found = Find(name);
    return found == end() ? nullptr : &*found;
}

CVKNameValueVector::const_iterator CVKNameValueVector::FindNoCase(const char* name) const {
    return FindFirst(*this, name, EqualNoCase);
}

const CVKNameValue* CVKNameValueVector::GetNoCase(const char* name) const {
    auto found = FindNoCase(name);
    return found == end() ? nullptr : &*found;
}

} // namespace vaskel
