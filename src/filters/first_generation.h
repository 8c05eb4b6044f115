// How the first generation's Ex methods go to the second generation.
#pragma once

#include "frame/image_access.h"

namespace Qor::Luxar::ZELT {

/// Makes an image with the descriptor of the input and answers method(image), which hands it out.
template <class Method>
HRESULT into_new_image(IPixmat2* input, IPixmat2** result, Method&& method) noexcept
{
    if (!input) return E_INVALIDARG;
    if (!result) return E_POINTER;
    com_ptr<IPixmat2> output;
    const HRESULT hr = CreateFromDescriptor(input, nullptr, output.put());
    return failed(hr) ? hr : method(output.get());
}

} // namespace Qor::Luxar::ZELT
