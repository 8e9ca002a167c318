// The CMPI binary interface, version 100: the one header that the rest of the program includes.
//
// The system's headers are used where they are installed (TVR_SYSTEM_CMPI), the declarations of this folder
// otherwise. Both give the same binary interface. Code that includes this header compiles with either: it fills
// tables by name, treats `hdl` as possibly const, and calls objects through the functions of CmpiOperations.h
// (the system's macro header is left out, for its macros and inline functions differ from set to set).
#pragma once

#ifdef TVR_SYSTEM_CMPI
#ifndef __cdecl
#define __cdecl // some header sets leave it to the compiler, and g++ does not know it
#endif
#include <cmpi/cmpidt.h>
#include <cmpi/cmpift.h>
#else
#include "runtime/cmpi/CmpiBroker.h"
#include "runtime/cmpi/CmpiProviders.h"
#endif

#include "runtime/cmpi/CmpiMemory.h"
#include "runtime/cmpi/CmpiOperations.h"
