#include "arithmetic/arithmetic.h"

#include "frame/image_access.h"
#include "support/failures.h"
#include "support/foreign_image.h"
#include "zelt/interfaces/zelt.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

constexpr auto U = PixmatEncoding_Unsigned;

com_ptr<IPixmat2> image(uint8_t value, int32_t width = 3)
{
    com_ptr<IPixmat2> made;
    CheckHResult(CreateImageFromLayout(packed_layout(width, 2, 8, U), made.put()));
    ImageWriteAccess access(made.get());
    std::fill_n(access.view().data, width * 2, value);
    CheckHResult(access.Commit());
    return made;
}

int pixel_of(const com_ptr<IPixmat2>& i) { return *ImageReadAccess(i.get()).view().data; }

com_ptr<IPixmatDescriptor> descriptor_of(const com_ptr<IPixmat2>& i)
{
    com_ptr<IPixmatDescriptor> d;
    CheckHResult(i->GetDescriptor(d.put()));
    return d;
}

using in_place = HRESULT (IBasicOps::*)(IPixmat2*, VARIANT, ZELT_Rounding) noexcept;
using ex = HRESULT (IBasicOps::*)(IPixmat2*, VARIANT, ZELT_Rounding, IPixmatDescriptor*, IPixmat2**) noexcept;
struct pair_of_methods {
    in_place plain;
    ex into_new;
    int wrapped, saturated; ///< of 200 and 60
    const wchar_t* other_size;
};
const pair_of_methods methods[] = {
    {&IBasicOps::Add, &IBasicOps::AddEx, 4, 255, L"Requested output image of addition has different size"},
    {&IBasicOps::Subtract, &IBasicOps::SubtractEx, 140, 140,
     L"Requested output image of subtraction has different size"},
    {&IBasicOps::ReverseSubtract, &IBasicOps::ReverseSubtractEx, 116, 255,
     L"Requested output image of subtraction has different size"},
    {&IBasicOps::Multiply, &IBasicOps::MultiplyEx, 224, 255,
     L"Requested output image of multiplication has different size"},
    {&IBasicOps::Divide, &IBasicOps::DivideEx, 3, 3,
     L"Requested output image of division has different size"},
    {&IBasicOps::ReverseDivide, &IBasicOps::ReverseDivideEx, 0, 0,
     L"Requested output image of division has different size"},
};

class Basic : public ::testing::Test {
protected:
    com_ptr<CBasic> object{make<CBasic>()};
    com_ptr<IBasicOps> facet{object};
    com_ptr<IPixmat2> b = image(60), result;
    variant second{b.get()};
};

TEST_F(Basic, ChangesItsOperandOrMakesANewImage)
{
    for (const auto& m : methods)
        for (const auto r : {ZELT_Rounding_Default, ZELT_Rounding_Saturate}) {
            const auto a = image(200);
            const int expected = r == ZELT_Rounding_Default ? m.wrapped : m.saturated;
            ASSERT_EQ((facet.get()->*m.into_new)(a.get(), *second.get(), r, nullptr, result.put()), S_OK);
            EXPECT_EQ(pixel_of(result), expected);
            EXPECT_EQ(pixel_of(a), 200);
            ASSERT_EQ((facet.get()->*m.plain)(a.get(), *second.get(), r), S_OK);
            EXPECT_EQ(pixel_of(a), expected);
            EXPECT_EQ(object->roundable().get(), ZELT_Rounding_Wrap) << "restored";
        }
    const auto a = image(200);
    ASSERT_EQ(facet->MinEx(a.get(), *second.get(), nullptr, result.put()), S_OK);
    EXPECT_EQ(pixel_of(result), 60);
    ASSERT_EQ(facet->MaxEx(b.get(), *variant(a.get()).get(), nullptr, result.put()), S_OK);
    EXPECT_EQ(pixel_of(result), 200);
    ASSERT_EQ(facet->Min(a.get(), *second.get()), S_OK);
    EXPECT_EQ(pixel_of(a), 60);
    ASSERT_EQ(facet->Max(a.get(), *variant(77).get()), S_OK);
    EXPECT_EQ(pixel_of(a), 77);
    ASSERT_EQ(facet->SetTo(a.get(), *variant(300).get(), nullptr), S_OK);
    EXPECT_EQ(pixel_of(a), 44);
}

TEST_F(Basic, OverridesTheFacetsRoundingForOneCall)
{
    const auto a = image(200);
    object->roundable().set(ZELT_Rounding_Saturate);
    ASSERT_EQ(facet->AddEx(a.get(), *second.get(), ZELT_Rounding_Default, nullptr, result.put()), S_OK);
    EXPECT_EQ(pixel_of(result), 255);
    ASSERT_EQ(facet->AddEx(a.get(), *second.get(), ZELT_Rounding_Fastest, nullptr, result.put()), S_OK);
    EXPECT_EQ(pixel_of(result), 4);
    EXPECT_EQ(facet->Add(a.get(), *second.get(), static_cast<ZELT_Rounding>(4)), E_UNEXPECTED);
    EXPECT_EQ(object->roundable().get(), ZELT_Rounding_Saturate) << "restored after a failure";
    EXPECT_EQ(pixel_of(a), 200);
}

/// The mode is set while such a call works, by another thread say: it must not be taken back.
TEST_F(Basic, LeavesTheFacetsRoundingAloneWithoutAnOverride)
{
    struct meddling_image final : foreign_image {
        using foreign_image::foreign_image;
        HRESULT OpenWrite(IPixmatLock** out) noexcept override
        {
            facet->roundable().set(ZELT_Rounding_Saturate);
            return foreign_image::OpenWrite(out);
        }
        CBasic* facet = nullptr;
    };
    uint8_t pixels[6] = {};
    const auto a = make<meddling_image>(packed_layout(3, 2, 8, U), pixels);
    a->facet = object.get();
    ASSERT_EQ(facet->Add(a.get(), *second.get(), ZELT_Rounding_Default), S_OK);
    EXPECT_EQ(object->roundable().get(), ZELT_Rounding_Saturate);
}

TEST_F(Basic, MakesTheImageOfTheDescriptor)
{
    com_ptr<IPixmat2> real;
    ASSERT_EQ(CreateImageFromLayout(packed_layout(3, 2, 32, PixmatEncoding_Float), real.put()), S_OK);
    const auto a = image(200);
    ASSERT_EQ(facet->SubtractEx(a.get(), *variant(250.0).get(), ZELT_Rounding_Default,
                                descriptor_of(real).get(), result.put()),
              S_OK);
    const ImageReadAccess access(result.get());
    EXPECT_EQ(access.view().type, pixel_type::float_32);
    EXPECT_EQ(*reinterpret_cast<const float*>(access.view().data), -50.0f);
}

TEST_F(Basic, RefusesInItsOrder)
{
    const auto a = image(200), other = image(1, 4);
    const auto d = descriptor_of(other);
    const VARIANT v = *second.get();
    for (const auto& m : methods) {
        const auto r = ZELT_Rounding_Default;
        expect_fails(E_INVALIDARG, L"", [&] { return (facet.get()->*m.plain)(nullptr, v, r); });
        expect_fails(E_INVALIDARG, L"",
                     [&] { return (facet.get()->*m.into_new)(nullptr, v, r, d.get(), nullptr); });
        expect_fails(E_POINTER, L"",
                     [&] { return (facet.get()->*m.into_new)(a.get(), v, r, d.get(), nullptr); });
        expect_fails(E_INVALIDARG, m.other_size,
                     [&] { return (facet.get()->*m.into_new)(a.get(), v, r, d.get(), result.put()); });
    }
    expect_fails(E_INVALIDARG, L"Requested output image of min has different size",
                 [&] { return facet->MinEx(a.get(), v, d.get(), result.put()); });
    expect_fails(E_INVALIDARG, L"Requested output image of abs has different size",
                 [&] { return facet->AbsEx(a.get(), d.get(), result.put()); });
    expect_fails(E_INVALIDARG, L"Requested output image of ThresholdEx has different size",
                 [&] { return facet->ThresholdEx(a.get(), v, v, v, v, d.get(), result.put()); });
    SetErrorInfo(0, nullptr);
    EXPECT_EQ(facet->MaxEx(a.get(), v, d.get(), result.put()), E_INVALIDARG);
    const left_behind left = take_error();
    EXPECT_EQ(left.description, L"Requested output image of max has different size");
    EXPECT_EQ(left.source, L"ZELT.Main");
    EXPECT_TRUE(left.interface_id == IBasicOps::iid);
    EXPECT_FALSE(result);
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
