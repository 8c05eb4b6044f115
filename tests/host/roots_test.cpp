#include "host/roots.h"

#include "support/failing_new.h"
#include "support/failures.h"
#include "zelt/com/class_registry.h"

namespace Qor::Luxar::ZELT::Test {
namespace {

template <class Interface>
com_ptr<Interface> create(const GUID& class_id)
{
    com_ptr<Interface> object;
    EXPECT_EQ(CoCreateInstance(class_id, nullptr, CLSCTX_ALL, Interface::iid, object.put_void()), S_OK);
    return object;
}

/// Reads a property twice and with a null pointer: one object, made once.
template <class Root, class Facet>
void expect_one_facet(Root* root, HRESULT (Root::*get)(Facet**) noexcept)
{
    com_ptr<Facet> first;
    com_ptr<Facet> second;
    EXPECT_EQ((root->*get)(nullptr), E_POINTER) << Facet::interface_name;
    EXPECT_EQ((root->*get)(first.put()), S_OK) << Facet::interface_name;
    EXPECT_EQ((root->*get)(second.put()), S_OK) << Facet::interface_name;
    EXPECT_TRUE(first) << Facet::interface_name;
    EXPECT_TRUE(first == second) << Facet::interface_name;
}

void expect_facets(IZELT2* root)
{
    expect_one_facet(root, &IZELT2::get_Basic);
    expect_one_facet(root, &IZELT2::get_Conversions);
    expect_one_facet(root, &IZELT2::get_Transforms);
    expect_one_facet(root, &IZELT2::get_Statistics);
    expect_one_facet(root, &IZELT2::get_Math);
    expect_one_facet(root, &IZELT2::get_Complex);
    expect_one_facet(root, &IZELT2::get_Filters);
    expect_one_facet(root, &IZELT2::get_Geometric);
    expect_one_facet(root, &IZELT2::get_Noise);
    expect_one_facet(root, &IZELT2::get_Miscellaneous);
    expect_one_facet(root, &IZELT2::get_Morphology);
    expect_one_facet(root, &IZELT2::get_FlatFielding);
    expect_one_facet(root, &IZELT2::get_Fourier);
}

TEST(Roots, MakeEachFacetOnceAndKeepIt)
{
    const auto first = create<IZELT>(CLSID_ZELT);
    expect_one_facet(first.get(), &IZELT::get_Basic);
    expect_one_facet(first.get(), &IZELT::get_Conversions);
    expect_one_facet(first.get(), &IZELT::get_Transforms);
    expect_one_facet(first.get(), &IZELT::get_Statistics);
    expect_one_facet(first.get(), &IZELT::get_Math);
    expect_one_facet(first.get(), &IZELT::get_Complex);
    expect_one_facet(first.get(), &IZELT::get_Filters);
    expect_one_facet(first.get(), &IZELT::get_Geometric);
    expect_one_facet(first.get(), &IZELT::get_Noise);
    expect_one_facet(first.get(), &IZELT::get_Miscellaneous);
    expect_one_facet(first.get(), &IZELT::get_Morphology);
    expect_one_facet(first.get(), &IZELT::get_FlatFielding);
    expect_facets(create<IZELT2>(CLSID_ZELT2).get());
    expect_facets(create<IZELT2>(CLSID_ZELT2NoDispatch).get());
}

TEST(Roots, FacetOutlivesItsRoot)
{
    com_ptr<IStatistics> statistics;
    ASSERT_EQ(create<IZELT2>(CLSID_ZELT2)->get_Statistics(statistics.put()), S_OK);
    LONG factor = 0;
    EXPECT_EQ(statistics->get_SubsampleFactor(&factor), S_OK);
    EXPECT_EQ(factor, 1);
}

TEST(Roots, RoundingReachesFacetsMadeBeforeAndAfter)
{
    const auto root = create<IZELT2>(CLSID_ZELT2);
    ZELT_Rounding mode = ZELT_Rounding_Default;
    EXPECT_EQ(root->get_Rounding(nullptr), E_POINTER);
    EXPECT_EQ(root->get_Rounding(&mode), S_OK);
    EXPECT_EQ(mode, ZELT_Rounding_Wrap);

    const auto rounding_of_basic = [&] {
        com_ptr<IBasicOps2> facet;
        EXPECT_EQ(root->get_Basic(facet.put()), S_OK);
        return static_cast<CBasic2*>(facet.get())->roundable().get();
    };
    EXPECT_EQ(root->put_Rounding(ZELT_Rounding_Saturate), S_OK);
    EXPECT_EQ(rounding_of_basic(), ZELT_Rounding_Saturate);
    EXPECT_EQ(root->put_Rounding(static_cast<ZELT_Rounding>(7)), S_OK); // arithmetic refuses it, not the root
    EXPECT_EQ(rounding_of_basic(), static_cast<ZELT_Rounding>(7));
    com_ptr<IMath> math;
    ASSERT_EQ(root->get_Math(math.put()), S_OK);
    EXPECT_EQ(static_cast<CMath*>(math.get())->roundable().get(), static_cast<ZELT_Rounding>(7));
}

template <class Root>
void expect_default_refused(const GUID& class_id, const wchar_t* source)
{
    const auto root = create<Root>(class_id);
    EXPECT_EQ(root->put_Rounding(ZELT_Rounding_Fastest), S_OK);
    EXPECT_EQ(root->put_Rounding(ZELT_Rounding_Default), E_INVALIDARG);
    const left_behind left = take_error();
    EXPECT_EQ(left.description,
              L"ZELT_Rounding_Default specified for entire library - should be specific rounding mode");
    EXPECT_EQ(left.source, source);
    EXPECT_EQ(left.interface_id, Root::iid);
    ZELT_Rounding mode = ZELT_Rounding_Default;
    EXPECT_EQ(root->get_Rounding(&mode), S_OK);
    EXPECT_EQ(mode, ZELT_Rounding_Fastest);
}

TEST(Roots, RefuseTheDefaultRounding)
{
    expect_default_refused<IZELT>(CLSID_ZELT, L"ZELT.Main2");
    expect_default_refused<IZELT2>(CLSID_ZELT2, L"ZELT.Main2");
    expect_default_refused<IZELT2>(CLSID_ZELT2NoDispatch, L"ZELT.Main2");
}

TEST(Roots, NamesLeadToTheirClasses)
{
    const struct {
        const wchar_t* name;
        GUID id;
    } names[] = {{L"ZELT.Main", CLSID_ZELT},       {L"ZELT.Main.1", CLSID_ZELT},
                 {L"ZELT.Main2", CLSID_ZELT2},     {L"zelt.main2.1", CLSID_ZELT2},
                 {L"ZELT.Complex", CLSID_Complex}, {L"ZELT.Complex.1", CLSID_Complex}};
    for (const auto& n : names) {
        GUID id = GUID_NULL;
        EXPECT_EQ(CLSIDFromProgID(n.name, &id), S_OK) << narrow(n.name);
        EXPECT_EQ(id, n.id) << narrow(n.name);
    }
    GUID id;
    EXPECT_EQ(CLSIDFromProgID(L"ZELT.Main3", &id), CO_E_CLASSSTRING);
}

TEST(Roots, SaySafeAndSupportErrorsOnlyWhereTheyShould)
{
    const auto expect = [](IUnknown* object, const GUID& own, bool scripted) {
        const auto errors = query<ISupportErrorInfo>(object);
        const auto safety = query<IObjectSafety>(object);
        EXPECT_EQ(static_cast<bool>(errors), scripted);
        EXPECT_EQ(static_cast<bool>(safety), scripted);
        if (!scripted) return;
        EXPECT_EQ(errors->InterfaceSupportsErrorInfo(own), S_OK);
        EXPECT_EQ(errors->InterfaceSupportsErrorInfo(IDispatch::iid), S_FALSE);
        uint32_t supported = 0;
        uint32_t enabled = 0;
        EXPECT_EQ(safety->GetInterfaceSafetyOptions(own, &supported, &enabled), S_OK);
        EXPECT_EQ(supported, 3u);
        EXPECT_EQ(enabled, 3u);
    };
    expect(create<IZELT>(CLSID_ZELT).get(), IZELT::iid, true);
    expect(create<IZELT2>(CLSID_ZELT2).get(), IZELT2::iid, true);
    expect(create<IZELT2>(CLSID_ZELT2NoDispatch).get(), IZELT2::iid, false);
    expect(create<IComplex>(CLSID_Complex).get(), IComplex::iid, true);
}

TEST(Roots, BecomePartOfAnOuterObject)
{
    struct outer final : implements<IUnknown> {
        com_ptr<IUnknown> part;
        HRESULT QueryInterface(const GUID& id, void** out) noexcept override
        {
            if (id == IZELT2::iid) return part->QueryInterface(id, out);
            return implements::QueryInterface(id, out);
        }
    };
    for (const GUID& class_id : {CLSID_ZELT2, CLSID_ZELT2NoDispatch}) {
        const com_ptr<outer> whole = make<outer>();
        void* wrong = nullptr;
        EXPECT_EQ(CoCreateInstance(class_id, whole.get(), CLSCTX_ALL, IZELT2::iid, &wrong),
                  CLASS_E_NOAGGREGATION);
        ASSERT_EQ(CoCreateInstance(class_id, whole.get(), CLSCTX_ALL, IUnknown::iid, whole->part.put_void()),
                  S_OK);
        const auto root = query<IZELT2>(static_cast<IUnknown*>(whole.get()));
        ASSERT_TRUE(root);
        EXPECT_TRUE(query<IUnknown>(root.get()) == query<IUnknown>(static_cast<IUnknown*>(whole.get())));
    }
    void* object = nullptr;
    EXPECT_EQ(CoCreateInstance(CLSID_Complex, make<outer>().get(), CLSCTX_ALL, IUnknown::iid, &object),
              CLASS_E_NOAGGREGATION);
}

TEST(Roots, CancelLeavesItsRequest)
{
    const auto root = create<IZELT2>(CLSID_ZELT2);
    EXPECT_EQ(root->Cancel(), S_OK);
    EXPECT_TRUE(IsCancelled());
    EXPECT_THROW(ThrowIfCancelled(), Cancelled);
}

TEST(Roots, FailedFacetCreationLeavesTheRootUsable)
{
    for (int n = 1;; ++n) {
        const auto root = create<IZELT2>(CLSID_ZELT2);
        com_ptr<IBasicOps2> facet;
        const HRESULT hr = with_failing_allocation(n, [&] { return root->get_Basic(facet.put()); });
        if (hr == S_OK) {
            EXPECT_GT(n, 1);
            break;
        }
        EXPECT_EQ(hr, E_OUTOFMEMORY) << "allocation " << n;
        EXPECT_EQ(root->put_Rounding(ZELT_Rounding_Saturate), S_OK);
        ASSERT_EQ(root->get_Basic(facet.put()), S_OK);
        EXPECT_EQ(static_cast<CBasic2*>(facet.get())->roundable().get(), ZELT_Rounding_Saturate);
    }
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
