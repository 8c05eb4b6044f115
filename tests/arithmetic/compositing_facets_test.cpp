// The methods that put images together: what they open, make, refuse and hand out.
#include "arithmetic/arithmetic.h"
#include "facet_images.h"
#include "frame/value_objects.h"
#include "support/facets.h"
#include "support/failing_new.h"
#include "support/failures.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

using calls = std::vector<std::string>;
constexpr auto U = PixmatEncoding_Unsigned, S = PixmatEncoding_Signed, F = PixmatEncoding_Float;
constexpr auto C = PixmatEncoding_Complex_Float, RGB = PixmatEncoding_RGB;
constexpr auto constant = ZELT_BoundaryCondition_ConstantValue;

com_ptr<IPixmat2> blank(PixmatEncoding encoding, int32_t bits, size s = small)
{
    com_ptr<IPixmat2> made;
    CheckHResult(CreateImageFromLayout(packed_layout(s.width, s.height, bits, encoding), made.put()));
    return made;
}

com_ptr<ICoordinateInt> at(int32_t x, int32_t y)
{
    com_ptr<ICoordinateInt> p;
    CheckHResult(Common::MakeCoordinateInt(x, y, p.put()));
    return p;
}
com_ptr<ICoordinateFloat> between(double x, double y)
{
    com_ptr<ICoordinateFloat> p;
    CheckHResult(Common::MakeCoordinateFloat(x, y, p.put()));
    return p;
}
com_ptr<IRectangle> area(int32_t left, int32_t top, int32_t right, int32_t bottom)
{
    com_ptr<IRectangle> r;
    CheckHResult(Common::MakeRectangle(left, top, right, bottom, r.put()));
    return r;
}

image_layout layout_of(const com_ptr<IPixmat2>& i)
{
    image_layout layout;
    EXPECT_EQ(ReadLayout(i.get(), &layout), S_OK);
    return layout;
}

class Compositing2 : public ::testing::Test {
protected:
    com_ptr<IBasicOps2> facet{make<CBasic2>()};
    com_ptr<IBasicOps> first{make<CBasic>()};
    com_ptr<IPixmat2> result;
    const com_ptr<IPixmat2> u8 = image<uint8_t>(U, 100), other = image<uint8_t>(U, 50),
                            u16 = image<uint16_t>(U, 1000), twelve = image<uint16_t>(U, 1000, small, 12),
                            f32 = image<float>(F, 2), f64 = image<double>(F, 3), complex = blank(C, 64),
                            rgb = blank(RGB, 24), rgba = blank(PixmatEncoding_RGBA, 32),
                            bgra = blank(PixmatEncoding_BGRA, 32), wide = blank(U, 64), few = blank(U, 7),
                            little = image<uint8_t>(U, 2, {3, 3});

    template <class Call>
    void refuses(HRESULT code, const wchar_t* text, Call&& call)
    {
        expect_fails(code, text, call);
        EXPECT_FALSE(result);
    }
};

TEST_F(Compositing2, ReportsAsTheFirstGenerationsInterface)
{
    EXPECT_EQ(facet->Combine(u8.get(), little.get(), u8.get(), nullptr, nullptr), E_INVALIDARG);
    const left_behind left = take_error();
    EXPECT_TRUE(left.interface_id == IBasicOps::iid);
    EXPECT_EQ(left.source, L"ZELT.Main");
    EXPECT_EQ(left.description, L"all input images must be of the same format");
}

TEST_F(Compositing2, AddOffsetChangesTheTargetInBothGenerations)
{
    ASSERT_EQ(facet->AddOffset(u8.get(), other.get(), between(1, 0).get(), 0.5, 2), S_OK);
    EXPECT_EQ(pixel_of<uint8_t>(u8), 100);
    EXPECT_EQ(pixel_of<uint8_t>(u8, 1, 0), 150);
    const auto a = image<float>(F, 1), b = image<float>(F, 8);
    ASSERT_EQ(first->AddOffset(a.get(), b.get(), between(1.75, 0.5).get(), ZELT_Offset_Integer), S_OK);
    EXPECT_EQ(pixel_of<float>(a), 1);
    EXPECT_EQ(pixel_of<float>(a, 1, 0), 9);
    ASSERT_EQ(first->AddOffset(a.get(), b.get(), between(1.75, 0.5).get(), ZELT_Offset_SubPixel), S_OK);
    EXPECT_EQ(pixel_of<float>(a, 1, 0), 9 + 0.25f * 0.5f * 8);
    EXPECT_EQ(pixel_of<float>(a, 3, 2), 9 + 8);
}

TEST_F(Compositing2, AddOffsetOpensNothingFarAway)
{
    auto x = random_image<uint8_t>(small, memory_layout::padded, 1);
    const auto a = object(x), b = object(x);
    for (const double far : {4.0, -4.0, 1e300, -1e300, std::numeric_limits<double>::quiet_NaN()}) {
        EXPECT_EQ(facet->AddOffset(a.get(), b.get(), between(far, 0).get(), 1, 1), S_OK);
        EXPECT_EQ(first->AddOffset(a.get(), b.get(), between(far, 0).get(), ZELT_Offset_Integer), S_OK);
    }
    EXPECT_EQ(a->calls, calls{});
    ASSERT_EQ(facet->AddOffset(a.get(), b.get(), between(3.5, 0).get(), 1, 1), S_OK);
    EXPECT_EQ(a->calls, (calls{"write", "commit", "release write"}));
    EXPECT_EQ(b->calls, (calls{"read", "release read"}));
    a->calls.clear();
    ASSERT_EQ(facet->AddOffset(a.get(), a.get(), between(0.5, 0).get(), 1, 1), S_OK);
    EXPECT_EQ(a->calls, (calls{"write", "commit", "release write"}));
}

TEST_F(Compositing2, AddOffsetRefuses)
{
    const auto p = between(0, 0);
    refuses(E_INVALIDARG, L"", [&] { return facet->AddOffset(nullptr, u8.get(), p.get(), 1, 1); });
    refuses(E_INVALIDARG, L"", [&] { return facet->AddOffset(u8.get(), nullptr, p.get(), 1, 1); });
    refuses(E_INVALIDARG, L"", [&] { return facet->AddOffset(u8.get(), u8.get(), nullptr, 1, 1); });
    for (const auto& i : {complex, rgba, bgra, wide, few, rgb}) {
        refuses(E_NOTIMPL, L"", [&] { return facet->AddOffset(i.get(), u8.get(), p.get(), 1, 1); });
        refuses(E_NOTIMPL, L"", [&] { return facet->AddOffset(u8.get(), i.get(), p.get(), 1, 1); });
    }
    refuses(E_NOTIMPL, L"",
            [&] { return facet->AddOffset(rgb.get(), blank(PixmatEncoding_BGR, 24).get(), p.get(), 1, 1); });
    EXPECT_EQ(facet->AddOffset(rgb.get(), rgb.get(), p.get(), 1, 1), S_OK);
    for (const int mode : {2, -1})
        refuses(E_INVALIDARG, L"", [&] {
            return first->AddOffset(u8.get(), u8.get(), p.get(), static_cast<ZELT_Offset>(mode));
        });
}

TEST_F(Compositing2, AddIntegerOffsetMakesAnImageLikeTheFirst)
{
    ASSERT_EQ(
        facet->AddIntegerOffset(twelve.get(), other.get(), at(-1, 1).get(), 0.5, 2, nullptr, result.put()),
        S_OK);
    EXPECT_EQ(layout_of(result), packed_layout(4, 3, 12, U));
    EXPECT_EQ(pixel_of<uint16_t>(result, 0, 0), 500);
    EXPECT_EQ(pixel_of<uint16_t>(result, 2, 1), 500 + 2 * 16 * 50);
    EXPECT_EQ(pixel_of<uint16_t>(result, 3, 1), 500);
    EXPECT_EQ(facet->AddIntegerOffset(u8.get(), other.get(), nullptr, 1, 1, other.get(), nullptr), S_OK);
    EXPECT_EQ(pixel_of<uint8_t>(other, 3, 2), 150) << "no position is (0, 0), no result is no fault";
}

TEST_F(Compositing2, AddIntegerOffsetRefuses)
{
    const auto p = at(0, 0);
    const auto run = [&](IPixmat2* a, IPixmat2* b, IPixmat2* out) {
        return facet->AddIntegerOffset(a, b, p.get(), 1, 1, out, result.put());
    };
    refuses(E_POINTER, L"",
            [&] { return facet->AddIntegerOffset(nullptr, nullptr, p.get(), 1, 1, nullptr, nullptr); });
    refuses(E_INVALIDARG, L"", [&] { return run(nullptr, u8.get(), nullptr); });
    refuses(E_INVALIDARG, L"", [&] { return run(u8.get(), nullptr, nullptr); });
    refuses(E_INVALIDARG, L"AddIntegerOffset: Source and destination image must be equal in size",
            [&] { return run(complex.get(), u8.get(), little.get()); });
    for (const auto& i : {complex, rgb, bgra, wide, few}) {
        refuses(E_NOTIMPL, L"", [&] { return run(i.get(), u8.get(), nullptr); });
        refuses(E_NOTIMPL, L"", [&] { return run(u8.get(), i.get(), u8.get()); });
    }
    refuses(E_INVALIDARG, L"", [&] { return run(u8.get(), u8.get(), u16.get()); });
    EXPECT_EQ(run(u16.get(), u8.get(), twelve.get()), S_OK) << "of one storage";
}

TEST_F(Compositing2, EqualsComparesFormatsThenPixels)
{
    VARIANT_BOOL same = 7;
    const auto ask = [&](const com_ptr<IPixmat2>& a, const com_ptr<IPixmat2>& b) {
        EXPECT_EQ(facet->Equals(a.get(), b.get(), &same), S_OK);
        return same;
    };
    EXPECT_EQ(ask(u8, image<uint8_t>(U, 100)), VARIANT_TRUE);
    EXPECT_EQ(ask(u8, other), VARIANT_FALSE);
    EXPECT_EQ(ask(u16, twelve), VARIANT_FALSE) << "other bits";
    EXPECT_EQ(ask(u8, image<int8_t>(S, 100)), VARIANT_FALSE) << "another encoding";
    EXPECT_EQ(ask(u8, image<uint8_t>(U, 100, {3, 4})), VARIANT_FALSE) << "another size";
    EXPECT_EQ(ask(wide, u8), VARIANT_FALSE) << "formats first";
    const auto padded = random_image<uint8_t>(small, memory_layout::padded, 1);
    auto packed = random_image<uint8_t>(small, memory_layout::packed, 1);
    EXPECT_EQ(ask(object(padded), object(packed)), VARIANT_TRUE) << "strides may differ";
    for (const auto& [encoding, bits] : {std::pair{RGB, 32},
                                         {PixmatEncoding_RGBA, 24},
                                         {PixmatEncoding_BGR, 24},
                                         {PixmatEncoding_BGR, 32},
                                         {S, 9},
                                         {U, 31},
                                         {PixmatEncoding_Complex_Float_Half_Odd, 128},
                                         {PixmatEncoding_Complex_Float_Half_Even, 64}})
        EXPECT_EQ(ask(blank(encoding, bits), blank(encoding, bits)), VARIANT_TRUE) << encoding << ' ' << bits;
    EXPECT_EQ(ask(blank(RGB, 24, {0, 4}), blank(RGB, 24, {0, 4})), VARIANT_TRUE);
}

TEST_F(Compositing2, EqualsRefuses)
{
    VARIANT_BOOL same = 7;
    expect_fails(E_INVALIDARG, L"", [&] { return facet->Equals(nullptr, u8.get(), nullptr); });
    expect_fails(E_INVALIDARG, L"", [&] { return facet->Equals(u8.get(), nullptr, &same); });
    expect_fails(E_POINTER, L"", [&] { return facet->Equals(u8.get(), u8.get(), nullptr); });
    for (const auto& i : {wide, few, bgra, blank(U, 24), blank(PixmatEncoding_Data, 8), blank(RGB, 48)})
        expect_fails(E_NOTIMPL, L"", [&] { return facet->Equals(i.get(), i.get(), &same); });
    EXPECT_EQ(same, 7);
}

TEST_F(Compositing2, MarginsKeepTheDescriptor)
{
    ASSERT_EQ(facet->Margins(twelve.get(), 0, nullptr, result.put()), S_OK);
    EXPECT_EQ(layout_of(result), packed_layout(4, 3, 12, U));
    const auto a = image<int16_t>(S, 9);
    ASSERT_EQ(facet->Margins(a.get(), 0, a.get(), result.put()), S_OK);
    EXPECT_EQ(result.get(), a.get());
    EXPECT_EQ(pixel_of<int16_t>(a, 3, 0), -32768);
    EXPECT_EQ(pixel_of<int16_t>(a, 0, 2), -32768);
    EXPECT_EQ(pixel_of<int16_t>(a, 3, 2), 9);
    EXPECT_EQ(facet->Margins(u16.get(), 5, twelve.get(), nullptr), E_POINTER) << "after the work";
    EXPECT_EQ(pixel_of<uint16_t>(twelve, 2, 2), 0);
}

TEST_F(Compositing2, MarginsRefuse)
{
    const auto run = [&](IPixmat2* i, IPixmat2* out) { return facet->Margins(i, 1, out, result.put()); };
    refuses(E_INVALIDARG, L"", [&] { return run(nullptr, u8.get()); });
    refuses(E_INVALIDARG, L"", [&] { return run(u8.get(), little.get()); });
    refuses(E_INVALIDARG, L"", [&] { return run(u8.get(), u16.get()); });
    for (const auto& i : {complex, rgb, bgra, wide, few})
        refuses(E_NOTIMPL, L"", [&] { return run(i.get(), nullptr); });
}

TEST_F(Compositing2, CombineBlends)
{
    const auto mask = image<uint8_t>(U, 51);
    ASSERT_EQ(facet->Combine(u8.get(), other.get(), mask.get(), nullptr, result.put()), S_OK);
    EXPECT_EQ(pixel_of<uint8_t>(result, 3, 2), 90);
    const auto twelve_mask = image<uint16_t>(U, 65535, small, 12);
    ASSERT_EQ(facet->Combine(twelve.get(), twelve_mask.get(), twelve_mask.get(), nullptr, result.put()),
              S_OK);
    EXPECT_EQ(layout_of(result), packed_layout(4, 3, 12, U));
    EXPECT_EQ(pixel_of<uint16_t>(result), 65535) << "the range is that of the storage";
    const auto whole_mask = image<int16_t>(S, 32767);
    ASSERT_EQ(facet->Combine(image<int16_t>(S, 100).get(), image<int16_t>(S, 1000).get(), whole_mask.get(),
                             nullptr, result.put()),
              S_OK);
    EXPECT_EQ(pixel_of<int16_t>(result), 1000) << "a whole weight leaves nothing of the base";
    EXPECT_EQ(facet->Combine(u8.get(), other.get(), mask.get(), other.get(), nullptr), E_POINTER);
    EXPECT_EQ(pixel_of<uint8_t>(other), 90);
}

TEST_F(Compositing2, CombineRefusesInItsOrder)
{
    const wchar_t* const inputs = L"all input images must be of the same format";
    const wchar_t* const outputs = L"input and output images must be of the same format";
    const auto run = [&](const com_ptr<IPixmat2>& a, const com_ptr<IPixmat2>& b, const com_ptr<IPixmat2>& m,
                         const com_ptr<IPixmat2>& out = {}) {
        return facet->Combine(a.get(), b.get(), m.get(), out.get(), result.put());
    };
    refuses(E_INVALIDARG, L"", [&] { return run({}, u8, u8); });
    refuses(E_INVALIDARG, L"", [&] { return run(u8, {}, u8); });
    refuses(E_INVALIDARG, L"", [&] { return run(u8, u8, {}); });
    refuses(E_INVALIDARG, inputs, [&] { return run(u8, u8, u16, little); });
    refuses(E_INVALIDARG, inputs, [&] { return run(u16, twelve, u16); });
    refuses(E_INVALIDARG, inputs, [&] { return run(u8, little, u8); });
    refuses(E_INVALIDARG, outputs, [&] { return run(u8, u8, u8, little); });
    refuses(E_INVALIDARG, outputs, [&] { return run(u16, u16, u16, twelve); });
    for (const auto& i : {complex, rgb, bgra, wide, few})
        refuses(E_NOTIMPL, L"", [&] { return run(i, i, i, i); });
}

TEST_F(Compositing2, ModulateShadesThreeBytes)
{
    const colour_32 grey{{200, 100, 0, 77}};
    const auto a = image<colour_32>(PixmatEncoding_RGBA, grey);
    const auto mask = image<uint8_t>(U, 255), half = image<float>(F, 0.25f);
    ASSERT_EQ(facet->Modulate(a.get(), mask.get(), 1, nullptr, result.put()), S_OK);
    const auto bright = pixel_of<colour_32>(result);
    EXPECT_EQ(show(bright), "255 255 255 0 ") << "the fourth byte is not written";
    ASSERT_EQ(facet->Modulate(a.get(), half.get(), 0.5, a.get(), result.put()), S_OK);
    EXPECT_EQ(show(pixel_of<colour_32>(a)), "112 79 0 77 ");
    EXPECT_EQ(facet->Modulate(a.get(), half.get(), 0.5, a.get(), nullptr), E_POINTER);
}

TEST_F(Compositing2, ModulateRefusesInItsOrder)
{
    const auto run = [&](const com_ptr<IPixmat2>& i, const com_ptr<IPixmat2>& m,
                         const com_ptr<IPixmat2>& out = {}) {
        return facet->Modulate(i.get(), m.get(), 0.5, out.get(), result.put());
    };
    refuses(E_INVALIDARG, L"", [&] { return run({}, u8); });
    refuses(E_INVALIDARG, L"", [&] { return run(rgb, {}); });
    for (const auto& i : {u8, f32, complex, bgra})
        refuses(E_NOTIMPL, L"Source image must have color encoding", [&] { return run(i, little, u8); });
    refuses(E_INVALIDARG, L"Image and mask must have the same size", [&] { return run(rgb, little, u8); });
    for (const auto& out : {rgba, blank(PixmatEncoding_BGR, 24), blank(RGB, 24, {3, 3})})
        refuses(E_INVALIDARG, L"input and output images must be of the same format",
                [&] { return run(rgb, wide, out); });
    for (const auto& m : {complex, rgb, wide, few}) refuses(E_NOTIMPL, L"", [&] { return run(rgb, m); });
    refuses(E_NOTIMPL, L"", [&] { return run(blank(RGB, 48), u8); });
}

TEST_F(Compositing2, ExtendDeclaresTheBitsOfTheStorage)
{
    ASSERT_EQ(facet->Extend(twelve.get(), area(-2, -2, 6, 5).get(), constant, 7.9, nullptr, result.put()),
              S_OK);
    EXPECT_EQ(layout_of(result), packed_layout(8, 7, 16, U));
    EXPECT_EQ(pixel_of<uint16_t>(result, 1, 2), 7);
    EXPECT_EQ(pixel_of<uint16_t>(result, 2, 2), 1000);
    EXPECT_EQ(pixel_of<uint16_t>(result, 5, 4), 1000);
    EXPECT_EQ(pixel_of<uint16_t>(result, 6, 4), 7);
    EXPECT_EQ(facet->Extend(u8.get(), area(1, 0, 5, 3).get(), constant, 0, u8.get(), nullptr), E_POINTER);
    EXPECT_EQ(pixel_of<uint8_t>(u8, 2, 2), 100);
    EXPECT_EQ(pixel_of<uint8_t>(u8, 3, 2), 0) << "in place";
}

TEST_F(Compositing2, ExtendRefusesInItsOrder)
{
    const auto domain = area(0, 0, 2, 2);
    const auto run = [&](const com_ptr<IPixmat2>& i, const com_ptr<IRectangle>& r,
                         const com_ptr<IPixmat2>& out = {}) {
        return facet->Extend(i.get(), r.get(), constant, 0, out.get(), result.put());
    };
    for (const int other_condition : {1, 2, 3, 4, 5, -1})
        refuses(E_NOTIMPL, L"", [&] {
            return facet->Extend(nullptr, nullptr, static_cast<ZELT_BoundaryCondition>(other_condition), 0,
                                 nullptr, nullptr);
        });
    refuses(E_INVALIDARG, L"", [&] { return run(u8, {}); });
    refuses(E_INVALIDARG, L"null IPixmat2", [&] { return run({}, domain); });
    refuses(E_INVALIDARG, L"null IPixmat2", [&] { return run({}, domain, u8); });
    refuses(E_INVALIDARG, L"Extend: src and dst pixel types must be identical",
            [&] { return run(complex, domain, u8); });
    refuses(E_INVALIDARG, L"Extend: dst size mismatch", [&] { return run(complex, domain, complex); });
    for (const auto& i : {complex, rgb, rgba, bgra, wide})
        refuses(E_INVALIDARG, L"Extend: unsupported pixel type", [&] { return run(i, domain); });
}

TEST_F(Compositing2, ExtendSurvivesRectanglesAtTheLimits)
{
    constexpr int32_t low = INT32_MIN, high = INT32_MAX;
    const auto run = [&](const com_ptr<IRectangle>& r, IPixmat2* out = nullptr) {
        SetErrorInfo(0, nullptr);
        return facet->Extend(f32.get(), r.get(), constant, 1, out, result.put());
    };
    for (const auto& backwards :
         {area(1, 0, 0, 2), area(0, 2, 2, 1), area(high, 0, low, 1), area(0, high, 1, low)})
        EXPECT_EQ(run(backwards), E_INVALIDARG);
    for (const auto& huge :
         {area(low, 0, high, 1), area(0, low, 1, high), area(low, low, high, high), area(0, 0, high, high)}) {
        EXPECT_EQ(run(huge), E_OUTOFMEMORY);
        refuses(E_INVALIDARG, L"Extend: dst size mismatch", [&] { return run(huge, f32.get()); });
    }
    for (const auto& [r, s] : {std::pair{area(low, low, low + 2, low + 3), size{2, 3}},
                               {area(high - 3, high - 1, high, high), size{3, 1}},
                               {area(5, 1, 5, 9), size{0, 8}}}) {
        ASSERT_EQ(run(r), S_OK);
        EXPECT_EQ(layout_of(result).width, s.width);
        EXPECT_EQ(layout_of(result).height, s.height);
        if (s.width == 0) continue;
        EXPECT_EQ(pixel_of<float>(result, s.width - 1, s.height - 1), 1.0f);
    }
}

/// Each method once, with images a and b of one format, into an output that may be null.
using one_method = std::function<HRESULT(IPixmat2* a, IPixmat2* b, IPixmat2* out, IPixmat2** result)>;

std::vector<one_method> methods_of(IBasicOps2* facet)
{
    const auto whole = area(-1, 0, 3, 3);
    const auto p = at(1, 0);
    return {[=](IPixmat2* a, IPixmat2* b, IPixmat2* out, IPixmat2** r) {
                return facet->AddIntegerOffset(a, b, p.get(), 1, 0.3, out, r);
            },
            [=](IPixmat2* a, IPixmat2*, IPixmat2* out, IPixmat2** r) { return facet->Margins(a, 1, out, r); },
            [=](IPixmat2* a, IPixmat2* b, IPixmat2* out, IPixmat2** r) {
                return facet->Combine(a, b, b, out, r);
            },
            [=](IPixmat2* a, IPixmat2*, IPixmat2* out, IPixmat2** r) {
                return facet->Extend(a, whole.get(), constant, 0, out, r);
            }};
}

TEST_F(Compositing2, PassesOnWhatImagesAnswerAndCommitsNothing)
{
    auto x = random_image<uint8_t>(small, memory_layout::packed, 1), y = x, z = x;
    for (const auto where : {failing::descriptor, failing::descriptor_value, failing::open_read,
                             failing::open_write, failing::commit})
        for (const bool of_output : {false, true}) {
            if (where == failing::open_read ? of_output : where >= failing::open_write && !of_output)
                continue;
            const auto a = object(x, of_output ? failing::nothing : where), b = object(y),
                       out = object(z, of_output ? where : failing::nothing);
            for (const auto& method : methods_of(facet.get())) {
                refuses(E_ACCESSDENIED, L"",
                        [&] { return method(a.get(), b.get(), out.get(), result.put()); });
                EXPECT_TRUE(where == failing::commit || std::ranges::count(out->calls, "commit") == 0);
            }
        }
}

TEST_F(Compositing2, AnswersWhenMemoryEnds)
{
    for (const auto& method : methods_of(facet.get()))
        for (IPixmat2* const out : {static_cast<IPixmat2*>(nullptr), other.get()}) // in place: through a copy
            for (int n = 1;; ++n) {
                HRESULT hr;
                bool reached;
                {
                    com_ptr<IPixmat2> made;
                    const failing_allocation armed(n);
                    hr = method(other.get(), other.get(), out, made.put());
                    reached = armed.happened();
                }
                if (!reached) {
                    EXPECT_EQ(hr, S_OK);
                    break;
                }
                EXPECT_EQ(hr, E_OUTOFMEMORY) << n;
                ASSERT_LT(n, 100);
            }
}

TEST(CompositingByName, LeavesOutTheOptionalArguments)
{
    const auto facet = make<CBasic2Disp>();
    const auto call = [&](const char* name, const std::vector<variant>& arguments) {
        variant answer;
        for (const method_info& m : table_of<IBasicOps2>().methods)
            if (std::string(m.name) == name) {
                EXPECT_EQ(late_call(facet.get(), m, arguments)(&answer), S_OK) << name;
            }
        return answer;
    };
    const auto a = image<uint8_t>(U, 5);
    EXPECT_EQ(call("Equals", {variant(a.get()), variant(a.get())})->boolVal, VARIANT_TRUE);
    const variant framed = call("Margins", {variant(a.get())});
    EXPECT_EQ(pixel_of<uint8_t>(query<IPixmat2>(framed->pdispVal), 1, 1), 5);
    EXPECT_EQ(pixel_of<uint8_t>(query<IPixmat2>(framed->pdispVal), 0, 1), 0);
    const variant padded = call("Extend", {variant(a.get()), variant(area(-1, 0, 2, 2).get())});
    EXPECT_EQ(pixel_of<uint8_t>(query<IPixmat2>(padded->pdispVal), 0, 0), 0);
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
