#include <vaskel/sync.h>

namespace vaskel {

void SimpleDestroyedMarker::SetDestroying() {
    State* end = &m_state;
    while (!HoldsState(*end))
        end = &RecordAt(*end)->m_state;
    *end = Destroying;
}

SimpleDestroyedMarker::~SimpleDestroyedMarker() {
    // Every record of the chain answers Destroyed by itself afterwards; each
    // link is read before it is overwritten.
    State word = m_state;
    while (!HoldsState(word)) {
        Watcher* record = RecordAt(word);
        word = record->m_state;
        record->m_state = Destroyed;
    }
    m_state = Destroyed;
}

} // namespace vaskel
