#include "zelt/com/bstr.h"

#include <cstring>
#include <cwchar>
#include <limits>
#include <new>

namespace Qor {

namespace {

// Stands directly before the characters.
struct alignas(OLECHAR) text_header {
    uint32_t length;
};

} // namespace

BSTR SysAllocStringLen(const OLECHAR* text, uint32_t length) noexcept
{
    const uint64_t bytes = sizeof(text_header) + (uint64_t{length} + 1) * sizeof(OLECHAR);
    if (bytes > std::numeric_limits<size_t>::max()) return nullptr;
    void* const block = ::operator new(static_cast<size_t>(bytes), std::nothrow);
    if (!block) return nullptr;
    auto* const header = new (block) text_header{length};
    auto* const characters = reinterpret_cast<OLECHAR*>(header + 1);
    if (text)
        std::memcpy(characters, text, size_t{length} * sizeof(OLECHAR));
    else
        std::memset(characters, 0, size_t{length} * sizeof(OLECHAR));
    characters[length] = 0;
    return characters;
}

BSTR SysAllocString(const OLECHAR* text) noexcept
{
    if (!text) return nullptr;
    const size_t length = std::wcslen(text);
    if (length > std::numeric_limits<uint32_t>::max()) return nullptr;
    return SysAllocStringLen(text, static_cast<uint32_t>(length));
}

void SysFreeString(BSTR text) noexcept
{
    if (text) ::operator delete(reinterpret_cast<text_header*>(text) - 1);
}

uint32_t SysStringLen(BSTR text) noexcept
{
    return text ? (reinterpret_cast<const text_header*>(text) - 1)->length : 0;
}

bstr::bstr(std::wstring_view text)
{
    if (text.size() <= std::numeric_limits<uint32_t>::max())
        text_ = SysAllocStringLen(text.data(), static_cast<uint32_t>(text.size()));
    if (!text_) throw std::bad_alloc();
}

std::wstring widen(std::string_view text)
{
    std::wstring wide(text.size(), L'\0');
    for (size_t i = 0; i < text.size(); ++i) wide[i] = static_cast<unsigned char>(text[i]);
    return wide;
}

std::string narrow(std::wstring_view text)
{
    std::string bytes(text.size(), '\0');
    for (size_t i = 0; i < text.size(); ++i)
        bytes[i] =
            text[i] >= 0 && text[i] <= 0xff ? static_cast<char>(static_cast<unsigned char>(text[i])) : '?';
    return bytes;
}

} // namespace Qor
