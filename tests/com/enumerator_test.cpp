#include "com/enumerator.h"

#include "support/failing_new.h"

#include <gtest/gtest.h>

namespace Qor {
namespace {

com_ptr<IEnumVARIANT> numbers_and_a_text()
{
    auto values = std::make_shared<std::vector<variant>>();
    values->emplace_back(1);
    values->emplace_back(L"a text that is long enough to need memory");
    values->emplace_back(3);
    return make<variant_enumerator>(values);
}

TEST(Enumerator, HandsOutInOrderAndSaysWhenItEnds)
{
    const auto e = numbers_and_a_text();
    variant items[4];
    VARIANT raw[4];
    ULONG fetched = 9;
    EXPECT_EQ(e->Next(2, raw, &fetched), S_OK);
    EXPECT_EQ(fetched, 2u);
    for (int i = 0; i < 2; ++i) items[i] = variant::attach(raw[i]);
    EXPECT_EQ(items[0]->lVal, 1);
    EXPECT_EQ(items[1].type(), VT_BSTR);
    com_ptr<IEnumVARIANT> twin;
    ASSERT_EQ(e->Clone(twin.put()), S_OK);
    EXPECT_EQ(e->Next(2, raw, &fetched), S_FALSE);
    EXPECT_EQ(fetched, 1u);
    EXPECT_EQ(raw[0].lVal, 3);
    EXPECT_EQ(twin->Skip(1), S_OK);
    EXPECT_EQ(twin->Skip(1), S_FALSE);
    EXPECT_EQ(twin->Reset(), S_OK);
    EXPECT_EQ(twin->Next(1, raw, nullptr), S_OK);
    EXPECT_EQ(raw[0].lVal, 1);
    EXPECT_EQ(twin->Next(2, raw, nullptr), E_POINTER);
    EXPECT_EQ(twin->Next(1, nullptr, nullptr), E_POINTER);
    EXPECT_EQ(twin->Clone(nullptr), E_POINTER);
}

TEST(Enumerator, KeepsItsPlaceWhenMemoryIsOut)
{
    const auto e = numbers_and_a_text();
    VARIANT raw[3];
    ULONG fetched = 0;
    EXPECT_EQ(Luxar::ZELT::Test::with_failing_allocation(1, [&] { return e->Next(3, raw, &fetched); }),
              E_OUTOFMEMORY);
    EXPECT_EQ(e->Next(1, raw, nullptr), S_OK);
    EXPECT_EQ(raw[0].lVal, 1);
}

} // namespace
} // namespace Qor
