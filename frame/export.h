// How an exported function is declared and defined: unmangled and visible. Everything else in the library is hidden.
#pragma once

#include "PelmImageDecoder.h"

#define PELM_EXPORT extern "C" PELM_API
