// The facets of pixel-wise operations.
#pragma once

#include "arithmetic/basic.h"
#include "arithmetic/basic2.h"
#include "arithmetic/math.h"
