// Common base of the platform's headers.
#pragma once

#include "tizen_error.h"
