// Copyright the zelt authors. Marks what the shared library exports; everything else stays hidden.
#pragma once

#define ZELT_API __attribute__((visibility("default")))
