#include "frame/image_access.h"

#include "frame/event_sink.h"
#include "frame/operation.h"
#include "support/cases.h"
#include "support/failures.h"
#include "support/foreign_image.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

image_layout layout_of(IPixmat2* image)
{
    image_layout layout;
    EXPECT_EQ(ReadLayout(image, &layout), S_OK);
    return layout;
}

com_ptr<IPixmat2> new_image(const image_layout& layout)
{
    com_ptr<IPixmat2> image;
    EXPECT_EQ(CreateImageFromLayout(layout, image.put()), S_OK);
    return image;
}

TEST(ImageAccess, ViewIsThatOfTheDescriptor)
{
    alignas(8) uint16_t pixels[12] = {};
    const image_layout flipped{3, 2, 12, PixmatEncoding_Unsigned, 14, 2, -8};
    const auto image = make<foreign_image>(flipped, pixels);
    const ImageReadAccess access(image.get());
    const memory_2d& v = access.view();
    EXPECT_EQ(v.type, pixel_type::unsigned_16);
    EXPECT_EQ(v.width, 3);
    EXPECT_EQ(v.height, 2);
    EXPECT_EQ(v.offset, 14);
    EXPECT_EQ(v.x_stride, 2);
    EXPECT_EQ(v.y_stride, -8);
    EXPECT_EQ(v.data, reinterpret_cast<uint8_t*>(pixels));
}

TEST(ImageAccess, FailuresOfTheImageAreItsOwnCodes)
{
    uint8_t pixel[1] = {};
    const image_layout layout = packed_layout(1, 1, 8, PixmatEncoding_Unsigned);
    for (const failing where : {failing::descriptor, failing::descriptor_value, failing::open_read}) {
        const auto image = make<foreign_image>(layout, pixel, where);
        expect_fails(E_ACCESSDENIED, L"", [&] {
            return run_frame(IPixmat2::iid, [&] {
                ImageReadAccess access(image.get());
                return S_OK;
            });
        });
        const std::vector<std::string> no_lock = {"read"};
        const std::vector<std::string> released = {"read", "release read"};
        EXPECT_EQ(image->calls, where == failing::open_read ? no_lock : released);
    }
    expect_throws<std::invalid_argument>([] { ImageReadAccess access(nullptr); }, "null IPixmat2");
    expect_throws<std::invalid_argument>([] { ImageWriteAccess access(nullptr); }, "null IPixmat2");
    const auto data = make<foreign_image>(packed_layout(1, 1, 8, PixmatEncoding_Data), pixel);
    expect_throws<std::invalid_argument>([&] { ImageReadAccess access(data.get()); },
                                         "Unsupported Pixmat encoding/bits");
}

TEST(ImageAccess, HasOneOwner)
{
    static_assert(!std::is_copy_constructible_v<ImageReadAccess> &&
                  !std::is_copy_constructible_v<ImageWriteAccess>);
    uint8_t pixel[1] = {};
    const auto image = make<foreign_image>(packed_layout(1, 1, 8, PixmatEncoding_Unsigned), pixel);
    {
        ImageReadAccess first(image.get());
        const ImageReadAccess second(std::move(first));
        EXPECT_EQ(second.view().data, pixel);
    }
    EXPECT_EQ(image->calls, (std::vector<std::string>{"read", "release read"}));
}

TEST(ImageAccess, MethodCommitsBeforeItReleasesAndOnlyOnSuccess)
{
    uint8_t pixel[1] = {};
    const auto image = make<foreign_image>(packed_layout(1, 1, 8, PixmatEncoding_Unsigned), pixel);
    com_ptr<IPixmat2> result;
    const auto body = [&](bool fail) {
        return image_method<IPixmat2>(result.put(), [&] {
            auto dst = ResolveOutput(image.get(), image.get());
            ImageReadAccess src(image.get());
            if (fail) throw std::invalid_argument("no");
            return committed(dst);
        });
    };
    EXPECT_EQ(body(false), S_OK);
    EXPECT_TRUE(same_object(result.get(), image.get()));
    EXPECT_EQ(image->calls,
              (std::vector<std::string>{"write", "read", "commit", "release read", "release write"}));
    image->calls.clear();
    EXPECT_EQ(body(true), E_INVALIDARG);
    EXPECT_FALSE(result);
    EXPECT_EQ(image->calls, (std::vector<std::string>{"write", "read", "release read", "release write"}));
}

TEST(ImageAccess, NullResultIsAnErrorOnlyAfterTheWork)
{
    const com_ptr<IPixmat2> out = new_image(packed_layout(2, 1, 8, PixmatEncoding_Unsigned));
    const HRESULT hr = image_method<IPixmat2>(nullptr, [&] {
        auto dst = ResolveOutput(nullptr, out.get());
        dst.view().data[0] = 7;
        return committed(dst);
    });
    EXPECT_EQ(hr, E_POINTER);
    EXPECT_EQ(ImageReadAccess(out.get()).view().data[0], 7);
}

TEST(ImageAccess, NewOutputsDeclareTheBitsOfTheirStorage)
{
    const com_ptr<IPixmat2> input = new_image({5, 4, 12, PixmatEncoding_Unsigned, 0, 2, 64});
    const auto like = ResolveOutput(input.get(), nullptr);
    EXPECT_EQ(layout_of(like.image()), packed_layout(5, 4, 16, PixmatEncoding_Unsigned));
    const auto sized = ResolveOutputSized(input.get(), nullptr, {7, 3});
    EXPECT_EQ(layout_of(sized.image()), packed_layout(7, 3, 16, PixmatEncoding_Unsigned));
    for (int t = 0; t < pixel_type_count; ++t) {
        const auto typed = ResolveOutputTyped(nullptr, {3, 2}, static_cast<pixel_type>(t));
        EXPECT_EQ(static_cast<int>(typed.view().type), t);
    }
    const auto given =
        ResolveOutputSized(input.get(), input.get(), {1000, 1000}); // the operation tests the size
    EXPECT_TRUE(same_object(given.image(), input.get()));
    expect_throws<std::invalid_argument>([] { ResolveOutput(nullptr, nullptr); }, "null IPixmat2");
}

TEST(ImageAccess, LayoutsAreTakenAsTheyAre)
{
    const image_layout odd{3, 4, 12, PixmatEncoding_Signed, 40, 6, -10};
    EXPECT_EQ(layout_of(new_image(odd).get()), odd);
    com_ptr<IPixmat2> image;
    expect_fails(E_INVALIDARG, L"", [&] {
        return CreateImageFromLayout(packed_layout(-1, 1, 8, PixmatEncoding_Unsigned), image.put());
    });
    EXPECT_EQ(CreateImageFromLayout(odd, nullptr), E_POINTER);
}

TEST(ImageAccess, DescriptorOfAnotherSizeHasItsOwnCode)
{
    const com_ptr<IPixmat2> input = new_image(packed_layout(4, 3, 8, PixmatEncoding_Unsigned));
    const com_ptr<IPixmat2> wide = new_image(packed_layout(5, 3, 8, PixmatEncoding_Unsigned));
    const com_ptr<IPixmat2> floats = new_image(packed_layout(4, 3, 32, PixmatEncoding_Float));
    com_ptr<IPixmatDescriptor> descriptor;
    com_ptr<IPixmat2> out;
    ASSERT_EQ(wide->GetDescriptor(descriptor.put()), S_OK);
    EXPECT_EQ(CreateFromDescriptor(input.get(), descriptor.get(), out.put()), make_hresult(0x8004000D));
    ASSERT_EQ(floats->GetDescriptor(descriptor.put()), S_OK);
    EXPECT_EQ(CreateFromDescriptor(input.get(), descriptor.get(), out.put()), S_OK);
    EXPECT_EQ(layout_of(out.get()), layout_of(floats.get()));
    EXPECT_EQ(CreateFromDescriptor(input.get(), nullptr, out.put()), S_OK);
    EXPECT_EQ(layout_of(out.get()), layout_of(input.get()));
    EXPECT_EQ(CreateFromDescriptor(nullptr, nullptr, out.put()), E_INVALIDARG);
}

TEST(EventSink, ForwardsToItsObserver)
{
    struct recorder final : CPixmatEventSink::Observer {
        IPixmat2* image = nullptr;
        const rectangle* changed = nullptr;
        HRESULT OnPixmatChanged(IPixmat2* i, const rectangle* r) noexcept override
        {
            image = i;
            changed = r;
            return E_ACCESSDENIED;
        }
    } observer;
    const auto sink = make<CPixmatEventSink>();
    const com_ptr<IPixmat2> image = new_image(packed_layout(4, 3, 8, PixmatEncoding_Unsigned));
    const rectangle part{1, 1, 2, 2};
    EXPECT_EQ(sink->OnPixmatChanged(image.get(), &part), S_OK) << "to nobody";
    sink->SetObserver(&observer);
    EXPECT_EQ(sink->OnPixmatChanged(nullptr, &part), E_ACCESSDENIED);
    EXPECT_EQ(observer.changed, &part);
    ASSERT_EQ(image->StartNotifications(sink.get(), PixmatEventMode_AfterCommit), S_OK);
    EXPECT_EQ(ImageWriteAccess(image.get()).Commit(), S_OK);
    EXPECT_EQ(observer.image, image.get());
    EXPECT_EQ(observer.changed, nullptr);
    sink->SetObserver(nullptr);
    EXPECT_EQ(sink->OnPixmatChanged(image.get(), &part), S_OK) << "to nobody again";
}

TEST(ImageAccess, UnknownClassNamesItself)
{
    const HRESULT hr = run_frame(IPixmat2::iid, [] {
        create_instance<IPixmat2>(guid("01234567-89ab-cdef-0123-456789abcdef"));
        return S_OK;
    });
    EXPECT_EQ(hr, REGDB_E_CLASSNOTREG);
    EXPECT_EQ(take_error().description, L"CoCreateInstance({01234567-89AB-CDEF-0123-456789ABCDEF})");
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
