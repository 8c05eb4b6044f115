#include "report_pictures.h"

#include "codecs.h"
#include "correct_pixels.h"

#include <algorithm>
#include <cmath>

using namespace Qor::Luxar;

namespace cli {
namespace {

uint8_t shade(double value, const shades& p)
{
    // Halved first: the difference of two very large values would not be finite.
    const double share = p.white > p.black ? (value / 2 - p.black / 2) / (p.white / 2 - p.black / 2) : 0.5;
    return static_cast<uint8_t>(share > 0 ? std::min(share, 1.0) * 255 + 0.5 : 0);
}

} // namespace

shades shades_of(IPixmat2* image, const uint8_t* chosen)
{
    const auto range = quantiles(image, {0.005, 0.995}, chosen);
    return {range[0], range[1]};
}

picture make_picture(IPixmat2* image, shades range, int width)
{
    real_rows rows(image);
    const int block = std::max(1, (rows.width() + width - 1) / width);
    picture p;
    p.width = (rows.width() + block - 1) / block;
    p.height = (rows.height() + block - 1) / block;

    const new_image small(p.width, p.height, 8, PixmatEncoding_Unsigned);
    std::vector<double> sums(static_cast<size_t>(p.width));
    std::vector<int> counts(sums.size());
    for (int y = 0; y < p.height; ++y) {
        std::ranges::fill(sums, 0.0);
        std::ranges::fill(counts, 0);
        for (int from = y * block; from < std::min((y + 1) * block, rows.height()); ++from) {
            const double* row = rows.row(from);
            for (int x = 0; x < rows.width(); ++x) {
                if (!std::isfinite(row[x])) continue;
                sums[static_cast<size_t>(x / block)] += row[x];
                ++counts[static_cast<size_t>(x / block)];
            }
        }
        uint8_t* out = small.data + static_cast<size_t>(y) * small.row_bytes;
        for (size_t x = 0; x < sums.size(); ++x)
            out[x] = counts[x] ? shade(sums[x] / counts[x], range) : uint8_t{0};
    }
    const std::vector<uint8_t> png = codecs().encode_png(small.image.get());
    p.uri = "data:image/png;base64," + base64(png.data(), png.size());
    return p;
}

std::string base64(const uint8_t* data, size_t size)
{
    constexpr char digits[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
    std::string text;
    text.reserve((size + 2) / 3 * 4);
    for (size_t i = 0; i < size; i += 3) {
        const auto byte = [&](size_t k) { return i + k < size ? uint32_t{data[i + k]} : 0u; };
        const uint32_t bits = byte(0) << 16 | byte(1) << 8 | byte(2);
        text += digits[bits >> 18];
        text += digits[bits >> 12 & 63];
        text += i + 1 < size ? digits[bits >> 6 & 63] : '=';
        text += i + 2 < size ? digits[bits & 63] : '=';
    }
    return text;
}

} // namespace cli
