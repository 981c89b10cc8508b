#include <vaskel/fs.h>

#include <vaskel/text.h>

namespace vaskel {

FileEnumerator::FileEnumerator() = default;

FileEnumerator::FileEnumerator(const CString& root, const CString& pattern, bool recursive)
    : m_root(root), m_pattern(pattern), m_recursive(recursive) {}

FileEnumerator::FileEnumerator(const FileEnumerator& other)
    : m_root(other.m_root), m_pattern(other.m_pattern), m_recursive(other.m_recursive) {
    if (!other.m_searches.empty())
        Reset();
}

FileEnumerator& FileEnumerator::operator=(const FileEnumerator& other) {
    if (this == &other)
        return *this;
    CloseAll();
    m_root = other.m_root;
    m_pattern = other.m_pattern;
    m_recursive = other.m_recursive;
    if (!other.m_searches.empty())
        Reset();
    return *this;
}

FileEnumerator::~FileEnumerator() {
    CloseAll();
}

void FileEnumerator::CloseAll() {
    m_searches.clear();
    m_more = false;
    m_descend = false;
}

void FileEnumerator::Reset() {
    CloseAll();
    m_more = EnterRecursion(m_root);
}

bool FileEnumerator::EnterRecursion(const char* dir) {
    const CString text = VKMakePath(nullptr, dir, m_pattern, nullptr);
    // A path too long to join gives no text, which must not search elsewhere.
    if (text.IsEmpty())
        return false;
    auto search = std::make_unique<CFileFind>();
    if (!search->FindFile(text))
        return false;
    m_searches.push_back(std::move(search));
    m_descend = false;
    return true;
}

bool FileEnumerator::ExitRecursion() {
    if (m_searches.empty())
        return false;
    m_searches.pop_back();
    m_descend = false;
    return !m_searches.empty();
}

bool FileEnumerator::MoveNext() {
    for (;;) {
        if (m_descend && m_recursive) {
            const CString path = Current().GetFilePath();
            // A finished search is dropped before the walk goes down from it,
            // so every search below the top still has entries left.
            if (!m_more)
                m_more = ExitRecursion();
            if (EnterRecursion(path))
                m_more = true;
            if (!m_more)
                return false;
        } else if (!m_more) {
            m_more = ExitRecursion();
            if (!m_more)
                return false;
        }
        CFileFind& top = *m_searches.back();
        m_more = top.FindNextFile();
        // Links are listed but not entered: a walk cannot run in a circle.
        m_descend =
            top.IsDirectory() && !top.IsDots() && !top.MatchesMask(FILE_ATTRIBUTE_REPARSE_POINT);
        if (!top.IsDots())
            return true;
    }
}

const CFileFind& FileEnumerator::Current() const {
    static const CFileFind none;
    return m_searches.empty() ? none : *m_searches.back();
}

} // namespace vaskel
