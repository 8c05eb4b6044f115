// Error information of the current thread: what went wrong in the last call that failed.
#pragma once

#include "zelt/com/bstr.h"
#include "zelt/com/dispatch.h"

namespace Qor {

/// A new, empty error object; it also has IErrorInfo.
ZELT_API HRESULT CreateErrorInfo(ICreateErrorInfo** out) noexcept;
/// Makes it the thread's error information; null clears. `reserved` is 0.
ZELT_API HRESULT SetErrorInfo(uint32_t reserved, IErrorInfo* info) noexcept;
/// Hands the thread's error information over and clears it: S_FALSE and null when there is none.
ZELT_API HRESULT GetErrorInfo(uint32_t reserved, IErrorInfo** out) noexcept;

} // namespace Qor
