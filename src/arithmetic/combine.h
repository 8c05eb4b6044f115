// The engine behind Add to Max and SetTo: finds the operands and the output, and calls the kernels.
#pragma once

#include "arithmetic/kernels/binary.h"
#include "zelt/interfaces/arithmetic.h"

namespace Qor::Luxar::ZELT {

/// A part of an image: its layout, and how far its first pixel lies from that of the image, in bytes.
struct image_part {
    image_layout layout;
    int64_t first = 0;
};

/// Texts are left as those of IBasicOps, whoever was called. `part` stands for the layout of pIA, and for that of
/// the output if it is the same image.
HRESULT combine(Arithmetic::method m, ZELT_Rounding mode, IPixmat2* pIA, const VARIANT& b, IPixmat2* pIOutImg,
                IPixmat2** ppIOut, const image_part* part = nullptr);

} // namespace Qor::Luxar::ZELT
