// HResultException: a failure as the library tells it, a code with its texts.
#pragma once

#include "zelt/com/types.h"

#include <stdexcept>
#include <string>

namespace Qor {

class ZELT_API HResultException : public std::runtime_error {
public:
    explicit HResultException(HRESULT code);
    HResultException(HRESULT code, const std::string& text);
    HResultException(HRESULT code, std::wstring error_source, std::wstring text, std::wstring help_file,
                     uint32_t help_context);
    HResultException(const HResultException&) = default;
    ~HResultException() override;

    /// "HRESULT 80070057: <the code's meaning>: <description>\nSource: <source>", pieces that are empty left out.
    /// Built at the first call; one thread at a time.
    const char* what() const noexcept override;

    HRESULT hresult;
    std::wstring source;
    std::wstring description;
    std::wstring helpFile;
    uint32_t helpContext = 0;

private:
    mutable std::string text_;
};

/// What a code means in a few words, or null for an unknown one.
ZELT_API const char* system_message(HRESULT code) noexcept;

} // namespace Qor
