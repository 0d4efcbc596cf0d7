// The host services as the library sees them. The linker brings whichever implementation the application chose.
#pragma once

#include "PelmHost.h"
