// The factory of images.
#pragma once

#include "com/implements.h"
#include "zelt/pixmat/pixmat.h"

namespace Qor::Luxar {

class CPixmatFactory final : public automation<IPixmatFactory> {
public:
    HRESULT Create(IPixmatDescriptor* descriptor, PixmatCreateMode mode, IPixmat2** out) noexcept override;
};

} // namespace Qor::Luxar
