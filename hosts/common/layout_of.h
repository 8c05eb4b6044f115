// The layout of an image, read from its descriptor.
#pragma once

#include "zelt/zelt.h"

namespace host {

/// Throws zelt::error.
inline Qor::Luxar::image_layout layout_of(Qor::Luxar::IPixmat2* image)
{
    Qor::com_ptr<Qor::Luxar::IPixmatDescriptor> d;
    zelt::check(image->GetDescriptor(d.put()));
    Qor::Luxar::image_layout layout;
    zelt::check(d->get_Width(&layout.width));
    zelt::check(d->get_Height(&layout.height));
    zelt::check(d->get_Bits(&layout.bits));
    zelt::check(d->get_Encoding(&layout.encoding));
    zelt::check(d->get_Offset(&layout.offset));
    zelt::check(d->get_XStride(&layout.x_stride));
    zelt::check(d->get_YStride(&layout.y_stride));
    return layout;
}

} // namespace host
