// The exceptions that kernels and facets use beside the standard ones, and the check around a call's result.
#pragma once

#include "zelt/com/dispatch.h"
#include "zelt/com/interface_table.h"
#include "zelt/error.h"

#include <algorithm>
#include <typeinfo>

namespace Qor {

/// Carries a code of the operating system.
class win32_error : public std::runtime_error {
public:
    win32_error(int32_t code, const std::string& text) : std::runtime_error(text), code_(code) {}
    int32_t code() const noexcept { return code_; }

private:
    int32_t code_;
};

/// Carries a result code and the error object that came with it.
class com_error {
public:
    explicit com_error(HRESULT code, com_ptr<IErrorInfo> info = {}) noexcept
        : code_(code), info_(std::move(info))
    {
    }
    HRESULT code() const noexcept { return code_; }
    IErrorInfo* info() const noexcept { return info_.get(); }

private:
    HRESULT code_;
    com_ptr<IErrorInfo> info_;
};

/// Carries a result code and nothing else.
class code_error {
public:
    explicit code_error(HRESULT code) noexcept : code_(code) {}
    HRESULT code() const noexcept { return code_; }

private:
    HRESULT code_;
};

/// Accepts a result that is no failure and throws HResultException for any other. Texts that were not supplied are
/// filled from the thread's error information.
class CheckHResult {
public:
    explicit CheckHResult(HRESULT code)
    {
        if (failed(code)) raise(code, {});
    }
    CheckHResult(HRESULT code, const std::wstring& description)
    {
        if (failed(code)) raise(code, description);
    }

private:
    [[noreturn]] static void raise(HRESULT code, const std::wstring& description);
};

class bad_enum_cast : public std::bad_cast {
public:
    const char* what() const noexcept override { return "bad_enum_cast"; }
};

namespace detail {
std::string bad_enum_text(const std::type_info& to, const std::type_info& from, int64_t value);
}

template <class From, class To>
class enum_cast_exception : public bad_enum_cast {
public:
    explicit enum_cast_exception(From value) noexcept : value_(value) {}
    From value() const noexcept { return value_; }

    /// Built on first use.
    const char* what() const noexcept override
    {
        try {
            if (text_.empty())
                text_ = detail::bad_enum_text(typeid(To), typeid(From), static_cast<int64_t>(value_));
            return text_.c_str();
        } catch (...) {
            return bad_enum_cast::what();
        }
    }

private:
    From value_;
    mutable std::string text_;
};

/// A scripts' enumeration as the kernel's own, whose values have the same numbers. Values that the scripts'
/// enumeration does not list throw enum_cast_exception.
template <class To, class From>
To enum_cast(From value)
{
    const auto& known = enumeration_of<From>::info.values;
    const auto number = static_cast<int32_t>(value);
    if (std::ranges::none_of(known, [number](const enumeration_value& v) { return v.value == number; }))
        throw enum_cast_exception<From, To>(value);
    return static_cast<To>(number);
}

} // namespace Qor
