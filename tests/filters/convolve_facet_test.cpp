#include "filters/filters.h"

#include "frame/image_access.h"
#include "support/cases.h"
#include "support/facets.h"
#include "support/failures.h"
#include "support/foreign_image.h"
#include "threads/cancellation.h"

#include <chrono>
#include <thread>

namespace Qor::Luxar::ZELT::Test {
namespace {

using calls = std::vector<std::string>;
using namespace std::chrono_literals;

template <class T>
com_ptr<foreign_image> object(const test_image<T>& i)
{
    return com_ptr<foreign_image>::attach(new foreign_image(i.layout(), i.data()));
}

/// A kernel as clients pass it, row after row. The lower bounds of its dimensions count for nothing.
variant kernel_of(uint32_t width, uint32_t height, const std::vector<double>& values)
{
    const SAFEARRAYBOUND bounds[] = {{width, -3}, {height, 7}};
    VARIANT v = empty_variant();
    v.vt = VT_ARRAY | VT_R8;
    v.parray = SafeArrayCreate(VT_R8, 2, bounds);
    const safe_array_access<double> access(v.parray);
    std::copy(values.begin(), values.end(), access.data());
    return variant::attach(v);
}

image_layout layout_of(IPixmat2* image)
{
    image_layout layout{};
    EXPECT_EQ(ReadLayout(image, &layout), S_OK);
    return layout;
}
uint16_t pixel_of(IPixmat2* image, int x, int y)
{
    const ImageReadAccess access(image);
    const memory_2d& v = access.view();
    uint16_t p;
    std::memcpy(&p, v.data + v.offset + y * v.y_stride + x * v.x_stride, sizeof p);
    return p;
}

class ConvolveFacet : public ::testing::Test {
protected:
    ConvolveFacet()
    {
        EXPECT_EQ(CoCreateInstance(CLSID_ZELT2, nullptr, CLSCTX_ALL, IZELT2::iid, root.put_void()), S_OK);
        EXPECT_EQ(root->get_Filters(filters.put()), S_OK);
        com_ptr<IZELT> first_root;
        EXPECT_EQ(CoCreateInstance(CLSID_ZELT, nullptr, CLSCTX_ALL, IZELT::iid, first_root.put_void()), S_OK);
        EXPECT_EQ(first_root->get_Filters(first.put()), S_OK);

        EXPECT_EQ(CreateImageFromLayout(packed_layout(6, 5, 12, PixmatEncoding_Unsigned), camera.put()),
                  S_OK);
        ImageWriteAccess access(camera.get());
        for (uint16_t i = 0; i < 30; ++i) std::memcpy(access.view().data + 2 * i, &i, sizeof i);
        EXPECT_EQ(access.Commit(), S_OK);
    }

    com_ptr<IZELT2> root;
    com_ptr<IFilters2> filters;
    com_ptr<IFilters> first;
    com_ptr<IPixmat2> camera; ///< 12 bits; its pixels count up
    /// 10 pixels to the right and 100 pixels below, by the formula x + kx - i, y + ky - j.
    variant across = kernel_of(2, 3, {0, 10, 0, 0, 100, 0});
};

TEST_F(ConvolveFacet, TakesTheLeftmostDimensionForXAndMakesANewImage)
{
    com_ptr<IPixmat2> out;
    ASSERT_EQ(filters->Convolve(camera.get(), *across.get(), 1, 1, nullptr, out.put()), S_OK);
    EXPECT_EQ(layout_of(out.get()), packed_layout(6, 5, 16, PixmatEncoding_Unsigned));
    // (1, 0) of the kernel meets the pixel one below, (0, 2) that one to the right and one above.
    EXPECT_EQ(pixel_of(out.get(), 2, 3), 10 * (2 + 6 * 4) + 100 * (3 + 6 * 2));

    com_ptr<IPixmat2> ex;
    ASSERT_EQ(first->ConvolveEx(camera.get(), across.get()->parray, 1, 1, ex.put()), S_OK);
    EXPECT_EQ(layout_of(ex.get()), packed_layout(6, 5, 12, PixmatEncoding_Unsigned));
    EXPECT_EQ(pixel_of(ex.get(), 2, 3), pixel_of(out.get(), 2, 3));
}

TEST_F(ConvolveFacet, FillsAGivenOutputAndCommitsIt)
{
    const auto pixels = random_image<float>({6, 5}, memory_layout::transposed, 1, values::plain);
    const test_image<float> result({6, 5}, memory_layout::flipped);
    const auto one = kernel_of(1, 1, {1});
    const auto in = object(pixels), out = object(result);
    com_ptr<IPixmat2> handed_out;
    ASSERT_EQ(filters->Convolve(in.get(), *one.get(), 0, 0, out.get(), handed_out.put()), S_OK);
    EXPECT_EQ(handed_out.get(), out.get());
    expect_equal(result, pixels);
    EXPECT_EQ(in->calls, (calls{"read", "release read"}));
    EXPECT_EQ(out->calls, (calls{"write", "commit", "release write"}));

    for (const auto method : {&IFilters2::Sobel, &IFilters2::Prewitt, &IFilters2::Derivative}) {
        out->calls.clear();
        EXPECT_EQ((filters.get()->*method)(in.get(), out.get(), nullptr), E_POINTER); // the work is done
        EXPECT_EQ(out->calls, (calls{"write", "commit", "release write"}));
        EXPECT_NE(result.at(2, 2), pixels.at(2, 2));
    }
}

TEST_F(ConvolveFacet, GradientsOfBothGenerationsAgree)
{
    com_ptr<IPixmat2> second_generation, ex;
    ASSERT_EQ(filters->Sobel(camera.get(), nullptr, second_generation.put()), S_OK);
    ASSERT_EQ(first->SobelEx(camera.get(), ex.put()), S_OK);
    EXPECT_EQ(layout_of(second_generation.get()).bits, 16);
    EXPECT_EQ(layout_of(ex.get()).bits, 12);
    EXPECT_EQ(pixel_of(ex.get(), 2, 2), 48); // hypot(8 * 1, 8 * 6), cut
    EXPECT_EQ(pixel_of(second_generation.get(), 2, 2), 48);
}

TEST_F(ConvolveFacet, RefusesKernelsThenNullImages)
{
    com_ptr<IPixmat2> out;
    const auto convolve = [&](IPixmat2* image, VARIANT kernel) {
        return filters->Convolve(image, kernel, 0, 0, nullptr, out.put());
    };
    const auto array = [](VARTYPE type, uint32_t dimensions) {
        const SAFEARRAYBOUND bounds[] = {{2, 0}, {2, 0}, {2, 0}};
        VARIANT v = empty_variant();
        v.vt = static_cast<VARTYPE>(VT_ARRAY | type);
        v.parray = SafeArrayCreate(type, dimensions, bounds);
        return variant::attach(v);
    };
    constexpr auto no_doubles = L"Convolve() needs a 2D double kernel",
                   no_plane = L"Convolve() needs a 2D kernel";
    const auto singles = array(VT_R4, 2), line = array(VT_R8, 1), cube = array(VT_R8, 3);
    VARIANT in_disguise = *singles.get();
    in_disguise.vt = VT_ARRAY | VT_R8;
    VARIANT nothing = empty_variant();
    nothing.vt = VT_ARRAY | VT_R8;
    for (const VARIANT& k : {*singles.get(), *variant(1.0).get(), in_disguise})
        expect_fails(E_INVALIDARG, no_doubles, [&] { return convolve(nullptr, k); });
    for (const VARIANT& k : {*line.get(), *cube.get(), nothing})
        expect_fails(E_INVALIDARG, no_plane, [&] { return convolve(nullptr, k); });
    expect_fails(E_INVALIDARG, L"null IPixmat2", [&] { return convolve(nullptr, *across.get()); });
    expect_fails(E_INVALIDARG, L"ZELT Convolve can not be used in place", [&] {
        return filters->Convolve(camera.get(), *across.get(), 0, 0, camera.get(), out.put());
    });
    SetErrorInfo(0, nullptr);
    EXPECT_EQ(convolve(camera.get(), *line.get()), E_INVALIDARG);
    const left_behind left = take_error();
    EXPECT_EQ(left.source, L"ZELT.Main2");
    EXPECT_EQ(left.interface_id, IFilters2::iid);

    expect_fails(E_INVALIDARG, L"",
                 [&] { return first->ConvolveEx(camera.get(), nullptr, 0, 0, out.put()); });
    expect_fails(E_INVALIDARG, L"",
                 [&] { return first->ConvolveEx(nullptr, across.get()->parray, 0, 0, out.put()); });
    expect_fails(E_POINTER, L"", [&] { return first->SobelEx(camera.get(), nullptr); });
    expect_fails(E_INVALIDARG, no_doubles,
                 [&] { return first->ConvolveEx(camera.get(), singles.get()->parray, 0, 0, out.put()); });
    EXPECT_FALSE(out);
}

TEST_F(ConvolveFacet, TakesKernelsWithoutValues)
{
    for (const auto& [width, height] : {std::pair{0u, 0u}, {3u, 0u}, {0u, 3u}}) {
        com_ptr<IPixmat2> out;
        ASSERT_EQ(
            filters->Convolve(camera.get(), *kernel_of(width, height, {}).get(), 1, 1, nullptr, out.put()),
            S_OK);
        EXPECT_EQ(pixel_of(out.get(), 3, 3), 0);
    }
}

TEST_F(ConvolveFacet, StopsSoonAfterCancelAndRunsTheNextTime)
{
    using clock = std::chrono::steady_clock;
    const auto many = kernel_of(61, 61, std::vector<double>(61 * 61, 0.1));
    const auto convolve = [&](int height, com_ptr<IPixmat2>& out) {
        com_ptr<IPixmat2> image;
        EXPECT_EQ(CreateImageFromLayout(packed_layout(2000, height, 32, PixmatEncoding_Float), image.put()),
                  S_OK);
        return filters->Convolve(image.get(), *many.get(), 30, 30, nullptr, out.put());
    };
    com_ptr<IPixmat2> out;
    const auto begin = clock::now();
    ASSERT_EQ(convolve(40, out), S_OK); // some rows for each worker
    const auto time_of_40_rows = clock::now() - begin;
    out = nullptr;

    clock::time_point cancelled;
    std::thread stop([&] {
        std::this_thread::sleep_for(100ms);
        cancelled = clock::now();
        EXPECT_EQ(root->Cancel(), S_OK);
    });
    // Takes 500 times as long unless it is stopped.
    expect_fails(E_FAIL, L"ZELT call was cancelled", [&] { return convolve(20000, out); });
    const auto end = clock::now();
    stop.join();
    EXPECT_LT(end - cancelled, time_of_40_rows + 500ms); // the operating system has its say, too
    EXPECT_FALSE(out);
    EXPECT_EQ(convolve(5, out), S_OK);
}

TEST_F(ConvolveFacet, LeavesARequestToStopForTheNextCallThatIsNotRefused)
{
    com_ptr<IPixmat2> out;
    root->Cancel();
    EXPECT_EQ(filters->Sobel(camera.get(), nullptr, out.put()), S_OK);
    EXPECT_EQ(filters->Convolve(camera.get(), *variant(1.0).get(), 0, 0, nullptr, out.put()), E_INVALIDARG);
    EXPECT_EQ(filters->Convolve(camera.get(), *across.get(), 0, 0, camera.get(), out.put()), E_INVALIDARG);
    EXPECT_EQ(filters->Convolve(camera.get(), *across.get(), 0, 0, nullptr, out.put()), E_FAIL);
    EXPECT_EQ(filters->Convolve(camera.get(), *across.get(), 0, 0, nullptr, out.put()), S_OK);
}

TEST_F(ConvolveFacet, IsCalledByNameWithoutItsOptionalArguments)
{
    const auto& methods = described(filters.get()).methods;
    const auto convolve = std::find_if(methods.begin(), methods.end(), [](const method_info& m) {
        return m.name == std::string_view("Convolve");
    });
    variant result;
    const std::vector<variant> arguments{variant(camera.get()), across, variant(1), variant(1)};
    ASSERT_EQ(late_call(filters.get(), *convolve, arguments)(&result), S_OK);
    com_ptr<IPixmat2> out;
    ASSERT_EQ(result->pdispVal->QueryInterface(IPixmat2::iid, out.put_void()), S_OK);
    EXPECT_EQ(pixel_of(out.get(), 2, 3), 10 * (2 + 6 * 4) + 100 * (3 + 6 * 2));
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
