// The scalars of the facet and what they keep on the image.
#include "statistics/statistics.h"

#include "frame/image_access.h"
#include "frame/value_objects.h"
#include "support/failures.h"
#include "support/foreign_image.h"

#include <cmath>
#include <map>

namespace Qor::Luxar::ZELT::Test {
namespace {

com_ptr<IPixmat2> image_of(int32_t width, int32_t height, const std::vector<uint16_t>& pixels,
                           int32_t bits = 16)
{
    com_ptr<IPixmat2> image;
    CheckHResult(
        CreateImageFromLayout(packed_layout(width, height, bits, PixmatEncoding_Unsigned), image.put()));
    ImageWriteAccess access(image.get());
    std::copy(pixels.begin(), pixels.end(), reinterpret_cast<uint16_t*>(access.view().data));
    CheckHResult(access.Commit());
    return image;
}

com_ptr<IRectangle> box(int32_t left, int32_t top, int32_t right, int32_t bottom)
{
    com_ptr<IRectangle> r;
    CheckHResult(Common::MakeRectangle(left, top, right, bottom, r.put()));
    return r;
}

using scalar_method = HRESULT (IStatistics::*)(IPixmat2*, IRectangle*, double*) noexcept;

constexpr struct {
    scalar_method method;
    const wchar_t* key;
} scalars[] = {{&IStatistics::Minimum, L"stats:minimum"},
               {&IStatistics::Maximum, L"stats:maximum"},
               {&IStatistics::Mean, L"stats:mean"},
               {&IStatistics::Average, L"stats:mean"},
               {&IStatistics::SumSquares, L"stats:sumsquares"},
               {&IStatistics::MinimumCount, L"stats:mincount"},
               {&IStatistics::MaximumCount, L"stats:maxcount"}};

double ask(IStatistics* s, scalar_method method, IPixmat2* image, IRectangle* area = nullptr)
{
    double value = -12345;
    EXPECT_EQ((s->*method)(image, area, &value), S_OK);
    return value;
}

coordinate<int32_t> position(IStatistics* s,
                             HRESULT (IStatistics::*method)(IPixmat2*, IRectangle*,
                                                            ICoordinateInt**) noexcept,
                             IPixmat2* image, IRectangle* area = nullptr)
{
    com_ptr<ICoordinateInt> where;
    coordinate<int32_t> p{-1, -1};
    EXPECT_EQ((s->*method)(image, area, where.put()), S_OK);
    EXPECT_EQ(Common::ReadValue(where.get(), &p), S_OK);
    return p;
}

coordinate<double> gravity(IStatistics* s, IPixmat2* image, IRectangle* area = nullptr)
{
    com_ptr<ICoordinateFloat> where;
    coordinate<double> p{-1, -1};
    EXPECT_EQ(s->CenterOfGravity(image, area, where.put()), S_OK);
    EXPECT_EQ(Common::ReadValue(where.get(), &p), S_OK);
    return p;
}

void plant(IPixmat2* image, const wchar_t* key, const variant& value)
{
    const auto store = query<IPixmatStatisticsStore>(image);
    ASSERT_EQ(store->SetValue(bstr(key).get(), value.get()), S_OK);
}

variant stored(IPixmat2* image, const wchar_t* key)
{
    variant value;
    EXPECT_EQ(query<IPixmatStatisticsStore>(image)->GetValue(bstr(key).get(), value.put()), S_OK)
        << narrow(key);
    return value;
}

TEST(ScalarCache, OnePixelCountsTwice)
{
    const auto s = make<CStatistics>();
    const auto image = image_of(1, 1, {7});
    EXPECT_EQ(ask(s.get(), &IStatistics::Minimum, image.get()), 7);
    EXPECT_EQ(ask(s.get(), &IStatistics::MinimumCount, image.get()), 2);
    EXPECT_EQ(ask(s.get(), &IStatistics::Maximum, image.get()), 7);
    EXPECT_EQ(ask(s.get(), &IStatistics::MaximumCount, image.get()), 2);
    EXPECT_EQ(ask(s.get(), &IStatistics::Mean, image.get()), 7);
    EXPECT_EQ(ask(s.get(), &IStatistics::SumSquares, image.get()), 49);
    EXPECT_EQ(gravity(s.get(), image.get()), (coordinate<double>{0, 0}));
}

TEST(ScalarCache, WritesAllKeysInTheirTypes)
{
    const auto s = make<CStatistics>();
    const auto image = image_of(3, 2, {5, 9, 5, 2, 9, 9}, 12);
    ask(s.get(), &IStatistics::Mean, image.get());
    const struct {
        const wchar_t* key;
        VARTYPE type;
        double value;
    } keys[] = {{L"stats:subsample", VT_I4, 1},
                {L"stats:minimum", VT_R8, 2},
                {L"stats:mincount", VT_UI4, 1},
                {L"stats:minposx", VT_I4, 0},
                {L"stats:minposy", VT_I4, 1},
                {L"stats:maximum", VT_R8, 9},
                {L"stats:maxcount", VT_UI4, 3},
                {L"stats:maxposx", VT_I4, 1},
                {L"stats:maxposy", VT_I4, 0},
                {L"stats:absmin", VT_R8, 0},
                {L"stats:absmax", VT_R8, 4095},
                {L"stats:mean", VT_R8, 39 / 6.0},
                {L"stats:sumsquares", VT_R8, 25 + 81 + 25 + 4 + 81 + 81},
                {L"stats:gravityx", VT_R8, (9 + 10 + 9 + 18) * (1 / 39.0)},
                {L"stats:gravityy", VT_R8, 20 * (1 / 39.0)}};
    for (const auto& k : keys) {
        variant value = stored(image.get(), k.key);
        EXPECT_EQ(value.type(), k.type) << narrow(k.key);
        ASSERT_EQ(VariantChangeType(value.get(), value.get(), 0, VT_R8), S_OK);
        EXPECT_EQ(value->dblVal, k.value) << narrow(k.key);
    }
}

TEST(ScalarCache, AnswersFromTheStoreOnlyForTheWholeImage)
{
    const auto s = make<CStatistics>();
    const auto image = image_of(3, 2, {1, 2, 3, 4, 5, 6});
    plant(image.get(), L"stats:subsample", variant(1.0)); // of another type: converted
    for (const auto& q : scalars) plant(image.get(), q.key, variant(L"42.5"));
    plant(image.get(), L"stats:minposx", variant(2.4));
    plant(image.get(), L"stats:minposy", variant(0.5));
    for (const auto& q : scalars) {
        EXPECT_EQ(ask(s.get(), q.method, image.get()), 42.5) << narrow(q.key);
        EXPECT_EQ(ask(s.get(), q.method, image.get(), box(0, 0, 3, 2).get()), 42.5) << narrow(q.key);
        EXPECT_NE(ask(s.get(), q.method, image.get(), box(0, 0, 3, 1).get()), 42.5) << narrow(q.key);
    }
    EXPECT_EQ(position(s.get(), &IStatistics::MinimumPosition, image.get()), (coordinate<int32_t>{2, 1}));
    plant(image.get(), L"stats:maxposx", variant(std::nan("")));
    plant(image.get(), L"stats:maxposy", variant(0x1p40 + 3));
    EXPECT_EQ(position(s.get(), &IStatistics::MaximumPosition, image.get()), (coordinate<int32_t>{0, 3}));
    EXPECT_EQ(stored(image.get(), L"stats:minimum").type(), VT_BSTR) << "an area must not write";

    plant(image.get(), L"stats:minimum", variant(L"no number"));
    double value = 0;
    EXPECT_EQ(s->Minimum(image.get(), nullptr, &value), DISP_E_TYPEMISMATCH);
    plant(image.get(), L"stats:subsample", variant(2)); // kept with another step: not used, and replaced
    EXPECT_EQ(ask(s.get(), &IStatistics::Minimum, image.get()), 1);
    EXPECT_EQ(stored(image.get(), L"stats:subsample")->lVal, 1);
    EXPECT_EQ(stored(image.get(), L"stats:minimum").type(), VT_R8);
}

TEST(ScalarCache, DropsWhenPixelsChange)
{
    const auto s = make<CStatistics>();
    const auto image = image_of(2, 1, {3, 4});
    EXPECT_EQ(ask(s.get(), &IStatistics::Maximum, image.get()), 4);
    for (const bool commit : {true, false}) {
        {
            ImageWriteAccess access(image.get());
            ++reinterpret_cast<uint16_t*>(access.view().data)[1];
            if (commit) {
                EXPECT_EQ(access.Commit(), S_OK);
            }
        }
        EXPECT_EQ(ask(s.get(), &IStatistics::Maximum, image.get()), commit ? 5 : 6);
    }
}

TEST(ScalarCache, SampledQuestionsNeitherReadNorWriteIt)
{
    const auto s = make<CStatistics>();
    std::vector<uint16_t> pixels(25, 10);
    const auto image = image_of(5, 5, pixels);
    EXPECT_EQ(s->put_SubsampleFactor(2), S_OK);
    EXPECT_EQ(ask(s.get(), &IStatistics::Mean, image.get()), 90 / 4.0); // 3 x 3 samples over 2 x 2
    EXPECT_EQ(ask(s.get(), &IStatistics::SumSquares, image.get()), 900 * 4.0);
    variant value;
    EXPECT_NE(query<IPixmatStatisticsStore>(image.get())->GetValue(bstr(L"stats:mean").get(), value.put()),
              S_OK);
    EXPECT_EQ(s->put_SubsampleFactor(0), E_INVALIDARG);
    LONG factor = 0;
    EXPECT_EQ(s->get_SubsampleFactor(&factor), S_OK);
    EXPECT_EQ(factor, 2);
    EXPECT_EQ(s->get_SubsampleFactor(nullptr), E_POINTER);
}

TEST(ScalarCache, PositionsOfAnAreaAreInTheImage)
{
    const auto s = make<CStatistics>();
    std::vector<uint16_t> pixels(30, 8);
    pixels[3 * 6 + 4] = 1;
    pixels[2 * 6 + 3] = 99;
    const auto image = image_of(6, 5, pixels);
    const auto area = box(2, 1, 5, 4);
    EXPECT_EQ(position(s.get(), &IStatistics::MinimumPosition, image.get(), area.get()),
              (coordinate<int32_t>{4, 3}));
    EXPECT_EQ(position(s.get(), &IStatistics::MaximumPosition, image.get(), area.get()),
              (coordinate<int32_t>{3, 2}));
    const coordinate<double> whole = gravity(s.get(), image_of(3, 3, std::vector<uint16_t>(9, 4)).get());
    EXPECT_EQ(whole, (coordinate<double>{1, 1}));
    EXPECT_EQ(gravity(s.get(), image_of(6, 5, std::vector<uint16_t>(30, 4)).get(), area.get()),
              (coordinate<double>{3, 2}));
}

TEST(ScalarCache, RefusesWhatItCannotMeasure)
{
    const auto s = make<CStatistics>();
    const auto image = image_of(3, 2, {1, 2, 3, 4, 5, 6});
    com_ptr<IPixmat2> complex;
    ASSERT_EQ(CreateImageFromLayout(packed_layout(2, 2, 64, PixmatEncoding_Complex_Float), complex.put()),
              S_OK);
    double value = 0;
    for (const auto& q : scalars) {
        const auto call = [&](IPixmat2* i, IRectangle* r, double* v) {
            return (s.get()->*q.method)(i, r, v);
        };
        expect_fails(E_INVALIDARG, L"", [&] { return call(nullptr, nullptr, nullptr); });
        expect_fails(E_POINTER, L"", [&] { return call(image.get(), nullptr, nullptr); });
        expect_fails(E_NOTIMPL, L"Statistics not implemented for this encoding",
                     [&] { return call(complex.get(), nullptr, &value); });
        for (const auto& bad :
             {box(-1, 0, 2, 2), box(0, 0, 4, 2), box(0, 0, 3, 3), box(2, 0, 1, 2), box(0, 2, 3, 1)}) {
            expect_fails(E_INVALIDARG, L"Invalid rectangle argument",
                         [&] { return call(image.get(), bad.get(), &value); });
            expect_fails(E_INVALIDARG, L"Invalid rectangle argument",
                         [&] { return call(complex.get(), bad.get(), &value); });
        }
    }
    com_ptr<ICoordinateInt> where;
    EXPECT_EQ(s->MinimumPosition(nullptr, nullptr, where.put()), E_INVALIDARG);
    EXPECT_EQ(s->MaximumPosition(image.get(), nullptr, nullptr), E_POINTER);
    EXPECT_EQ(s->CenterOfGravity(image.get(), nullptr, nullptr), E_POINTER);
}

TEST(ScalarCache, RangesAreThoseOfTheDescriptor)
{
    const auto s = make<CStatistics>();
    const struct {
        PixmatEncoding encoding;
        int32_t bits;
        double low, high;
    } cases[] = {{PixmatEncoding_Unsigned, 12, 0, 4095},
                 {PixmatEncoding_Signed, 12, -2048, 2047},
                 {PixmatEncoding_Signed, 64, -0x1p63, 0x1p63},
                 {PixmatEncoding_Float, 64, 0, 1},
                 {PixmatEncoding_RGB, 24, 0, 16777215},
                 {PixmatEncoding_Complex_Float, 64, 0, 0},
                 {PixmatEncoding_Data, 128, 0, 0}};
    for (const auto& c : cases) {
        com_ptr<IPixmat2> image;
        ASSERT_EQ(CreateImageFromLayout(packed_layout(1, 1, c.bits, c.encoding), image.put()), S_OK);
        double low = -1;
        double high = -1;
        EXPECT_EQ(s->RangeMin(image.get(), &low), S_OK);
        EXPECT_EQ(s->RangeMax(image.get(), &high), S_OK);
        EXPECT_EQ(low, c.low) << c.bits << " bits of encoding " << c.encoding;
        EXPECT_EQ(high, c.high) << c.bits << " bits of encoding " << c.encoding;
    }
    double value = 0;
    EXPECT_EQ(s->RangeMin(nullptr, &value), E_INVALIDARG);
    EXPECT_EQ(s->RangeMax(image_of(1, 1, {1}).get(), nullptr), E_POINTER);
}

/// Somebody else's image whose store refuses to keep the third value.
class stubborn_image final : public foreign_image {
public:
    using foreign_image::foreign_image;

    std::vector<std::wstring> keys;

    HRESULT QueryInterface(const GUID& id, void** out) noexcept override
    {
        if (id == IPixmatStatisticsStore::iid) return store_->QueryInterface(id, out);
        return foreign_image::QueryInterface(id, out);
    }

private:
    struct store final : implements<IPixmatStatisticsStore> {
        explicit store(stubborn_image& i) : image(i) {}
        HRESULT SetValue(BSTR key, const VARIANT*) noexcept override
        {
            image.keys.push_back(key);
            return image.keys.size() == 3 ? E_ACCESSDENIED : S_OK;
        }
        HRESULT GetValue(BSTR, VARIANT*) noexcept override { return S_FALSE; }
        stubborn_image& image;
    };
    com_ptr<store> store_ = make<store>(*this);
};

TEST(ScalarCache, FailedWriteToTheStoreIsTheAnswer)
{
    uint8_t pixels[4] = {1, 2, 3, 4};
    const image_layout layout = packed_layout(2, 2, 8, PixmatEncoding_Unsigned);
    const auto s = make<CStatistics>();
    const auto stubborn = make<stubborn_image>(layout, pixels);
    double value = -1;
    EXPECT_EQ(s->Minimum(stubborn.get(), nullptr, &value), E_ACCESSDENIED);
    EXPECT_EQ(stubborn->keys,
              (std::vector<std::wstring>{L"stats:subsample", L"stats:minimum", L"stats:mincount"}));
    const auto plain = make<foreign_image>(layout, pixels); // without a store it computes every time
    EXPECT_EQ(ask(s.get(), &IStatistics::Minimum, plain.get()), 1);
    EXPECT_EQ(ask(s.get(), &IStatistics::Minimum, plain.get()), 1);
    EXPECT_EQ(std::ranges::count(plain->calls, "read"), 2);
    const auto locked = make<foreign_image>(layout, pixels, failing::open_read);
    EXPECT_EQ(s->Minimum(locked.get(), nullptr, &value), E_ACCESSDENIED);
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
