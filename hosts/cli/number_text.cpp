#include "number_text.h"

#include <charconv>
#include <strings.h>

using namespace Qor;

namespace cli {
namespace {

template <class T>
bool whole(const std::string& text, T* value, int base = 10)
{
    const char* first = text.data() + (text.starts_with('+') ? 1 : 0);
    const auto [end, error] = std::from_chars(first, text.data() + text.size(), *value, base);
    return error == std::errc() && end == text.data() + text.size() && end != first;
}

bool real(const std::string& text, double* value)
{
    const char* first = text.data() + (text.starts_with('+') ? 1 : 0);
    const auto [end, error] = std::from_chars(first, text.data() + text.size(), *value);
    return error == std::errc() && end == text.data() + text.size() && end != first;
}

/// "#rrggbb" as a colour number, which has red in its low byte.
bool colour(const std::string& text, double* value)
{
    uint32_t rgb = 0;
    if (text.size() != 7 || text[0] != '#' || !whole(text.substr(1), &rgb, 16)) return false;
    *value = (rgb >> 16 & 0xff) | (rgb & 0xff00) | (rgb & 0xff) << 16;
    return true;
}

} // namespace

std::optional<int64_t> parse_integer(const std::string& text)
{
    int64_t value = 0;
    if (text.starts_with("0x") || text.starts_with("0X")) {
        if (whole(text.substr(2), &value, 16) && value >= 0) return value;
        return {};
    }
    if (whole(text, &value)) return value;
    return {};
}

std::optional<variant> parse_number(const std::string& text)
{
    VARIANT v = empty_variant();
    if (const auto n = parse_integer(text)) {
        const bool small = *n >= INT32_MIN && *n <= INT32_MAX;
        v.vt = small ? VT_I4 : VT_I8;
        small ? v.lVal = static_cast<int32_t>(*n) : v.llVal = *n;
        return variant::attach(v);
    }
    if (whole(text, &v.ullVal)) {
        v.vt = VT_UI8;
        return variant::attach(v);
    }
    double value = 0;
    if (real(text, &value)) return variant(value);
    return {};
}

std::optional<std::vector<double>> parse_numbers(const std::string& text)
{
    std::vector<double> numbers;
    for (const std::string& part : split(text, ',')) {
        double value = 0;
        if (!real(part, &value) && !colour(part, &value)) return {};
        numbers.push_back(value);
    }
    return numbers;
}

std::optional<std::complex<double>> parse_complex(const std::string& text)
{
    if (text.find(',') != std::string::npos) {
        const auto numbers = parse_numbers(text);
        if (!numbers || numbers->size() != 2) return {};
        return std::complex((*numbers)[0], (*numbers)[1]);
    }
    if (!text.ends_with('i')) return {};
    const std::string body = text.substr(0, text.size() - 1);
    // The sign that starts the imaginary part; one after an e belongs to an exponent.
    size_t sign = body.size();
    while (sign-- > 1)
        if ((body[sign] == '+' || body[sign] == '-') && body[sign - 1] != 'e' && body[sign - 1] != 'E') break;
    double re = 0;
    double im = 0;
    if (sign >= 1 && sign < body.size()) {
        if (!real(body.substr(0, sign), &re) || !real(body.substr(sign), &im)) return {};
    } else if (!real(body, &im)) {
        return {};
    }
    return std::complex(re, im);
}

std::vector<std::string> split(const std::string& text, char separator)
{
    std::vector<std::string> parts;
    size_t start = 0;
    for (size_t end; (end = text.find(separator, start)) != std::string::npos; start = end + 1)
        parts.push_back(text.substr(start, end - start));
    parts.push_back(text.substr(start));
    return parts;
}

} // namespace cli
