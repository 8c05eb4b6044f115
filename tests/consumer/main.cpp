// What a first program does: an object by name, an image over its own memory, a correction, a failure that says why.
#include <zelt/zelt.h>

#include <cstdint>
#include <cstdio>

namespace {

bool wraps_memory_without_a_copy()
{
    std::uint16_t pixels[3 * 4] = {7, 8, 9};
    const auto image = zelt::wrap(pixels, 4, 3, 16);
    const auto descriptor = zelt::call(image, &zelt::IPixmat2::GetDescriptor);
    zelt::com_ptr<zelt::IPixmatLock> lock;
    zelt::check(image->OpenRead(nullptr, 1.0, lock.put()));
    return zelt::get(descriptor, &zelt::IPixmatDescriptor::get_Width) == 4 &&
           lock->Data(0) == reinterpret_cast<std::uint8_t*>(pixels);
}

/// (1000 - 100) * 0.5 and (1000 - 200) * 2, from a frame with padded rows.
bool corrects_a_frame()
{
    std::uint16_t frame[] = {1000, 0, 1000, 0};
    std::uint16_t dark[] = {100, 200};
    float gain[] = {0.5f, 2.0f};
    const auto root = zelt::create<zelt::IZELT2>("ZELT.Main2");
    const auto flat = zelt::get(root, &zelt::IZELT2::get_FlatFielding);
    const auto corrected = zelt::call(flat, &zelt::IFlatFielding::FlattenEx,
                                      zelt::wrap(frame, {1, 2, 16, zelt::PixmatEncoding_Unsigned, 0, 2, 4}),
                                      zelt::PixmatEncoding_Unsigned, zelt::wrap(dark, 1, 2, 16),
                                      zelt::wrap(gain, 1, 2, 32, zelt::PixmatEncoding_Float));
    const auto statistics = zelt::get(root, &zelt::IZELT2::get_Statistics);
    const auto pixel = [&](int y) {
        return zelt::call(statistics, &zelt::IStatistics::Mean, corrected,
                          zelt::make_rectangle(0, y, 1, y + 1));
    };
    return pixel(0) == 450 && pixel(1) == 1600;
}

bool refuses_an_unknown_class()
{
    try {
        zelt::create<zelt::IZELT2>("ZELT.Nothing");
    } catch (const zelt::error& e) {
        return zelt::failed(e.hresult);
    }
    return false;
}

} // namespace

int main()
{
    if (!wraps_memory_without_a_copy()) return std::puts("a wrapped image is not its memory"), 1;
    if (!refuses_an_unknown_class()) return std::puts("an unknown class did not fail"), 2;
    if (!corrects_a_frame()) return std::puts("a corrected frame has wrong pixels"), 3;
    return 0;
}
