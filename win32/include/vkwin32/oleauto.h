// OLE Automation: type codes, strings with a length prefix, variants, safe
// arrays and variant dates. On this platform the user's and the system's
// default locales are both en-US.
#pragma once

#include "oaidl.h"
#include "types.h"
#include "winerror.h"
#include "winnls.h"
#include "wtypes.h"

// Text conversion flags of the Var* functions.
#define VAR_TIMEVALUEONLY 0x00000001
#define VAR_DATEVALUEONLY 0x00000002
#define VAR_VALIDDATE 0x00000004
#define VAR_CALENDAR_HIJRI 0x00000008
#define VAR_LOCALBOOL 0x00000010
#define VAR_FORMAT_NOSUBSTITUTE 0x00000020
#define VAR_FOURDIGITYEARS 0x00000040
#define LOCALE_USE_NLS 0x10000000

// Flags of VariantChangeType and VariantChangeTypeEx.
#define VARIANT_NOVALUEPROP 0x01
#define VARIANT_ALPHABOOL 0x02
#define VARIANT_NOUSEROVERRIDE 0x04
#define VARIANT_CALENDAR_HIJRI 0x08
#define VARIANT_LOCALBOOL 0x10

// Results of VarCmp.
#define VARCMP_LT 0
#define VARCMP_EQ 1
#define VARCMP_GT 2
#define VARCMP_NULL 3

// The comparison flag of VarCmp (and CompareString).
#ifndef NORM_IGNORECASE
#define NORM_IGNORECASE 0x00000001
#endif

#define DISP_E_UNKNOWNINTERFACE VKW32_HR(0x80020001)
#define DISP_E_MEMBERNOTFOUND VKW32_HR(0x80020003)
#define DISP_E_PARAMNOTFOUND VKW32_HR(0x80020004)
#define DISP_E_TYPEMISMATCH VKW32_HR(0x80020005)
#define DISP_E_UNKNOWNNAME VKW32_HR(0x80020006)
#define DISP_E_BADVARTYPE VKW32_HR(0x80020008)
#define DISP_E_EXCEPTION VKW32_HR(0x80020009)
#define DISP_E_OVERFLOW VKW32_HR(0x8002000A)
#define DISP_E_BADINDEX VKW32_HR(0x8002000B)
#define DISP_E_ARRAYISLOCKED VKW32_HR(0x8002000D)
#define DISP_E_BADPARAMCOUNT VKW32_HR(0x8002000E)
#define TYPE_E_ELEMENTNOTFOUND VKW32_HR(0x8002802B)

#define DISPATCH_METHOD 0x1
#define DISPATCH_PROPERTYGET 0x2
#define DISPATCH_PROPERTYPUT 0x4
#define DISPATCH_PROPERTYPUTREF 0x8

extern "C" {

// A BSTR points just past a 32-bit byte count and is followed by a NUL
// OLECHAR (after a NUL byte when the count is odd); it may hold NULs. A null
// BSTR is the empty string. A null text allocates zeroed characters; the
// reallocations keep the old text where the new one is null, accept a text
// inside the old string and, failing, leave it as it was. A length that
// cannot be counted in 32 bits fails.
BSTR WINAPI SysAllocString(const OLECHAR* text);
BSTR WINAPI SysAllocStringLen(const OLECHAR* text, UINT length);
BSTR WINAPI SysAllocStringByteLen(LPCSTR bytes, UINT length);
INT WINAPI SysReAllocString(BSTR* string, const OLECHAR* text);
INT WINAPI SysReAllocStringLen(BSTR* string, const OLECHAR* text, UINT length);
void WINAPI SysFreeString(BSTR text);
UINT WINAPI SysStringLen(BSTR text);
UINT WINAPI SysStringByteLen(BSTR text);

// Variants own their strings, interfaces and arrays: clearing frees or
// releases them, copying duplicates or adds a reference; by-reference values
// are never owned. A type code that is not a variant's, or a record, which
// this platform cannot copy, gives DISP_E_BADVARTYPE. A copy that fails
// leaves the destination as it was.
void WINAPI VariantInit(VARIANTARG* variant);
HRESULT WINAPI VariantClear(VARIANTARG* variant);
HRESULT WINAPI VariantCopy(VARIANTARG* destination, const VARIANTARG* source);
HRESULT WINAPI VariantCopyInd(VARIANT* destination, const VARIANTARG* source);

// Safe arrays. Indices list the first dimension first and the first index
// varies fastest. Element and byte counts that overflow 32 bits, upper
// bounds past the LONG range and records, which this platform cannot copy,
// are refused.
SAFEARRAY* WINAPI SafeArrayCreate(VARTYPE vt, UINT dims, SAFEARRAYBOUND* bounds);
SAFEARRAY* WINAPI SafeArrayCreateVector(VARTYPE vt, LONG lowerBound, ULONG elements);
HRESULT WINAPI SafeArrayDestroy(SAFEARRAY* array);
HRESULT WINAPI SafeArrayCopy(SAFEARRAY* array, SAFEARRAY** copy);
UINT WINAPI SafeArrayGetDim(SAFEARRAY* array);
UINT WINAPI SafeArrayGetElemsize(SAFEARRAY* array);
HRESULT WINAPI SafeArrayGetLBound(SAFEARRAY* array, UINT dim, LONG* lowerBound);
HRESULT WINAPI SafeArrayGetUBound(SAFEARRAY* array, UINT dim, LONG* upperBound);
HRESULT WINAPI SafeArrayGetVartype(SAFEARRAY* array, VARTYPE* vt);
HRESULT WINAPI SafeArrayLock(SAFEARRAY* array);
HRESULT WINAPI SafeArrayUnlock(SAFEARRAY* array);
HRESULT WINAPI SafeArrayAccessData(SAFEARRAY* array, void** data);
HRESULT WINAPI SafeArrayUnaccessData(SAFEARRAY* array);
// A string element is passed as the BSTR, an interface as the pointer,
// anything else by its address; GetElement writes a copy the caller owns.
HRESULT WINAPI SafeArrayPutElement(SAFEARRAY* array, LONG* indices, void* value);
HRESULT WINAPI SafeArrayGetElement(SAFEARRAY* array, LONG* indices, void* value);

// Day 0 is 30 December 1899; a negative value's time of day is the absolute
// value of its fraction. Times resolve to whole seconds.
INT WINAPI SystemTimeToVariantTime(LPSYSTEMTIME systemTime, DOUBLE* variantTime);
INT WINAPI VariantTimeToSystemTime(DOUBLE variantTime, LPSYSTEMTIME systemTime);

// Date text. The locales known here are en-US (0x409, and the user, system
// and neutral defaults), written "M/d/yyyy h:mm:ss tt", and the invariant
// locale (0x7f), written "MM/dd/yyyy HH:mm:ss"; any other LCID gives
// E_INVALIDARG. The LOCALE_NOUSEROVERRIDE flag changes nothing; asking for
// VAR_DATEVALUEONLY and VAR_TIMEVALUEONLY at once gives E_INVALIDARG.
//
// VarBstrFromDate prints the date and the time rounded to the second, the
// date alone at midnight and the time alone on day 0 ("12:00:00 AM" for
// 0.0). A value outside 1 January 100 to 31 December 9999, or NaN, gives
// E_INVALIDARG.
//
// VarDateFromStr reads either locale's text in both layouts, ISO dates and
// date-times ("2024-02-29", "2024-02-29T13:45:10", no fractions of a
// second, as the system refuses them), English month names and three-letter abbreviations
// ("February 29, 2024", "29 Feb 2024", "29-Feb-2024"), after an optional weekday, and times alone
// ("13:45", "1 PM"), in any case and between blanks. Two-digit years are 1930-2029, the system's
// default window. Numeric dates are month first or, with a year of three digits or more first, year
// first; a first number past 12 is the day (13/1/2024 is 13 January), and AM/PM after an hour past
// 12 changes nothing, as the system reads them. Malformed text, a null text or a day, month or time
// out of range gives DISP_E_TYPEMISMATCH; a year written with three digits or more outside
// 100-9999, DISP_E_OVERFLOW. *result is written only on success.
HRESULT WINAPI VarBstrFromDate(DATE dateIn, LCID lcid, ULONG flags, BSTR* result);
HRESULT WINAPI VarDateFromStr(LPCOLESTR text, LCID lcid, ULONG flags, DATE* result);

// Type changes between the scalar types (VT_EMPTY, VT_NULL, VT_I1 to VT_UI8,
// VT_INT, VT_UINT, VT_R4, VT_R8, VT_CY, VT_DATE, VT_BSTR, VT_BOOL,
// VT_DECIMAL), as the system makes them for en-US; a by-reference source is
// read through its reference and the destination may be the source. On
// success the destination's old value is cleared first; on failure it is
// left as it was. VariantChangeType uses LOCALE_USER_DEFAULT; text in any
// other locale than those of VarBstrFromDate gives E_INVALIDARG.
//
// VT_EMPTY becomes 0, "" or false; VT_NULL changes only to VT_NULL (to
// anything else: DISP_E_TYPEMISMATCH); every value but an error becomes
// VT_EMPTY or VT_NULL, and VT_ERROR changes only to itself. Fractions round half to
// even, to whole numbers for the integer types and to four decimals for
// VT_CY; a value outside the target's range gives DISP_E_OVERFLOW, except
// that integers of the same width change sign by their bits (VT_I4 -1 is
// VT_UI4 0xFFFFFFFF) and VT_BOOL true is all bits set in every unsigned
// type. VT_BOOL true is -1 (a true stored as 1 reads as 1). VT_DATE holds days -657434 to 2958465.
// Doubles become decimals through their 15 significant digits (floats
// through 7), as the system does, and past 2^53 with all their digits;
// currency and decimals change exactly, and to doubles correctly rounded. A
// decimal with a scale past 28 gives E_INVALIDARG.
//
// Text: integers in decimal; VT_R8 with up to 15 significant digits and
// VT_R4 with up to 7, without trailing zeros, in exponent form ("1E+15",
// "1.5E-05") from 10^15 (10^7) and below 10^-4; VT_CY and VT_DECIMAL with
// all their digits; VT_DATE through VarBstrFromDate; VT_BOOL as "-1" and
// "0", or "True" and "False" with VARIANT_ALPHABOOL or VARIANT_LOCALBOOL.
// Numbers are read between blanks with a sign before or after them (or
// parentheses for a negative), a leading "$", "," between the integer
// digits, a "." and an exponent ("1e3"), or as "&H" hexadecimal or "&O"
// octal, which fill the target's bits (&HFFFF is VT_I2 -1); other text
// gives DISP_E_TYPEMISMATCH, a hexadecimal past 64 bits DISP_E_OVERFLOW.
// VT_BOOL also reads "True" and "False" (or "#TRUE#", "#FALSE#") in any
// case; VT_DATE reads through VarDateFromStr. VARIANT_NOVALUEPROP,
// VARIANT_NOUSEROVERRIDE and VARIANT_CALENDAR_HIJRI change nothing here
// (dates print and read in the Gregorian calendar).
//
// VT_UNKNOWN and VT_DISPATCH change into each other through QueryInterface.
// A VT_DISPATCH would need IDispatch::Invoke for its value, which this
// platform does not call: changing it to any type but the interfaces,
// VT_EMPTY and VT_NULL gives DISP_E_TYPEMISMATCH. Arrays, records and
// by-reference destinations give DISP_E_TYPEMISMATCH; a type code that is no
// variant's, DISP_E_BADVARTYPE.
HRESULT WINAPI VariantChangeType(VARIANTARG* dest, const VARIANTARG* src, USHORT flags, VARTYPE vt);
HRESULT WINAPI VariantChangeTypeEx(VARIANTARG* dest, const VARIANTARG* src, LCID lcid, USHORT flags,
                                   VARTYPE vt);

// Compares two variants: VARCMP_NULL when either is VT_NULL; numbers of any
// types, VT_BOOL as -1 and 0, VT_DATE as its days and VT_EMPTY as 0, by
// value (integers exactly; a VT_R4 against a VT_R8 as floats, as the system
// does); a number is less than any text; texts and VT_EMPTY (as "") by their
// UTF-16 code units, with NORM_IGNORECASE folding A-Z and the Latin-1
// letters (the system compares linguistically: "a" < "B" there, not here);
// two VT_ERRORs by their codes. By-reference operands are read through
// their references. VT_ERROR against anything else, interfaces and
// VT_VARIANT give DISP_E_TYPEMISMATCH; arrays, records and type codes that
// are no variant's, DISP_E_BADVARTYPE; texts in a locale unknown to
// VarBstrFromDate, E_INVALIDARG.
HRESULT WINAPI VarCmp(LPVARIANT left, LPVARIANT right, LCID lcid, ULONG flags);

} // extern "C"
