#include "flatfield/flatfield.h"

#include "flatfield_cases.h"
#include "frame/image_access.h"
#include "support/facets.h"
#include "support/failures.h"
#include "support/foreign_image.h"

#include <ctime>
#include <limits>
#include <thread>

namespace Qor::Luxar::ZELT::Test {
namespace {

using calls = std::vector<std::string>;

/// An object over the pixels of a test image, that tells what was asked of it.
template <class T>
com_ptr<foreign_image> object(const test_image<T>& i, failing where = failing::nothing)
{
    return com_ptr<foreign_image>::attach(new foreign_image(i.layout(), i.data(), where));
}

/// An image of the library, packed, whose pixels are all of one value.
template <class T>
com_ptr<IPixmat2> constant(size s, PixmatEncoding encoding, T value, int32_t bits = 8 * sizeof(T))
{
    com_ptr<IPixmat2> image;
    EXPECT_EQ(CreateImageFromLayout(packed_layout(s.width, s.height, bits, encoding), image.put()), S_OK);
    ImageWriteAccess access(image.get());
    for (int i = 0; i < s.width * s.height; ++i)
        std::memcpy(access.view().data + i * int(sizeof(T)), &value, sizeof(T));
    EXPECT_EQ(access.Commit(), S_OK);
    return image;
}
template <class T>
T first_pixel(IPixmat2* image)
{
    const ImageReadAccess access(image);
    T value;
    std::memcpy(&value, access.view().data + access.view().offset, sizeof value);
    return value;
}

constexpr size small{6, 4};
constexpr auto U = PixmatEncoding_Unsigned, S = PixmatEncoding_Signed, F = PixmatEncoding_Float;

class FlatFielding : public ::testing::Test {
protected:
    com_ptr<IFlatFielding> facet{make<CFlatFielding>()};
    test_image<uint16_t> src = random_image<uint16_t>(small, memory_layout::padded, 1);
    test_image<uint16_t> brief = random_image<uint16_t>(small, memory_layout::padded, 2);
    test_image<uint16_t> dark = random_image<uint16_t>(small, memory_layout::flipped, 3);
    test_image<uint16_t> gain = random_image<uint16_t>(small, memory_layout::packed, 4);
    test_image<int16_t> dst{small, memory_layout::inset};
};

/// Row by row this took a quarter of a minute.
TEST_F(FlatFielding, ManyRowsWithoutPixelsEndAtOnce)
{
    const image_layout tall{0, std::numeric_limits<int32_t>::max(), 16, U, 0, 2, 0};
    const auto frame = com_ptr<foreign_image>::attach(new foreign_image(tall, src.data()));
    const auto start = std::clock();
    EXPECT_EQ(facet->Flatten(frame.get(), frame.get(), frame.get(), nullptr, 1), S_OK);
    EXPECT_LT(std::clock() - start, 2 * CLOCKS_PER_SEC); // of the processor, however busy the machine is
}

TEST_F(FlatFielding, ComputesThenCommitsAndLetsGo)
{
    const auto check = [&](auto call, auto expected, std::initializer_list<foreign_image*> sources,
                           foreign_image* to) {
        ASSERT_EQ(call(), S_OK);
        expect_equal(dst, expected);
        for (auto* s : sources) EXPECT_EQ(s->calls, (calls{"read", "release read"}));
        EXPECT_EQ(to->calls, (calls{"write", "commit", "release write"}));
    };
    {
        const auto s = object(src), d = object(dst);
        check([&] { return facet->ToDarkRef(d.get(), s.get(), 7); },
              [&](int x, int y) { return static_cast<int16_t>(src.at(x, y) - 7); }, {s.get()}, d.get());
    }
    {
        const auto s = object(src), r = object(dark), g = object(gain), d = object(dst);
        check([&] { return facet->Flatten(d.get(), s.get(), r.get(), g.get(), 3); },
              [&](int x, int y) { return with_gain<int16_t>(src.at(x, y), dark.at(x, y), gain.at(x, y), 3); },
              {s.get(), r.get(), g.get()}, d.get());
    }
    {
        const auto s = object(src), h = object(brief), r = object(dark), d = object(dst);
        check([&] { return facet->FlattenDouble(d.get(), s.get(), h.get(), 2.0, r.get(), nullptr, 1); },
              [&](int x, int y) {
                  if (src.at(x, y) == 65535)
                      return static_cast<int16_t>(std::clamp((65535 - dark.at(x, y)) * 2, -32768, 32767));
                  return static_cast<int16_t>(std::clamp(brief.at(x, y) - dark.at(x, y), -32768, 32767));
              },
              {s.get(), h.get(), r.get()}, d.get());
    }
    test_image<float> map(small);
    const auto s = object(src), d = object(map);
    ASSERT_EQ(facet->ToGainRef(d.get(), s.get(), 100.0, 1), S_OK);
    expect_equal(map, [&](int x, int y) {
        return src.at(x, y) == 0 ? 50.0f : static_cast<float>(std::min(100.0 / src.at(x, y), 50.0));
    });
    EXPECT_EQ(d->calls, (calls{"write", "commit", "release write"}));
}

TEST_F(FlatFielding, TakesItsDestinationAsAnyOtherImage)
{
    auto image = src;
    const auto both = object(image), r = object(dark), g = object(gain);
    ASSERT_EQ(facet->Flatten(both.get(), both.get(), r.get(), g.get(), 1), S_OK);
    expect_equal(image, [&](int x, int y) {
        return with_gain<uint16_t>(src.at(x, y), dark.at(x, y), gain.at(x, y), 1);
    });
}

TEST_F(FlatFielding, RefusesNullImagesWithoutAText)
{
    const auto s = object(src), d = object(dst);
    IPixmat2* result = nullptr;
    const auto refuses = [](HRESULT code, auto call) { expect_fails(code, L"", call); };
    refuses(E_INVALIDARG, [&] { return facet->ToDarkRef(nullptr, s.get(), 0); });
    refuses(E_INVALIDARG, [&] { return facet->ToDarkRef(d.get(), nullptr, 0); });
    refuses(E_INVALIDARG, [&] { return facet->ToGainRef(nullptr, s.get(), 1, 1); });
    refuses(E_INVALIDARG, [&] { return facet->ToGainRef(d.get(), nullptr, 1, 1); });
    refuses(E_INVALIDARG, [&] { return facet->Flatten(nullptr, s.get(), s.get(), nullptr, 1); });
    refuses(E_INVALIDARG, [&] { return facet->Flatten(d.get(), nullptr, s.get(), nullptr, 1); });
    refuses(E_INVALIDARG, [&] { return facet->Flatten(d.get(), s.get(), nullptr, nullptr, 1); });
    refuses(E_INVALIDARG,
            [&] { return facet->FlattenDouble(nullptr, s.get(), nullptr, 1, s.get(), nullptr, 1); });
    refuses(E_INVALIDARG,
            [&] { return facet->FlattenDouble(d.get(), nullptr, nullptr, 1, s.get(), nullptr, 1); });
    refuses(E_INVALIDARG, [&] { return facet->ToDarkRefEx(nullptr, S, 0, &result); });
    refuses(E_INVALIDARG, [&] { return facet->ToGainRefEx(nullptr, F, 1, 1, &result); });
    refuses(E_INVALIDARG, [&] { return facet->FlattenEx(nullptr, U, s.get(), nullptr, 1, &result); });
    refuses(E_INVALIDARG, [&] { return facet->FlattenEx(s.get(), U, nullptr, nullptr, 1, &result); });
    refuses(E_POINTER, [&] { return facet->ToDarkRefEx(s.get(), S, 0, nullptr); });
    refuses(E_POINTER, [&] { return facet->ToGainRefEx(s.get(), U, 1, 1, nullptr); });
    refuses(E_POINTER, [&] { return facet->FlattenEx(s.get(), U, s.get(), nullptr, 1, nullptr); });
    EXPECT_EQ(result, nullptr);
    EXPECT_EQ(d->calls, calls{});
}

TEST_F(FlatFielding, RefusesOtherTypesAndSizesWithoutTextOrCommit)
{
    const test_image<uint32_t> other(small);
    const test_image<uint16_t> little({5, 4});
    const auto s = object(src), l = object(little);
    const auto refuses = [](HRESULT code, const com_ptr<foreign_image>& d, auto call) {
        d->calls.clear();
        expect_fails(code, L"", call);
        EXPECT_EQ(d->calls, (calls{"write", "release write"}));
    };
    const auto wrong = object(other), d = object(dst);
    refuses(E_NOTIMPL, wrong, [&] { return facet->ToDarkRef(wrong.get(), s.get(), 0); });
    refuses(E_NOTIMPL, wrong, [&] { return facet->ToGainRef(wrong.get(), s.get(), 1, 1); });
    refuses(E_NOTIMPL, d, [&] { return facet->Flatten(d.get(), s.get(), wrong.get(), nullptr, 1); });
    refuses(E_NOTIMPL, d,
            [&] { return facet->FlattenDouble(d.get(), s.get(), nullptr, 1, nullptr, nullptr, 1); });
    refuses(E_INVALIDARG, l, [&] { return facet->ToDarkRef(l.get(), s.get(), 0); });
    refuses(E_INVALIDARG, l, [&] { return facet->ToGainRef(l.get(), s.get(), 1, 1); });
    refuses(E_INVALIDARG, d, [&] { return facet->Flatten(d.get(), s.get(), l.get(), nullptr, 1); });
    refuses(E_INVALIDARG, d,
            [&] { return facet->FlattenDouble(d.get(), s.get(), nullptr, 1, l.get(), nullptr, 1); });
    expect_equal(dst, [](int, int) { return int16_t{0}; });
}

TEST_F(FlatFielding, PassesOnWhatImagesAnswer)
{
    for (const auto where : {failing::descriptor, failing::descriptor_value, failing::open_read,
                             failing::open_write, failing::commit})
        for (int which = 0; which < 5; ++which) {
            const bool of_destination = which == 0;
            if (where == failing::open_read ? of_destination
                                            : where >= failing::open_write && !of_destination)
                continue;
            const auto part = [&](int i) { return i == which ? where : failing::nothing; };
            const auto d = object(dst, part(0)), s = object(src, part(1)), r = object(dark, part(2)),
                       g = object(gain, part(3)), h = object(brief, part(4));
            step("place " + std::to_string(int(where)) + ", image " + std::to_string(which), [&] {
                expect_fails(E_ACCESSDENIED, L"", [&] {
                    return facet->FlattenDouble(d.get(), s.get(), which == 4 ? h.get() : nullptr, 1, r.get(),
                                                g.get(), 1);
                });
                if (which == 4) return;
                expect_fails(E_ACCESSDENIED, L"",
                             [&] { return facet->Flatten(d.get(), s.get(), r.get(), g.get(), 1); });
                if (which >= 2) return;
                expect_fails(E_ACCESSDENIED, L"", [&] { return facet->ToDarkRef(d.get(), s.get(), 1); });
            });
        }
}

TEST_F(FlatFielding, RefusesWrongExposuresWithItsTextBeforeAnyLock)
{
    const test_image<float> f32(small);
    const auto s = object(src), r = object(dark), d = object(dst), f = object(f32);
    const auto refuses = [&](const wchar_t* text, IPixmat2* to, IPixmat2* l, IPixmat2* h, IPixmat2* d0,
                             IPixmat2* g) {
        expect_fails(E_INVALIDARG, text, [&] { return facet->FlattenDouble(to, l, h, 1.0, d0, g, 1); });
    };
    refuses(L"Destination image must be signed", s.get(), f.get(), nullptr, nullptr, nullptr);
    refuses(L"Source image must be unsigned 16 max", d.get(), f.get(), r.get(), f.get(), nullptr);
    refuses(L"Dark reference must be 16 bit signed or unsigned", d.get(), s.get(), r.get(), f.get(), d.get());
    refuses(L"Gain reference must be 16 bit unsigned or 32 bit float", d.get(), s.get(), r.get(), nullptr,
            d.get());
    refuses(L"Short exposure must be same encoding as long exposure", d.get(), s.get(), r.get(), nullptr,
            f.get());
    refuses(L"Gain reference provided without dark reference", d.get(), s.get(), nullptr, nullptr, f.get());
    for (const auto& i : {s, r, d, f}) EXPECT_EQ(i->calls, calls{});
    const auto unreadable = object(src, failing::descriptor);
    refuses(L"Destination image must be signed", s.get(), unreadable.get(), nullptr, nullptr, nullptr);
}

TEST_F(FlatFielding, MakesNewImagesWithTheInputsDescriptor)
{
    const auto s = object(src), r = object(dark);
    const auto check = [&](auto call, PixmatEncoding encoding) {
        com_ptr<IPixmat2> result;
        ASSERT_EQ(call(result.put()), S_OK);
        image_layout made, expected = src.layout();
        ASSERT_EQ(ReadLayout(result.get(), &made), S_OK);
        expected.encoding = encoding;
        EXPECT_EQ(made, expected);
        EXPECT_EQ(result->AddRef(), 2u) << "one reference, the caller's";
        result->Release();
    };
    check([&](IPixmat2** out) { return facet->ToDarkRefEx(s.get(), S, 7, out); }, S);
    check([&](IPixmat2** out) { return facet->ToGainRefEx(s.get(), U, -1, 1, out); }, U);
    check([&](IPixmat2** out) { return facet->FlattenEx(s.get(), S, r.get(), nullptr, 1, out); }, S);

    com_ptr<IPixmat2> result;
    expect_fails(E_NOTIMPL, L"",
                 [&] { return facet->FlattenEx(s.get(), F, r.get(), nullptr, 1, result.put()); });
    EXPECT_FALSE(result) << "Float of 16 bits";
}

TEST(FlatFieldingByName, TakesTheDocumentedDefaults)
{
    const auto facet = make<CFlatFieldingDisp>();
    const auto frame = constant<uint16_t>(small, U, 500), dark = constant<uint16_t>(small, U, 100);
    const auto late = [&](size_t method, std::vector<variant> arguments) {
        variant result;
        const auto& m = table_of<IFlatFielding>().methods[method];
        EXPECT_EQ(late_call(facet.get(), m, arguments)(&result), S_OK) << m.name;
        return result;
    };
    const auto image = [](const com_ptr<IPixmat2>& i) { return variant(i.get()); };

    variant made = late(3, {image(frame), variant(int32_t{U})}); // ToGainRefEx: the mean, scale 1
    const auto gain = query<IPixmat2>(made->pdispVal);
    EXPECT_EQ(first_pixel<uint16_t>(gain.get()), 32768);

    made = late(5, {image(frame), variant(int32_t{U}), image(dark), image(gain)}); // FlattenEx: scale 1
    EXPECT_EQ(first_pixel<uint16_t>(query<IPixmat2>(made->pdispVal).get()), 400);
    made = late(5, {image(frame), variant(int32_t{S}), image(dark)});
    EXPECT_EQ(first_pixel<int16_t>(query<IPixmat2>(made->pdispVal).get()), 400);
    made = late(1, {image(frame), variant(int32_t{U})}); // ToDarkRefEx: offset 0
    EXPECT_EQ(first_pixel<uint16_t>(query<IPixmat2>(made->pdispVal).get()), 500);

    const auto dst = constant<float>(small, F, 0);
    late(2, {image(dst), image(frame)}); // ToGainRef
    EXPECT_EQ(first_pixel<float>(dst.get()), 1.0f);
    late(4, {image(dst), image(frame), image(dark)}); // Flatten
    EXPECT_EQ(first_pixel<float>(dst.get()), 400.0f);
}

TEST(FlatFieldingThreads, CallsOnOneFacetWaitForEachOther)
{
    const com_ptr<IFlatFielding> facet{make<CFlatFielding>()};
    const auto work = [&](uint16_t value) {
        const auto frame = constant<uint16_t>({300, 50}, U, value),
                   dark = constant<uint16_t>({300, 50}, U, 1);
        const auto dst = constant<int32_t>({300, 50}, S, 0);
        for (int i = 0; i < 50; ++i)
            EXPECT_EQ(facet->Flatten(dst.get(), frame.get(), dark.get(), nullptr, 1), S_OK);
        EXPECT_EQ(first_pixel<int32_t>(dst.get()), value - 1);
    };
    std::thread other(work, uint16_t{7});
    work(9);
    other.join();
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
