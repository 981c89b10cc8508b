// COM apartment initialisation for a thread, and the storage medium.
#pragma once

#include "objidl.h"
#include "types.h"
#include "winerror.h"

#define COINIT_MULTITHREADED 0x0
#define COINIT_APARTMENTTHREADED 0x2
#define COINIT_DISABLE_OLE1DDE 0x4
#define COINIT_SPEED_OVER_MEMORY 0x8

#define RPC_E_CHANGED_MODE VKW32_HR(0x80010106)

extern "C" {

HRESULT WINAPI CoInitialize(LPVOID reserved);
HRESULT WINAPI CoInitializeEx(LPVOID reserved, DWORD coInit);
void WINAPI CoUninitialize(void);

// Task memory, with the heap's rules: a block of no bytes is a distinct valid
// pointer, freeing null does nothing, and reallocating to no bytes frees.
LPVOID WINAPI CoTaskMemAlloc(SIZE_T bytes);
LPVOID WINAPI CoTaskMemRealloc(LPVOID memory, SIZE_T bytes);
void WINAPI CoTaskMemFree(LPVOID memory);

// A GUID as text is "{XXXXXXXX-XXXX-XXXX-XXXX-XXXXXXXXXXXX}", upper case when
// written, either case when read. StringFromGUID2 returns the characters
// written, NUL included, or 0 when fewer than 39 fit. CLSIDFromString takes
// a text that is not in that form for a ProgID; a null text is CLSID_NULL.
HRESULT WINAPI StringFromCLSID(REFCLSID clsid, LPOLESTR* text);
INT WINAPI StringFromGUID2(REFGUID guid, LPOLESTR text, INT capacity);
HRESULT WINAPI CLSIDFromString(LPCOLESTR text, LPCLSID clsid);

// Class names: HKEY_CLASSES_ROOT\<ProgID>\CLSID and
// HKEY_CLASSES_ROOT\CLSID\{...}\ProgID. A ProgID that is not registered, or
// names no valid CLSID, gives CO_E_CLASSSTRING; a class without a ProgID gives
// REGDB_E_CLASSNOTREG. The ProgID returned is task memory.
HRESULT WINAPI CLSIDFromProgID(LPCOLESTR progId, LPCLSID clsid);
HRESULT WINAPI ProgIDFromCLSID(REFCLSID clsid, LPOLESTR* progId);

// A stream on global memory. A null block is replaced by a new movable block of
// no bytes; a given block's bytes are the stream's first contents and its
// GlobalSize the stream's first size. Clones share the block, each with its
// own seek pointer; with deleteOnRelease the block is freed when the last of
// them is released. A null output is E_INVALIDARG; GetHGlobalFromStream gives
// E_INVALIDARG for a stream that this function did not make.
HRESULT WINAPI CreateStreamOnHGlobal(HGLOBAL global, BOOL deleteOnRelease, LPSTREAM* stream);
HRESULT WINAPI GetHGlobalFromStream(LPSTREAM stream, HGLOBAL* global);

} // extern "C"
