// The Win32 subset that vaskel implements on POSIX systems.
#pragma once

#include "crt.h"
#include "interlocked.h"
#include "kernel.h"
#include "mmsystem.h"
#include "objbase.h"
#include "oleauto.h"
#include "process.h"
#include "psapi.h"
#include "shlobj.h"
#include "synch.h"
#include "sysinfo.h"
#include "types.h"
#include "user.h"
#include "winerror.h"
#include "winnls.h"
#include "winreg.h"
