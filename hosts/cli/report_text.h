// Numbers and names as the report and the terminal show them.
#pragma once

#include <string>
#include <string_view>

namespace cli {

/// The parts one after the other.
template <class... Parts>
std::string joined(const Parts&... parts)
{
    std::string text;
    (text.append(std::string_view(parts)), ...);
    return text;
}

/// A pixel value or count: whole numbers as they are, others with two places.
std::string figure(double value);

/// A part of one as a percentage with its sign, or a dash for NaN.
std::string percent(double part);

/// For text and attributes of a page. What is no UTF-8, and no character that a page may hold, becomes a mark.
std::string escaped(const std::string& text);

/// "1 frame", "3 frames".
std::string counted(size_t count, const std::string& thing);

/// The last part of a path.
std::string base_name(const std::string& path);

} // namespace cli
