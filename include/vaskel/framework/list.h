// CList and CStringList: the framework's doubly-linked lists, walked with
// POSITION values. A POSITION stays valid until its element is removed.
#pragma once

#include <vaskel/framework/exceptions.h>
#include <vaskel/framework/position.h>
#include <vaskel/framework/string.h>

#include <utility>

namespace vaskel {

template <class TYPE, class ARG_TYPE = const TYPE&>
class CList {
public:
    CList() = default;
    CList(const CList& other) {
        // A constructor that throws runs no destructor: free what was copied.
        try {
            AddTail(&other);
        } catch (...) {
            RemoveAll();
            throw;
        }
    }
    CList& operator=(const CList& other) {
        if (&other != this) {
            CList copy(other);
            std::swap(m_head, copy.m_head);
            std::swap(m_tail, copy.m_tail);
            std::swap(m_count, copy.m_count);
        }
        return *this;
    }
    ~CList() { RemoveAll(); }

    INT_PTR GetCount() const { return m_count; }
    INT_PTR GetSize() const { return m_count; }
    bool IsEmpty() const { return m_count == 0; }

    TYPE& GetHead() { return NonEmpty(m_head)->data; }
    const TYPE& GetHead() const { return NonEmpty(m_head)->data; }
    TYPE& GetTail() { return NonEmpty(m_tail)->data; }
    const TYPE& GetTail() const { return NonEmpty(m_tail)->data; }

    POSITION AddHead(ARG_TYPE element) { return Link(new Node(element), nullptr, m_head); }
    POSITION AddTail(ARG_TYPE element) { return Link(new Node(element), m_tail, nullptr); }
    void AddHead(const CList* other) {
        if (other == nullptr)
            AfxThrowInvalidArgException();
        CList copy(*other);
        for (Node* n = copy.m_tail; n; n = n->prev)
            AddHead(n->data);
    }
    void AddTail(const CList* other) {
        if (other == nullptr)
            AfxThrowInvalidArgException();
        // Counted, so that a list appended to itself stops at its old end.
        Node* n = other->m_head;
        for (INT_PTR i = other->m_count; i > 0; --i, n = n->next)
            AddTail(n->data);
    }

    TYPE RemoveHead() {
        Node* n = NonEmpty(m_head);
        TYPE value(std::move(n->data));
        Unlink(n);
        return value;
    }
    TYPE RemoveTail() {
        Node* n = NonEmpty(m_tail);
        TYPE value(std::move(n->data));
        Unlink(n);
        return value;
    }
    void RemoveAt(POSITION position) { Unlink(NodeAt(position)); }
    void RemoveAll() {
        while (m_head)
            Unlink(m_head);
    }

    POSITION GetHeadPosition() const { return ToPosition(m_head); }
    POSITION GetTailPosition() const { return ToPosition(m_tail); }
    // The element at position; position moves to the next (or previous) one.
    TYPE& GetNext(POSITION& position) {
        Node* n = NodeAt(position);
        position = ToPosition(n->next);
        return n->data;
    }
    const TYPE& GetNext(POSITION& position) const {
        Node* n = NodeAt(position);
        position = ToPosition(n->next);
        return n->data;
    }
    TYPE& GetPrev(POSITION& position) {
        Node* n = NodeAt(position);
        position = ToPosition(n->prev);
        return n->data;
    }
    const TYPE& GetPrev(POSITION& position) const {
        Node* n = NodeAt(position);
        position = ToPosition(n->prev);
        return n->data;
    }
    TYPE& GetAt(POSITION position) { return NodeAt(position)->data; }
    const TYPE& GetAt(POSITION position) const { return NodeAt(position)->data; }
    void SetAt(POSITION position, ARG_TYPE element) { NodeAt(position)->data = element; }

    POSITION InsertBefore(POSITION position, ARG_TYPE element) {
        if (position == nullptr)
            return AddHead(element);
        Node* next = NodeAt(position);
        return Link(new Node(element), next->prev, next);
    }
    POSITION InsertAfter(POSITION position, ARG_TYPE element) {
        if (position == nullptr)
            return AddTail(element);
        Node* prev = NodeAt(position);
        return Link(new Node(element), prev, prev->next);
    }

    // The first element equal to value after startAfter (from the head when null).
    POSITION Find(ARG_TYPE value, POSITION startAfter = nullptr) const {
        Node* n = startAfter ? NodeAt(startAfter)->next : m_head;
        for (; n; n = n->next)
            if (n->data == value)
                return ToPosition(n);
        return nullptr;
    }
    // The position of the element at a zero-based index, or null.
    POSITION FindIndex(INT_PTR index) const {
        if (index < 0 || index >= m_count)
            return nullptr;
        Node* n = m_head;
        while (index-- > 0)
            n = n->next;
        return ToPosition(n);
    }

private:
    struct Node {
        explicit Node(ARG_TYPE value) : data(value) {}
        Node* prev = nullptr;
        Node* next = nullptr;
        TYPE data;
    };

    static POSITION ToPosition(Node* n) { return reinterpret_cast<POSITION>(n); }
    static Node* NodeAt(POSITION position) {
        if (position == nullptr)
            AfxThrowInvalidArgException();
        return reinterpret_cast<Node*>(position);
    }
    static Node* NonEmpty(Node* n) {
        if (n == nullptr)
            AfxThrowInvalidArgException();
        return n;
    }

    POSITION Link(Node* n, Node* prev, Node* next) {
        n->prev = prev;
        n->next = next;
        (prev ? prev->next : m_head) = n;
        (next ? next->prev : m_tail) = n;
        ++m_count;
        return ToPosition(n);
    }
    void Unlink(Node* n) {
        (n->prev ? n->prev->next : m_head) = n->next;
        (n->next ? n->next->prev : m_tail) = n->prev;
        --m_count;
        delete n;
    }

    Node* m_head = nullptr;
    Node* m_tail = nullptr;
    INT_PTR m_count = 0;
};

class CStringList : public CList<CString, const CString&> {};

} // namespace vaskel
