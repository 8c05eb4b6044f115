// BSTR: a wide string with its length in front. Memory comes from operator new.
#pragma once

#include "zelt/com/types.h"

#include <cstddef>
#include <string>
#include <string_view>
#include <utility>

namespace Qor {

/// Null in, null out. Null when memory runs out.
ZELT_API BSTR SysAllocString(const OLECHAR* text) noexcept;
/// Copies `length` characters (or leaves them zero for a null text); a zero follows the last.
ZELT_API BSTR SysAllocStringLen(const OLECHAR* text, uint32_t length) noexcept;
ZELT_API void SysFreeString(BSTR text) noexcept;
/// Length in characters; 0 for null.
ZELT_API uint32_t SysStringLen(BSTR text) noexcept;

/// Owns a BSTR.
class bstr {
public:
    bstr() noexcept = default;
    /// Throws std::bad_alloc.
    ZELT_API explicit bstr(std::wstring_view text);
    bstr(bstr&& other) noexcept : text_(std::exchange(other.text_, nullptr)) {}
    bstr& operator=(bstr&& other) noexcept
    {
        std::swap(text_, other.text_);
        return *this;
    }
    ~bstr() { SysFreeString(text_); }

    static bstr attach(BSTR text) noexcept
    {
        bstr owner;
        owner.text_ = text;
        return owner;
    }
    [[nodiscard]] BSTR detach() noexcept { return std::exchange(text_, nullptr); }
    BSTR* put() noexcept
    {
        SysFreeString(std::exchange(text_, nullptr));
        return &text_;
    }
    BSTR get() const noexcept { return text_; }
    std::wstring_view view() const noexcept { return {text_ ? text_ : L"", SysStringLen(text_)}; }

private:
    BSTR text_ = nullptr;
};

/// A constant text of less than Capacity characters as a BSTR that needs no memory of its own. For arguments only:
/// nobody may free or change it.
template <size_t Capacity>
class bstr_constant {
public:
    template <size_t Size>
        requires(Size <= Capacity)
    constexpr bstr_constant(const OLECHAR (&text)[Size]) noexcept : length_(Size - 1)
    {
        for (size_t i = 0; i < Size; ++i) text_[i] = text[i];
    }
    BSTR get() const noexcept { return const_cast<BSTR>(text_); }

private:
    uint32_t length_; // stands directly before the characters
    OLECHAR text_[Capacity] = {};
};

/// Bytes become characters one by one, and back (a character beyond a byte becomes '?').
ZELT_API std::wstring widen(std::string_view text);
ZELT_API std::string narrow(std::wstring_view text);

} // namespace Qor
