// Calls by name answer like direct calls, from the roots of both generations.
#include "support/facets.h"
#include "zelt/interfaces/conversions.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

com_ptr<IDispatch> conversions_of(const GUID& root_class)
{
    com_ptr<IDispatch> root;
    EXPECT_EQ(CoCreateInstance(root_class, nullptr, CLSCTX_ALL, IDispatch::iid, root.put_void()), S_OK);
    for (const method_info& m : described(root.get()).methods)
        if (std::string_view(m.name) == "Conversions") {
            variant facet;
            EXPECT_EQ(late_call(root.get(), m, {})(&facet), S_OK);
            return com_ptr(facet->pdispVal);
        }
    ADD_FAILURE() << "a root without Conversions";
    return {};
}

const method_info& method_named(IDispatch* facet, std::string_view name)
{
    for (const method_info& m : described(facet).methods)
        if (m.name == name) return m;
    throw std::out_of_range(std::string(name));
}

struct words {
    uint16_t pixel[4];
    com_ptr<IPixmat2> image;
    explicit words(uint16_t first, int bits) : pixel{first, 2, 3, 4}
    {
        EXPECT_EQ(WrapPixmat(packed_layout(4, 1, bits, PixmatEncoding_Unsigned), pixel, false, nullptr,
                             nullptr, image.put()),
                  S_OK);
    }
    bool operator==(const words& other) const { return std::ranges::equal(pixel, other.pixel); }
};

TEST(LateBoundConversions, AnswerLikeTheDirectCall)
{
    com_ptr<IRectangle> area, outside;
    com_ptr<ICoordinateInt> point;
    ASSERT_EQ(Common::MakeRectangle(0, 0, 2, 1, area.put()), S_OK);
    ASSERT_EQ(Common::MakeRectangle(0, 0, 5, 1, outside.put()), S_OK);
    ASSERT_EQ(Common::MakeCoordinateInt(1, 0, point.put()), S_OK);
    const com_ptr<IRectangle> areas[] = {nullptr, area, outside};
    const com_ptr<ICoordinateInt> points[] = {nullptr, point};
    com_ptr<IZELT2> root;
    ASSERT_EQ(CoCreateInstance(CLSID_ZELT2, nullptr, CLSCTX_ALL, IZELT2::iid, root.put_void()), S_OK);
    com_ptr<IConversions2> direct;
    ASSERT_EQ(root->get_Conversions(direct.put()), S_OK);

    for (const GUID& root_class : {CLSID_ZELT, CLSID_ZELT2, CLSID_ZELT2NoDispatch}) {
        const auto facet = conversions_of(root_class);
        for (const char* name : {"Recode", "Cast"}) {
            if (root_class == CLSID_ZELT && std::string_view(name) == "Cast") continue; // E_NOTIMPL there
            const auto member =
                std::string_view(name) == "Recode" ? &IConversions2::Recode : &IConversions2::Cast;
            for (const auto& a : areas)
                for (const auto& p : points) {
                    const words src(60000, 16);
                    words by_name(9, 12), wanted(9, 12);
                    variant result;
                    const HRESULT want =
                        (direct.get()->*member)(wanted.image.get(), src.image.get(), a.get(), p.get());
                    late_call call(facet.get(), method_named(facet.get(), name),
                                   {variant(by_name.image.get()), variant(src.image.get()), variant(a.get()),
                                    variant(p.get())});
                    EXPECT_EQ(call(&result), want) << name;
                    EXPECT_TRUE(by_name == wanted) << name;
                }
        }
    }
}

TEST(LateBoundConversions, ScriptsLeaveAreaAndPointOutWherePlainObjectsCannot)
{
    for (const GUID& root_class : {CLSID_ZELT, CLSID_ZELT2, CLSID_ZELT2NoDispatch}) {
        const auto facet = conversions_of(root_class);
        const words src(60000, 12);
        words dst(9, 12);
        variant result;
        late_call call(facet.get(), method_named(facet.get(), "Recode"),
                       {variant(dst.image.get()), variant(src.image.get())});
        if (root_class == CLSID_ZELT2) {
            EXPECT_EQ(call(&result), S_OK);
            EXPECT_EQ(dst.pixel[0], 60000); // copied: neither area nor point was given
        } else {
            EXPECT_EQ(call(&result), DISP_E_PARAMNOTOPTIONAL);
            EXPECT_EQ(dst.pixel[0], 9);
        }
    }
}

TEST(LateBoundConversions, NewImagesAreTheResult)
{
    com_ptr<IPixmatDescriptor> descriptor;
    const words src(60000, 16);
    const words like(0, 8);
    ASSERT_EQ(like.image->GetDescriptor(descriptor.put()), S_OK);
    const auto facet = conversions_of(CLSID_ZELT2);
    for (const auto& [name, want] : {std::pair{"RecodeEx", 255}, {"CastEx", 60000 & 255}}) {
        variant result;
        late_call call(facet.get(), method_named(facet.get(), name),
                       {variant(src.image.get()), variant(descriptor.get())});
        ASSERT_EQ(call(&result), S_OK) << name;
        ASSERT_EQ(result.type(), VT_DISPATCH) << name;
        const auto image = query<IPixmat2>(result->pdispVal);
        ASSERT_TRUE(image) << name;
        EXPECT_EQ(ImageReadAccess(image.get()).view().data[0], want) << name;
    }
}

TEST(LateBoundConversions, FirstGenerationCastIsNotThere)
{
    const auto facet = conversions_of(CLSID_ZELT);
    variant result;
    const words src(1, 16);
    com_ptr<IPixmatDescriptor> descriptor;
    ASSERT_EQ(src.image->GetDescriptor(descriptor.put()), S_OK);
    EXPECT_EQ(late_call(facet.get(), method_named(facet.get(), "Cast"),
                        {variant(src.image.get()), variant(descriptor.get())})(&result),
              E_NOTIMPL);
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
