// How a failure reaches the caller: a code as the answer, texts as the thread's error information.
#pragma once

#include "zelt/com/dispatch.h"

namespace Qor {

/// In the catch clause of a facet method: translates the exception being handled, leaves its texts as the thread's error
/// information and gives its code.
HRESULT ReportCurrentException(const GUID& interface_id) noexcept;

/// For faults that are found without an exception: leaves `message` with the class's name as source, gives `code`.
HRESULT ReportError(const GUID& class_id, const wchar_t* message, const GUID& interface_id,
                    HRESULT code) noexcept;

} // namespace Qor
