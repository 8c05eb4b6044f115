// Every facet's interface.
#pragma once

#include "zelt/interfaces/arithmetic.h"
#include "zelt/interfaces/complex.h"
#include "zelt/interfaces/conversions.h"
#include "zelt/interfaces/filters.h"
#include "zelt/interfaces/flatfield.h"
#include "zelt/interfaces/fourier.h"
#include "zelt/interfaces/geometry.h"
#include "zelt/interfaces/morphology.h"
#include "zelt/interfaces/statistics.h"
#include "zelt/interfaces/utilities.h"
