#include "filters/filters.h"

#include "filters/kernels/gauss.h"
#include "frame/image_access.h"
#include "support/cases.h"
#include "support/failures.h"
#include "support/foreign_image.h"
#include "threads/cancellation.h"
#include "zelt/com/class_registry.h"
#include "zelt/interfaces/zelt.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

using calls = std::vector<std::string>;
using method = HRESULT (IFilters2::*)(IPixmat2*, double, IPixmat2*, IPixmat2**) noexcept;
constexpr double sigma = 1.5;

template <class T>
com_ptr<foreign_image> object(const test_image<T>& i)
{
    return com_ptr<foreign_image>::attach(new foreign_image(i.layout(), i.data()));
}

class GaussFacet : public ::testing::Test {
protected:
    GaussFacet()
    {
        com_ptr<IZELT2> root;
        EXPECT_EQ(CoCreateInstance(CLSID_ZELT2, nullptr, CLSCTX_ALL, IZELT2::iid, root.put_void()), S_OK);
        EXPECT_EQ(root->get_Filters(filters.put()), S_OK);
        com_ptr<IZELT> first_root;
        EXPECT_EQ(CoCreateInstance(CLSID_ZELT, nullptr, CLSCTX_ALL, IZELT::iid, first_root.put_void()), S_OK);
        EXPECT_EQ(first_root->get_Filters(first.put()), S_OK);
    }

    test_image<uint16_t> smoothed() const
    {
        test_image<uint16_t> out(pixels.extent());
        Filters::gauss(pixels.view(), sigma, out.view(), nullptr);
        return out;
    }

    com_ptr<IFilters2> filters;
    com_ptr<IFilters> first;
    test_image<uint16_t> pixels = random_image<uint16_t>({9, 7}, memory_layout::transposed, 1, values::plain);
};

TEST_F(GaussFacet, EachMethodRunsItsOwnFilterIntoAGivenOutput)
{
    const std::tuple<method, void (*)(const memory_2d&, double, const memory_2d&)> methods[] = {
        {&IFilters2::Gauss,
         [](const auto& src, double s, const auto& dst) { Filters::gauss(src, s, dst, nullptr); }},
        {&IFilters2::GaussDerivative, Filters::gauss_derivative},
        {&IFilters2::LaplacianGaussian, Filters::laplacian_gaussian},
        {&IFilters2::SDGDGaussian, Filters::sdgd_gaussian}};
    for (const auto& [run, kernel] : methods) {
        test_image<uint16_t> expected(pixels.extent());
        kernel(pixels.view(), sigma, expected.view());
        const test_image<uint16_t> result(pixels.extent(), memory_layout::flipped);
        const auto in = object(pixels), out = object(result);
        com_ptr<IPixmat2> handed_out;
        ASSERT_EQ((filters.get()->*run)(in.get(), sigma, out.get(), handed_out.put()), S_OK);
        EXPECT_EQ(handed_out.get(), out.get());
        expect_equal(result, std::as_const(expected));
        EXPECT_EQ(in->calls, (calls{"read", "release read"}));
        EXPECT_EQ(out->calls, (calls{"write", "commit", "release write"}));

        out->calls.clear();
        EXPECT_EQ((filters.get()->*run)(in.get(), sigma, out.get(), nullptr), E_POINTER); // the work is done
        EXPECT_EQ(out->calls, (calls{"write", "commit", "release write"}));
        expect_fails(E_INVALIDARG, L"null IPixmat2",
                     [&] { return (filters.get()->*run)(nullptr, sigma, nullptr, handed_out.put()); });
    }
}

TEST_F(GaussFacet, NewOutputsOfTheFirstGenerationKeepTheNominalBits)
{
    com_ptr<IPixmat2> camera, second, ex;
    ASSERT_EQ(CreateImageFromLayout(packed_layout(9, 7, 12, PixmatEncoding_Unsigned), camera.put()), S_OK);
    ASSERT_EQ(filters->Gauss(camera.get(), sigma, nullptr, second.put()), S_OK);
    ASSERT_EQ(first->GaussEx(camera.get(), sigma, ex.put()), S_OK);
    image_layout layout{};
    ASSERT_EQ(ReadLayout(second.get(), &layout), S_OK);
    EXPECT_EQ(layout, packed_layout(9, 7, 16, PixmatEncoding_Unsigned));
    ASSERT_EQ(ReadLayout(ex.get(), &layout), S_OK);
    EXPECT_EQ(layout, packed_layout(9, 7, 12, PixmatEncoding_Unsigned));
    EXPECT_EQ(first->GaussEx(camera.get(), sigma, nullptr), E_POINTER);
    EXPECT_EQ(first->GaussEx(nullptr, sigma, ex.put()), E_INVALIDARG);
}

TEST_F(GaussFacet, TheFirstGenerationWorksInPlace)
{
    const auto expected = smoothed();
    const auto image = object(pixels);
    ASSERT_EQ(first->Gauss(image.get(), sigma), S_OK);
    expect_equal(pixels, expected);
    expect_fails(E_INVALIDARG, L"null IPixmat2", [&] { return first->Gauss(nullptr, sigma); });
}

TEST_F(GaussFacet, LeavesANewOutputAsItWasMadeBelowTheLeastSigmaOfSDGD)
{
    com_ptr<IPixmat2> out;
    ASSERT_EQ(filters->SDGDGaussian(object(pixels).get(), 0.4, nullptr, out.put()), S_OK);
    const ImageReadAccess access(out.get());
    for (int i = 0; i < 9 * 7 * 2; ++i) EXPECT_EQ(access.view().data[i], 0);
}

TEST_F(GaussFacet, ACancelledCallCommitsNothing)
{
    const auto image = object(pixels);
    RequestCancel();
    expect_fails(E_FAIL, L"ZELT call was cancelled", [&] { return first->Gauss(image.get(), 0.4); });
    for (const auto& call : image->calls) EXPECT_NE(call, "commit");
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
