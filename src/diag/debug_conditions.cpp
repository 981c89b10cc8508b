#include "debug_conditions.h"

#include <vaskel/diag.h>

#include <vector>

namespace vaskel {
namespace {

// Created on first store, freed when the library is unloaded.
std::vector<DWORD>* table = nullptr;

} // namespace

DWORD CVKDebugConditions::GetConditionValue(DWORD index) {
    return table && index < table->size() ? (*table)[index] : 0;
}

void CVKDebugConditions::SetConditionValue(DWORD index, DWORD value) {
    if (!table)
        table = new std::vector<DWORD>;
    if (index >= table->size())
        table->resize(static_cast<size_t>(index) + 1, 0); // keeps the old contents if it throws
    (*table)[index] = value;
}

DWORD CVKDebugConditions::GetConditionTableSize() {
    return table ? static_cast<DWORD>(table->size()) : 0;
}

void ReleaseDebugConditions() {
    delete table;
    table = nullptr;
}

} // namespace vaskel
