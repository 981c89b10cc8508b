// The registry: keys under predefined roots, typed values, enumeration and
// deletion, with the system's error codes; like the system, these functions
// report through their result and leave the last error alone.
//
// On this platform the store is an SQLite database per hive in the directory
// VASKEL_REGISTRY names (else $XDG_DATA_HOME/vaskel/registry, else
// ~/.local/share/vaskel/registry), read once per process and created private
// to the user: user.db holds HKEY_CURRENT_USER, machine.db
// HKEY_LOCAL_MACHINE, and HKEY_CLASSES_ROOT is HKEY_LOCAL_MACHINE\Software\Classes.
// Several processes may use one store at once; a write that returned survives
// the writer's crash. Key and value names compare without case (ASCII letters
// only) and keep the case they were created with; limits count UTF-16 units of
// the UTF-8 names, as the system counts them (keys 255, values 16383).
// Subkeys and values enumerate in name order. Key classes, security
// descriptors and last-write times are not kept (classes read back empty,
// times as zero); a volatile key is refused with ERROR_NOT_SUPPORTED, since
// the store cannot forget it at the next start.
#pragma once

#include "types.h"
#include "winerror.h"

typedef LONG LSTATUS;
typedef DWORD REGSAM;
typedef HKEY* PHKEY;

#define HKEY_CLASSES_ROOT (reinterpret_cast<HKEY>(static_cast<ULONG_PTR>(0x80000000u)))
#define HKEY_CURRENT_USER (reinterpret_cast<HKEY>(static_cast<ULONG_PTR>(0x80000001u)))
#define HKEY_LOCAL_MACHINE (reinterpret_cast<HKEY>(static_cast<ULONG_PTR>(0x80000002u)))

#define REG_NONE 0
#define REG_SZ 1
#define REG_EXPAND_SZ 2
#define REG_BINARY 3
#define REG_DWORD 4
#define REG_DWORD_LITTLE_ENDIAN 4
#define REG_DWORD_BIG_ENDIAN 5
#define REG_LINK 6
#define REG_MULTI_SZ 7
#define REG_QWORD 11
#define REG_QWORD_LITTLE_ENDIAN 11

#define KEY_QUERY_VALUE 0x0001
#define KEY_SET_VALUE 0x0002
#define KEY_CREATE_SUB_KEY 0x0004
#define KEY_ENUMERATE_SUB_KEYS 0x0008
#define KEY_NOTIFY 0x0010
#define KEY_CREATE_LINK 0x0020
#define KEY_WOW64_64KEY 0x0100
#define KEY_WOW64_32KEY 0x0200
#define KEY_READ 0x20019
#define KEY_WRITE 0x20006
#define KEY_EXECUTE 0x20019
#define KEY_ALL_ACCESS 0xF003F

#define REG_OPTION_NON_VOLATILE 0x00000000
#define REG_OPTION_VOLATILE 0x00000001

#define REG_CREATED_NEW_KEY 0x00000001
#define REG_OPENED_EXISTING_KEY 0x00000002

extern "C" {

// A null or empty subKey gives back the key passed in, not a new handle.
LSTATUS WINAPI RegOpenKeyA(HKEY key, LPCSTR subKey, PHKEY result);
// A null or empty subKey gives a new handle to the key, or the predefined key
// itself. Paths refuse a leading backslash with ERROR_BAD_PATHNAME, in every
// function, except here below HKEY_CLASSES_ROOT; repeated and trailing
// backslashes are accepted.
LSTATUS WINAPI RegOpenKeyExA(HKEY key, LPCSTR subKey, DWORD options, REGSAM desired, PHKEY result);
LSTATUS WINAPI RegCreateKeyExA(HKEY key, LPCSTR subKey, DWORD reserved, LPSTR keyClass,
                               DWORD options, REGSAM desired,
                               LPSECURITY_ATTRIBUTES securityAttributes, PHKEY result,
                               LPDWORD disposition);
// Closing a predefined key succeeds and leaves it usable.
LSTATUS WINAPI RegCloseKey(HKEY key);
// String data stored without a terminating NUL gets one in the caller's
// buffer when there is room, without counting it in the size.
LSTATUS WINAPI RegQueryValueExA(HKEY key, LPCSTR valueName, LPDWORD reserved, LPDWORD type,
                                LPBYTE data, LPDWORD dataSize);
LSTATUS WINAPI RegSetValueExA(HKEY key, LPCSTR valueName, DWORD reserved, DWORD type,
                              const BYTE* data, DWORD dataSize);
LSTATUS WINAPI RegEnumKeyExA(HKEY key, DWORD index, LPSTR name, LPDWORD nameLength,
                             LPDWORD reserved, LPSTR keyClass, LPDWORD classLength,
                             PFILETIME lastWriteTime);
LSTATUS WINAPI RegEnumValueA(HKEY key, DWORD index, LPSTR valueName, LPDWORD valueNameLength,
                             LPDWORD reserved, LPDWORD type, LPBYTE data, LPDWORD dataSize);
LSTATUS WINAPI RegDeleteValueA(HKEY key, LPCSTR valueName);
// Fails with ERROR_ACCESS_DENIED while the key has subkeys, and for the roots.
LSTATUS WINAPI RegDeleteKeyA(HKEY key, LPCSTR subKey);
LSTATUS WINAPI RegDeleteKeyExA(HKEY key, LPCSTR subKey, REGSAM desired, DWORD reserved);

} // extern "C"
