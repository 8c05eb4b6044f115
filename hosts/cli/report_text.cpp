#include "report_text.h"

#include <cmath>
#include <cstdint>
#include <cstdio>

namespace cli {
namespace {

std::string formatted(const char* format, double value)
{
    char text[48];
    std::snprintf(text, sizeof text, format, value);
    return text;
}

/// How many bytes from `at` on are one valid character; 0 if none is.
size_t character_size(const std::string& text, size_t at)
{
    const auto byte = [&](size_t i) { return i < text.size() ? static_cast<unsigned char>(text[i]) : 0u; };
    const unsigned first = byte(at);
    if (first < 0x80) return first >= 0x20 && first != 0x7F ? 1 : 0;
    const size_t size = first >= 0xC2 && first < 0xE0 ? 2 : first >= 0xE0 && first < 0xF0 ? 3 : 4;
    if (first < 0xC2 || first > 0xF4) return 0;
    uint32_t code = first & (0x7Fu >> size);
    for (size_t i = 1; i < size; ++i) {
        if ((byte(at + i) & 0xC0) != 0x80) return 0;
        code = code << 6 | (byte(at + i) & 0x3F);
    }
    constexpr uint32_t smallest[] = {0, 0, 0x80, 0x800, 0x10000};
    const bool surrogate = code >= 0xD800 && code <= 0xDFFF;
    const bool control = code < 0xA0 || (code & 0xFFFE) == 0xFFFE;
    return code < smallest[size] || code > 0x10FFFF || surrogate || control ? 0 : size;
}

} // namespace

std::string figure(double value)
{
    if (!std::isfinite(value)) return std::isnan(value) ? "-" : formatted("%g", value);
    if (std::abs(value) < 1e12 && value == std::floor(value)) return formatted("%.0f", value + 0.0);
    return std::abs(value) >= 1e7 || std::abs(value) < 0.01 ? formatted("%.4g", value)
                                                            : formatted("%.2f", value);
}

std::string percent(double part)
{
    if (!std::isfinite(part)) return "-";
    return formatted(std::abs(part) >= 0.0995 ? "%.1f %%" : "%.2f %%", part * 100);
}

std::string escaped(const std::string& text)
{
    std::string out;
    for (size_t i = 0; i < text.size();) {
        const size_t size = character_size(text, i);
        switch (text[i]) {
        case '&': out += "&amp;"; break;
        case '<': out += "&lt;"; break;
        case '>': out += "&gt;"; break;
        case '"': out += "&quot;"; break;
        case '\'': out += "&#39;"; break;
        default: out += size ? text.substr(i, size) : "\xEF\xBF\xBD"; // the replacement character
        }
        i += size ? size : 1;
    }
    return out;
}

std::string counted(size_t count, const std::string& thing)
{
    return std::to_string(count) + " " + thing + (count == 1 ? "" : "s");
}

std::string base_name(const std::string& path)
{
    const size_t slash = path.rfind('/');
    return slash == std::string::npos ? path : path.substr(slash + 1);
}

} // namespace cli
