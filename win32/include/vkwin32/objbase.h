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

#define CLSCTX_INPROC_SERVER 0x1
#define CLSCTX_INPROC_HANDLER 0x2
#define CLSCTX_LOCAL_SERVER 0x4
#define CLSCTX_REMOTE_SERVER 0x10
#define CLSCTX_INPROC (CLSCTX_INPROC_SERVER | CLSCTX_INPROC_HANDLER)
#define CLSCTX_SERVER (CLSCTX_INPROC_SERVER | CLSCTX_LOCAL_SERVER | CLSCTX_REMOTE_SERVER)
#define CLSCTX_ALL (CLSCTX_INPROC | CLSCTX_LOCAL_SERVER | CLSCTX_REMOTE_SERVER)

#define REGCLS_SINGLEUSE 0
#define REGCLS_MULTIPLEUSE 1
#define REGCLS_MULTI_SEPARATE 2
#define REGCLS_SUSPENDED 4
#define REGCLS_SURROGATE 8

// The destination of a marshalled interface, and whether its packet may be
// read once (normal) or until CoReleaseMarshalData (table).
#define MSHCTX_LOCAL 0
#define MSHCTX_NOSHAREDMEM 1
#define MSHCTX_DIFFERENTMACHINE 2
#define MSHCTX_INPROC 3
#define MSHCTX_CROSSCTX 4

#define MSHLFLAGS_NORMAL 0
#define MSHLFLAGS_TABLESTRONG 1
#define MSHLFLAGS_TABLEWEAK 2
#define MSHLFLAGS_NOPING 4

extern "C" const GUID GUID_NULL;
#define IID_NULL GUID_NULL
#define CLSID_NULL GUID_NULL

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

// Class objects registered by this process. Registration holds a reference
// until CoRevokeClassObject; several registrations of one class are
// independent, each with its own non-zero cookie. Multiple use with
// CLSCTX_LOCAL_SERVER serves in-process requests too, separate multiple use
// only the contexts named; single use serves CLSCTX_LOCAL_SERVER only (with
// CLSCTX_INPROC_SERVER it is E_INVALIDARG) and hides the object after its
// first connection. REGCLS_SUSPENDED is E_INVALIDARG: there is no
// CoResumeClassObjects. Classes not registered here are REGDB_E_CLASSNOTREG:
// there are no in-process servers from the registry. Every function needs the
// thread's apartment (CO_E_NOTINITIALIZED); an unknown cookie is
// CO_E_OBJNOTREG; CoCreateInstance makes the instance through the class's
// IClassFactory and leaves null in the output on failure.
HRESULT WINAPI CoRegisterClassObject(REFCLSID clsid, LPUNKNOWN object, DWORD clsContext,
                                     DWORD flags, LPDWORD cookie);
HRESULT WINAPI CoRevokeClassObject(DWORD cookie);
HRESULT WINAPI CoGetClassObject(REFCLSID clsid, DWORD clsContext, LPVOID serverInfo, REFIID riid,
                                LPVOID* object);
HRESULT WINAPI CoCreateInstance(REFCLSID clsid, LPUNKNOWN outer, DWORD clsContext, REFIID riid,
                                LPVOID* object);

// Interface marshalling within the process. A packet names an entry in a
// process-wide table (with a per-process secret), never a pointer: a packet
// that is forged or not from this process is RPC_E_INVALID_OBJREF, one cut
// short STG_E_READFAULT, one already consumed, released or disconnected
// CO_E_OBJNOTCONNECTED, and nothing is dereferenced. The entry holds one
// reference to the interface. A normal packet is consumed by its first
// CoUnmarshalInterface; table packets stay until CoReleaseMarshalData, which
// also consumes a normal packet that was never read; leaving the apartment
// that marshalled a packet disconnects it. IID_NULL unmarshals the interface
// that was marshalled. Every function needs the thread's apartment
// (CO_E_NOTINITIALIZED). There are no proxies on this platform: a packet read
// on any thread of the process, in any apartment, gives the object's own
// interface.
HRESULT WINAPI CoGetMarshalSizeMax(ULONG* size, REFIID riid, LPUNKNOWN object, DWORD destContext,
                                   LPVOID pvDestContext, DWORD mshlflags);
HRESULT WINAPI CoMarshalInterface(LPSTREAM stream, REFIID riid, LPUNKNOWN object, DWORD destContext,
                                  LPVOID pvDestContext, DWORD mshlflags);
HRESULT WINAPI CoUnmarshalInterface(LPSTREAM stream, REFIID riid, LPVOID* object);
HRESULT WINAPI CoReleaseMarshalData(LPSTREAM stream);

// Monikers. CreateBindCtx needs reserved 0 (E_INVALIDARG). An objref moniker
// holds its object; its display name is "objref:" + Base64 of a normal
// marshal packet + ":", so each name binds once. MkParseDisplayName takes
// such names (the prefix in any case) and gives MK_E_SYNTAX and no moniker
// for any other text, with the characters parsed in eaten: 0, or the name's
// length when text follows it. A forged or stale name fails when bound.
HRESULT WINAPI CreateBindCtx(DWORD reserved, LPBC* bindContext);
HRESULT WINAPI CreateObjrefMoniker(LPUNKNOWN object, LPMONIKER* moniker);
HRESULT WINAPI MkParseDisplayName(LPBC bindContext, LPCOLESTR name, ULONG* eaten,
                                  LPMONIKER* moniker);

} // extern "C"
