// What a first program does: an object by name, an image over its own memory, a failure that says why.
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
    zelt::create<zelt::IZELT2>("ZELT.Main2");
    if (!wraps_memory_without_a_copy()) return std::puts("a wrapped image is not its memory"), 1;
    if (!refuses_an_unknown_class()) return std::puts("an unknown class did not fail"), 2;
    return 0;
}
