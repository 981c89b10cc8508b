// OLE Automation: type codes, strings with a length prefix and variant
// dates. On this platform the user's and the system's default locales are
// both en-US.
#pragma once

#include "types.h"
#include "winerror.h"
#include "winnls.h"
#include "wtypes.h"

typedef double DATE;

// Text conversion flags of the Var* functions.
#define VAR_TIMEVALUEONLY 0x00000001
#define VAR_DATEVALUEONLY 0x00000002
#define VAR_VALIDDATE 0x00000004
#define VAR_CALENDAR_HIJRI 0x00000008
#define VAR_LOCALBOOL 0x00000010
#define VAR_FORMAT_NOSUBSTITUTE 0x00000020
#define VAR_FOURDIGITYEARS 0x00000040
#define LOCALE_USE_NLS 0x10000000

#define DISP_E_TYPEMISMATCH VKW32_HR(0x80020005)
#define DISP_E_OVERFLOW VKW32_HR(0x8002000A)

extern "C" {

// A BSTR points just past a 32-bit byte count and is followed by a NUL.
BSTR WINAPI SysAllocString(const OLECHAR* text);
BSTR WINAPI SysAllocStringLen(const OLECHAR* text, UINT length);
void WINAPI SysFreeString(BSTR text);
UINT WINAPI SysStringLen(BSTR text);

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

} // extern "C"
