// Object references as text: the display name of the platform's
// object-reference moniker for a live object, and back to an interface on it,
// so that a reference can travel through anything that carries text. The
// name's format is the platform's own. Failures are returned as HRESULTs,
// never thrown, and the outputs are written only on success.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/string.h>
#include <vaskel/win32.h>

namespace vaskel {

class VASKEL_API COMObjRef {
public:
    // The display name of an object-reference moniker for the object.
    static HRESULT MakeDisplayName(IUnknown* object, CString& name);
    // Parses a display name (ANSI text of the calling thread) and binds it to
    // the interface asked for; *object receives one reference, the caller's.
    static HRESULT ParseDisplayName(const char* name, const GUID& iid, IUnknown** object);
};

} // namespace vaskel
