#include "zelt/zelt.h"

#include "com/enumerator.h"

#include <gtest/gtest.h>

#include <functional>
#include <limits>

namespace {

/// The failure of a call; the test fails when there is none.
template <class Call>
zelt::error failure_of(Call&& call)
{
    try {
        call();
    } catch (const zelt::error& e) {
        return e;
    }
    ADD_FAILURE() << "nothing was thrown";
    return zelt::error(zelt::S_OK);
}

template <class Call>
void expect_failure(zelt::HRESULT code, const std::wstring& text, Call&& call)
{
    const zelt::error e = failure_of(call);
    EXPECT_EQ(static_cast<uint32_t>(e.hresult), static_cast<uint32_t>(code));
    EXPECT_EQ(zelt::narrow(e.description), zelt::narrow(text));
}

class ZeltHeader : public ::testing::Test {
protected:
    zelt::com_ptr<zelt::IZELT2> root = zelt::create<zelt::IZELT2>("ZELT.Main2");
    zelt::com_ptr<zelt::IFlatFielding> flat = zelt::get(root, &zelt::IZELT2::get_FlatFielding);
    zelt::com_ptr<zelt::IStatistics> statistics = zelt::get(root, &zelt::IZELT2::get_Statistics);

    /// Fails, with a text that nobody takes.
    void leave_a_text_behind() { EXPECT_TRUE(zelt::failed(root->put_Rounding(zelt::ZELT_Rounding_Default))); }
};

TEST_F(ZeltHeader, WrappedImagesAreTheCallersMemory)
{
    uint16_t pixels[] = {5, 6, 7, 8};
    int released = 0;
    {
        const auto image = zelt::wrap(
            pixels, {2, 2, 16, zelt::PixmatEncoding_Unsigned, 4, 2, -4}, true,
            [](void* context) noexcept { ++*static_cast<int*>(context); }, &released);
        EXPECT_EQ(zelt::call(statistics, &zelt::IStatistics::MinimumPosition, image)->get_Y(nullptr),
                  zelt::E_POINTER);
        const auto corner = zelt::make_rectangle(0, 0, 1, 1);
        EXPECT_EQ(zelt::call(statistics, &zelt::IStatistics::Minimum, image, corner), 7);
        expect_failure(zelt::E_ACCESSDENIED, L"",
                       [&] { zelt::call(flat, &zelt::IFlatFielding::ToDarkRef, image, image); });
    }
    EXPECT_EQ(released, 1);
}

TEST_F(ZeltHeader, NewImagesArePackedAndZero)
{
    const auto image = zelt::new_image(3, 2, 12);
    const auto descriptor = zelt::call(image, &zelt::IPixmat2::GetDescriptor);
    EXPECT_EQ(zelt::get(descriptor, &zelt::IPixmatDescriptor::get_Bits), 12);
    EXPECT_EQ(zelt::get(descriptor, &zelt::IPixmatDescriptor::get_YStride), 6);
    EXPECT_EQ(zelt::call(statistics, &zelt::IStatistics::Maximum, image), 0);
    expect_failure(zelt::E_INVALIDARG, L"", [] { zelt::new_image(-3, 2, 12); });
}

TEST_F(ZeltHeader, LeftOutArgumentsTakeTheirDefaults)
{
    uint16_t frame[] = {100, 200, 300, 400};
    const auto src = zelt::wrap(frame, 4, 1, 16);
    const auto mean_of = [&](const zelt::com_ptr<zelt::IPixmat2>& image) {
        return zelt::call(statistics, &zelt::IStatistics::Mean, image);
    };
    const auto gain = [&](auto... more) {
        return mean_of(
            zelt::call(flat, &zelt::IFlatFielding::ToGainRefEx, src, zelt::PixmatEncoding_Unsigned, more...));
    };
    EXPECT_EQ(gain(), gain(-1.0, 1)); // the norm is the mean, 1.0 is 32768
    EXPECT_NE(gain(), gain(-1.0, 2));
    EXPECT_EQ(gain(-1.0), gain(250.0));
    const auto dark = zelt::new_image(4, 1, 16);
    EXPECT_EQ(
        mean_of(zelt::call(flat, &zelt::IFlatFielding::FlattenEx, src, zelt::PixmatEncoding_Unsigned, dark)),
        250);
}

TEST_F(ZeltHeader, RequiredArgumentsCannotBeLeftOut)
{
    const auto image = zelt::new_image(1, 1, 16);
    expect_failure(zelt::DISP_E_PARAMNOTOPTIONAL, L"pIDarkRefImage",
                   [&] { zelt::call(flat, &zelt::IFlatFielding::Flatten, image, image); });
}

TEST_F(ZeltHeader, FailuresCarryCodeAndTexts)
{
    const auto image = zelt::new_image(1, 1, 16);
    const zelt::com_ptr<zelt::IPixmat2> none;
    expect_failure(zelt::E_INVALIDARG, L"Destination image must be signed", [&] {
        zelt::call(flat, &zelt::IFlatFielding::FlattenDouble, image, image, none, 1.0, none, nullptr, 1);
    });
    const zelt::error e =
        failure_of([&] { zelt::call(root, &zelt::IZELT2::put_Rounding, zelt::ZELT_Rounding_Default); });
    EXPECT_EQ(zelt::narrow(e.source), "ZELT.Main2");
    EXPECT_NE(std::string(e.what()).find("80070057"), std::string::npos) << e.what();
    EXPECT_NE(std::string(e.what()).find("ZELT_Rounding_Default specified"), std::string::npos) << e.what();
}

TEST_F(ZeltHeader, TextsOfEarlierFailuresAreNeverShown)
{
    const auto image = zelt::new_image(1, 1, 16);
    const auto stale_free = [&](zelt::HRESULT code, const std::function<void()>& call) {
        leave_a_text_behind();
        expect_failure(code, L"", call);
    };
    stale_free(zelt::CO_E_CLASSSTRING, [] { zelt::create<zelt::IZELT2>("ZELT.Nothing"); });
    stale_free(zelt::E_NOINTERFACE, [] { zelt::create<zelt::IRectangle>("ZELT.Main2"); });
    stale_free(zelt::E_INVALIDARG, [] { zelt::new_image(1, -1, 8); });
    stale_free(zelt::E_POINTER, [] { zelt::wrap(nullptr, 1, 1, 8); });
    stale_free(zelt::E_INVALIDARG,
               [&] { zelt::call(flat, &zelt::IFlatFielding::ToDarkRef, image, nullptr); });
}

TEST_F(ZeltHeader, NullImagesReachTheMethodAndNullObjectsAreRefused)
{
    const zelt::com_ptr<zelt::IPixmat2> none;
    expect_failure(zelt::E_INVALIDARG, L"null IPixmat2",
                   [&] { zelt::call(statistics, &zelt::IStatistics::IsNaN, none); });
    expect_failure(zelt::E_INVALIDARG, L"",
                   [&] { zelt::call(statistics, &zelt::IStatistics::Minimum, nullptr); });
    expect_failure(zelt::E_POINTER, L"call of a null object",
                   [&] { zelt::call(none, &zelt::IPixmat2::GetDescriptor); });
}

TEST_F(ZeltHeader, ResultsHaveTheirOwnTypes)
{
    float pixels[] = {0, 1, 0, std::numeric_limits<float>::quiet_NaN()};
    const auto image = zelt::wrap(pixels, 2, 2, 32, zelt::PixmatEncoding_Float);
    static_assert(std::is_same_v<decltype(zelt::call(statistics, &zelt::IStatistics::IsNaN, image)), bool>);
    EXPECT_TRUE(zelt::call(statistics, &zelt::IStatistics::IsNaN, image));
    EXPECT_FALSE(zelt::call(statistics, &zelt::IStatistics::IsFinite, image));
    const auto box = zelt::call(statistics, &zelt::IStatistics::BoundingBox, image);
    EXPECT_EQ(zelt::get(box, &zelt::IRectangle::get_Left), 1);
    EXPECT_EQ(zelt::call(statistics, &zelt::IStatistics::Count, image, 1, zelt::ZELT_Equal), 1);
    zelt::call(statistics, &zelt::IStatistics::put_SubsampleFactor, 2);
    EXPECT_EQ(zelt::get(statistics, &zelt::IStatistics::get_SubsampleFactor), 2);
}

TEST_F(ZeltHeader, SeveralResultsAreATuple)
{
    using list = std::vector<zelt::variant>;
    const zelt::com_ptr<zelt::IEnumVARIANT> values = Qor::make<Qor::variant_enumerator>(
        std::make_shared<const list>(list{zelt::variant(7), zelt::variant(L"eight")}));
    const auto [value, fetched] = zelt::call(values, &zelt::IEnumVARIANT::Next, 1);
    EXPECT_EQ(value->lVal, 7);
    EXPECT_EQ(fetched, 1u);
    const auto [text, one] = zelt::call(values, &zelt::IEnumVARIANT::Next, 1);
    EXPECT_EQ(text.type(), zelt::VT_BSTR);
}

TEST_F(ZeltHeader, NumbersThatDoNotFitAreRefused)
{
    const auto image = zelt::new_image(1, 1, 16);
    expect_failure(zelt::DISP_E_OVERFLOW, L"", [&] {
        zelt::call(flat, &zelt::IFlatFielding::ToDarkRef, image, image, int64_t{5000000000});
    });
    expect_failure(zelt::DISP_E_OVERFLOW, L"",
                   [&] { zelt::call(flat, &zelt::IFlatFielding::ToDarkRef, image, image, 3000000000u); });
    zelt::call(flat, &zelt::IFlatFielding::ToDarkRef, image, image, int64_t{-5});
    EXPECT_EQ(zelt::call(statistics, &zelt::IStatistics::Minimum, image), 5);
}

} // namespace
