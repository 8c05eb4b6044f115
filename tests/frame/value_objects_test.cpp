#include "frame/value_objects.h"

#include "support/failures.h"

namespace Qor::Luxar::Common {
namespace {

using ZELT::IComplex;

template <class Object, class T>
struct property {
    HRESULT (Object::*get)(T*) noexcept;
    HRESULT (Object::*put)(T) noexcept;
};

/// Every property holds its own value and answers E_POINTER for null.
template <class Interface, class T, size_t N>
void expect_properties(Interface* object, const property<Interface, T> (&properties)[N])
{
    for (size_t i = 0; i < N; ++i) {
        EXPECT_EQ((object->*properties[i].get)(nullptr), E_POINTER);
        EXPECT_EQ((object->*properties[i].put)(static_cast<T>(i) - 7), S_OK);
    }
    for (size_t i = 0; i < N; ++i) {
        T value{};
        EXPECT_EQ((object->*properties[i].get)(&value), S_OK);
        EXPECT_EQ(value, static_cast<T>(i) - 7);
    }
}

TEST(ValueObjects, KeepWhatIsPut)
{
    com_ptr<ICoordinateInt> point;
    ASSERT_EQ(MakeCoordinateInt(3, -4, point.put()), S_OK);
    coordinate<int32_t> p;
    EXPECT_EQ(ReadValue(point.get(), &p), S_OK);
    EXPECT_EQ(p, (coordinate<int32_t>{3, -4}));
    expect_properties<ICoordinateInt, LONG>(point.get(), {{&ICoordinateInt::get_X, &ICoordinateInt::put_X},
                                                          {&ICoordinateInt::get_Y, &ICoordinateInt::put_Y}});

    com_ptr<ICoordinateFloat> real;
    ASSERT_EQ(MakeCoordinateFloat(0.5, -1.5, real.put()), S_OK);
    coordinate<double> r;
    EXPECT_EQ(ReadValue(real.get(), &r), S_OK);
    EXPECT_EQ(r, (coordinate<double>{0.5, -1.5}));
    expect_properties<ICoordinateFloat, double>(real.get(),
                                                {{&ICoordinateFloat::get_X, &ICoordinateFloat::put_X},
                                                 {&ICoordinateFloat::get_Y, &ICoordinateFloat::put_Y}});

    com_ptr<IRectangle> box;
    ASSERT_EQ(MakeRectangle(9, 8, 1, 2, box.put()), S_OK); // unchecked: the operation tests it
    rectangle b;
    EXPECT_EQ(ReadValue(box.get(), &b), S_OK);
    EXPECT_EQ(b, (rectangle{9, 8, 1, 2}));
    expect_properties<IRectangle, LONG>(box.get(), {{&IRectangle::get_Left, &IRectangle::put_Left},
                                                    {&IRectangle::get_Top, &IRectangle::put_Top},
                                                    {&IRectangle::get_Right, &IRectangle::put_Right},
                                                    {&IRectangle::get_Bottom, &IRectangle::put_Bottom}});

    const auto vector = make<CFloatVector2D>();
    expect_properties<IFloatVector2D, double>(
        vector.get(),
        {{&IFloatVector2D::get_X, &IFloatVector2D::put_X}, {&IFloatVector2D::get_Y, &IFloatVector2D::put_Y}});
    const auto number = make<CoComplex>();
    EXPECT_EQ(number->real, 0);
    EXPECT_EQ(number->imaginary, 0);
    expect_properties<IComplex, double>(number.get(), {{&IComplex::get_Real, &IComplex::put_Real},
                                                       {&IComplex::get_Imaginary, &IComplex::put_Imaginary}});
}

TEST(ValueObjects, RefuseNullBothWays)
{
    rectangle r;
    EXPECT_EQ(ReadValue(static_cast<IRectangle*>(nullptr), &r), E_INVALIDARG);
    EXPECT_EQ(MakeRectangle(0, 0, 1, 1, nullptr), E_POINTER);
    EXPECT_EQ(MakeCoordinateInt(0, 0, nullptr), E_POINTER);
    EXPECT_EQ(MakeCoordinateFloat(0, 0, nullptr), E_POINTER);
    EXPECT_EQ(optional_rectangle(static_cast<IRectangle*>(nullptr)).get(), nullptr);
    com_ptr<IRectangle> box;
    ASSERT_EQ(MakeRectangle(1, 2, 3, 4, box.put()), S_OK);
    EXPECT_EQ(*optional_rectangle(box.get()).get(), (rectangle{1, 2, 3, 4}));
}

} // namespace
} // namespace Qor::Luxar::Common
