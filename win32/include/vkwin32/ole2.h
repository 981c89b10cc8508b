// OLE services beyond COM.
#pragma once

#include "objidl.h"
#include "types.h"

extern "C" {

// Puts an object into its running state: an object with IRunnableObject is
// asked to Run (with no bind context) and its result returned; any other
// object is running already, S_OK. A null object is E_INVALIDARG.
HRESULT WINAPI OleRun(LPUNKNOWN object);

} // extern "C"
