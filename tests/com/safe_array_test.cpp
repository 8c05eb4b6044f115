// Arrays and the variants that hold them: shapes, places of elements, locks, ownership.
#include "com/probe.h"

#include <gtest/gtest.h>

#include <climits>
#include <vector>

using namespace Qor;

namespace {

variant holding(SAFEARRAY* array, VARTYPE type)
{
    VARIANT v = empty_variant();
    v.vt = static_cast<VARTYPE>(VT_ARRAY | type);
    v.parray = array;
    return variant::attach(v);
}

// An array of one variant that holds an array of one variant, and so on; the innermost holds the object.
variant nested(int depth, IDispatch* object)
{
    variant inner(object);
    for (int i = 0; i < depth; ++i) {
        SAFEARRAY* const array = SafeArrayCreateVector(VT_VARIANT, 0, 1);
        *safe_array_access<VARIANT>(array).data() = inner.detach();
        inner = holding(array, VT_VARIANT);
    }
    return inner;
}

TEST(SafeArray, RefusesShapesThatCannotBeIndexed)
{
    using bounds = std::vector<SAFEARRAYBOUND>;
    const struct {
        bounds shape;
        bool accepted;
    } cases[] = {
        {{}, false},
        {{{0, 0}}, true},
        {{{3, -5}, {0, 7}}, true},
        {{{1, INT_MAX}}, true},
        {{{2, INT_MAX}}, false},
        {{{0, INT_MIN}}, false},
        {{{UINT_MAX, INT_MIN}}, false},
        {{{65536, 0}, {32768, 0}}, false},
        {{{65536, 0}, {65536, 0}, {65536, 0}, {65536, 0}}, false}, // 2^64 is 0 in 64 bits
        {{{UINT_MAX, INT_MIN}, {UINT_MAX, INT_MIN}, {0, 0}}, true},
        {bounds(64, {1, 0}), true},
        {bounds(65, {1, 0}), false},
    };
    for (const auto& c : cases) {
        const auto array = safe_array::attach(
            SafeArrayCreate(VT_UI1, static_cast<uint32_t>(c.shape.size()), c.shape.data()));
        EXPECT_EQ(bool(array), c.accepted) << &c - cases;
        EXPECT_EQ(SafeArrayGetDim(array.get()), c.accepted ? c.shape.size() : 0);
    }
    const SAFEARRAYBOUND one{1, 0};
    for (const int type : {0, 1, 6, 7, 14, 24, VT_ARRAY | VT_I4, VT_BYREF | VT_I4})
        EXPECT_FALSE(SafeArrayCreate(static_cast<VARTYPE>(type), 1, &one)) << type;
    EXPECT_FALSE(SafeArrayCreate(VT_I4, 1, nullptr));
}

TEST(SafeArray, PutsTheLeftmostDimensionFastest)
{
    const SAFEARRAYBOUND bounds[] = {{3, -1}, {2, 10}, {2, 0}};
    const auto array = safe_array::attach(SafeArrayCreate(VT_I2, 3, bounds));
    int16_t next = 0;
    for (int32_t z = 0; z < 2; ++z)
        for (int32_t y = 10; y < 12; ++y)
            for (int32_t x = -1; x < 2; ++x) {
                const int32_t at[] = {x, y, z};
                EXPECT_EQ(SafeArrayPutElement(array.get(), at, &next), S_OK);
                int16_t read = -1;
                EXPECT_EQ(SafeArrayGetElement(array.get(), at, &read), S_OK);
                EXPECT_EQ(read, next++);
            }
    const safe_array_access<int16_t> access(array.get());
    EXPECT_EQ(reinterpret_cast<uintptr_t>(access.data()) % 16, 0u);
    for (int16_t i = 0; i < 12; ++i) EXPECT_EQ(access.data()[i], i);
    int32_t low = 0, high = 0;
    EXPECT_EQ(SafeArrayGetLBound(array.get(), 2, &low), S_OK);
    EXPECT_EQ(SafeArrayGetUBound(array.get(), 2, &high), S_OK);
    EXPECT_EQ(std::pair(low, high), std::pair(10, 11));
    for (const uint32_t dimension : {0u, 4u})
        EXPECT_EQ(SafeArrayGetUBound(array.get(), dimension, &high), DISP_E_BADINDEX);
    for (const auto& at :
         std::vector<std::vector<int32_t>>{{-2, 10, 0}, {2, 10, 0}, {0, 9, 0}, {0, 10, INT_MIN}}) {
        EXPECT_EQ(SafeArrayGetElement(array.get(), at.data(), &next), DISP_E_BADINDEX);
        EXPECT_EQ(SafeArrayPutElement(array.get(), at.data(), &next), DISP_E_BADINDEX);
    }
}

TEST(SafeArray, CountsLocksAndKeepsAnArrayInUse)
{
    const auto object = make_probe();
    variant outer = nested(3, object.get());
    SAFEARRAY* const inside = static_cast<VARIANT*>(safe_array_access<void>(outer->parray).data())->parray;
    void* data = nullptr;
    EXPECT_EQ(SafeArrayUnaccessData(inside), E_UNEXPECTED);
    EXPECT_EQ(SafeArrayAccessData(inside, &data), S_OK);
    EXPECT_EQ(SafeArrayAccessData(inside, &data), S_OK);
    for (int locks = 2; locks > 0; --locks) {
        EXPECT_EQ(SafeArrayDestroy(outer->parray), DISP_E_ARRAYISLOCKED);
        EXPECT_EQ(VariantClear(outer.get()), DISP_E_ARRAYISLOCKED);
        const variant number(1);
        EXPECT_EQ(VariantCopy(outer.get(), number.get()), DISP_E_ARRAYISLOCKED);
        EXPECT_EQ(VariantChangeType(outer.get(), number.get(), 0, VT_R8), DISP_E_ARRAYISLOCKED);
        EXPECT_EQ(outer.type(), VT_ARRAY | VT_VARIANT);
        EXPECT_EQ(references(object.get()), 2u);
        EXPECT_EQ(SafeArrayUnaccessData(inside), S_OK);
    }
    EXPECT_EQ(VariantClear(outer.get()), S_OK);
    EXPECT_EQ(references(object.get()), 1u);
}

TEST(SafeArray, CopiesAndFreesAnyDepth)
{
    const auto object = make_probe();
    {
        const variant deep = nested(200'000, object.get());
        const variant copy = deep;
        EXPECT_EQ(references(object.get()), 3u);
        EXPECT_NE(copy->parray, deep->parray);
    }
    EXPECT_EQ(references(object.get()), 1u);
}

TEST(SafeArray, OwnsItsStringsObjectsAndVariants)
{
    const auto object = make_probe();
    const int32_t at = 1;
    const auto strings = safe_array::vector(VT_BSTR, 3);
    const bstr text(std::wstring_view(L"a\0b", 3));
    EXPECT_EQ(SafeArrayPutElement(strings.get(), &at, text.get()), S_OK);
    EXPECT_EQ(SafeArrayPutElement(strings.get(), &at, text.get()), S_OK);
    safe_array copy;
    EXPECT_EQ(SafeArrayCopy(strings.get(), copy.put()), S_OK);
    bstr read;
    EXPECT_EQ(SafeArrayGetElement(copy.get(), &at, read.put()), S_OK);
    EXPECT_EQ(read.view(), text.view());
    EXPECT_EQ(safe_array_access<BSTR>(copy.get()).data()[0], nullptr);

    auto objects = safe_array::vector(VT_UNKNOWN, 2);
    EXPECT_EQ(SafeArrayPutElement(objects.get(), &at, object.get()), S_OK);
    EXPECT_EQ(SafeArrayPutElement(objects.get(), &at, object.get()), S_OK);
    com_ptr<IUnknown> shared;
    EXPECT_EQ(SafeArrayGetElement(objects.get(), &at, shared.put()), S_OK);
    EXPECT_EQ(references(object.get()), 3u);
    EXPECT_EQ(SafeArrayCopy(objects.get(), copy.put()), S_OK);
    EXPECT_EQ(references(object.get()), 4u);
    EXPECT_EQ(SafeArrayPutElement(objects.get(), &at, nullptr), S_OK);
    objects = safe_array();
    copy = safe_array();
    EXPECT_EQ(references(object.get()), 2u);

    auto variants = safe_array::vector(VT_VARIANT, 2);
    const variant inner(object.get());
    EXPECT_EQ(SafeArrayPutElement(variants.get(), &at, inner.get()), S_OK);
    // Into itself: the element becomes a copy of the whole.
    const variant whole = holding(variants.detach(), VT_VARIANT);
    EXPECT_EQ(SafeArrayPutElement(whole->parray, &at, whole.get()), S_OK);
    EXPECT_EQ(references(object.get()), 4u);
    variant element;
    EXPECT_EQ(SafeArrayGetElement(whole->parray, &at, element.get()), S_OK);
    EXPECT_EQ(element.type(), VT_ARRAY | VT_VARIANT);
    EXPECT_EQ(references(object.get()), 5u);
}

TEST(SafeArray, AnswersNullArguments)
{
    const auto array = safe_array::vector(VT_I4, 1);
    const int32_t at = 0;
    int32_t value = 0;
    EXPECT_EQ(SafeArrayDestroy(nullptr), S_OK);
    SAFEARRAY* copy = array.get();
    EXPECT_EQ(SafeArrayCopy(nullptr, &copy), S_OK);
    EXPECT_EQ(copy, nullptr);
    EXPECT_EQ(SafeArrayCopy(array.get(), nullptr), E_POINTER);
    for (const HRESULT hr : {SafeArrayGetVartype(nullptr, nullptr), SafeArrayGetLBound(nullptr, 1, &value),
                             SafeArrayGetElement(nullptr, &at, &value),
                             SafeArrayPutElement(nullptr, &at, &value), SafeArrayUnaccessData(nullptr)})
        EXPECT_EQ(hr, E_INVALIDARG);
    for (const HRESULT hr :
         {SafeArrayGetVartype(array.get(), nullptr), SafeArrayGetUBound(array.get(), 1, nullptr),
          SafeArrayGetElement(array.get(), nullptr, &value), SafeArrayGetElement(array.get(), &at, nullptr),
          SafeArrayPutElement(array.get(), &at, nullptr), SafeArrayAccessData(array.get(), nullptr)})
        EXPECT_EQ(hr, E_POINTER);
}

TEST(Variant, ClearsWhatItOwnsAndRefusesUnknownTypes)
{
    const auto object = make_probe();
    VARIANT v = variant(object.get()).detach();
    EXPECT_EQ(VariantClear(&v), S_OK);
    EXPECT_EQ(v.vt, VT_EMPTY);
    EXPECT_EQ(references(object.get()), 1u);
    v.vt = VT_BYREF | VT_DISPATCH;
    v.byref = object.get();
    EXPECT_EQ(VariantClear(&v), S_OK);
    EXPECT_EQ(references(object.get()), 1u);
    EXPECT_EQ(VariantClear(nullptr), E_INVALIDARG);
    for (const int type : {6, 7, 12, 14, 24, 0x1003, 0x8003, 0x2000, 0x4001}) {
        v.vt = static_cast<VARTYPE>(type);
        variant target(2);
        EXPECT_EQ(VariantClear(&v), DISP_E_BADVARTYPE) << type;
        EXPECT_EQ(VariantCopy(target.get(), &v), DISP_E_BADVARTYPE) << type;
        EXPECT_EQ(target.type(), VT_EMPTY);
        EXPECT_EQ(VariantChangeType(target.get(), &v, 0, VT_I4), DISP_E_BADVARTYPE) << type;
        EXPECT_EQ(v.vt, type);
    }
}

TEST(Variant, CopiesFromInsideItself)
{
    const auto object = make_probe();
    variant v = nested(2, object.get());
    const VARIANT* element = safe_array_access<VARIANT>(v->parray).data();
    EXPECT_EQ(VariantCopy(v.get(), element), S_OK);
    EXPECT_EQ(VariantCopy(v.get(), v.get()), S_OK);
    element = safe_array_access<VARIANT>(v->parray).data();
    EXPECT_EQ(VariantCopyInd(v.get(), element), S_OK);
    EXPECT_EQ(v->pdispVal, object.get());
    EXPECT_EQ(references(object.get()), 2u);
}

} // namespace
