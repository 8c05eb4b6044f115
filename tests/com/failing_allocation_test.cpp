// What memory that runs out leaves behind: E_OUTOFMEMORY, arguments as documented, and no leak.
#include "support/failing_new.h"

#include "com/probe.h"
#include "zelt/com/class_registry.h"
#include "zelt/com/error_info.h"

#include <gtest/gtest.h>

#include <new>

using namespace Qor;
using namespace Qor::Luxar::ZELT::Test;

namespace {

// The operation answers its code, or E_UNEXPECTED when a failure left something else than documented.
template <class Operation>
void expect_survives(const char* name, int failures, Operation operation)
{
    for (int n = 1; n <= failures + 1; ++n) {
        const int64_t before = live_allocations();
        const HRESULT hr = with_failing_allocation(n, operation);
        EXPECT_EQ(hr, n <= failures ? E_OUTOFMEMORY : S_OK) << name << ", allocation " << n;
        EXPECT_EQ(live_allocations(), before) << name << ", allocation " << n;
    }
}

template <class Action>
HRESULT caught(Action action)
{
    try {
        action();
        return S_OK;
    } catch (const std::bad_alloc&) {
        return E_OUTOFMEMORY;
    }
}

HRESULT if_so(bool as_documented, HRESULT hr) { return as_documented ? hr : E_UNEXPECTED; }

// A string, and an array of a string and a variant array of a string: six blocks.
variant mixed_array()
{
    const int32_t first = 0, second = 1;
    const auto wrap = [](safe_array array) {
        VARIANT v = empty_variant();
        v.vt = VT_ARRAY | VT_VARIANT;
        v.parray = array.detach();
        return variant::attach(v);
    };
    const variant text(L"text");
    auto inner = safe_array::vector(VT_VARIANT, 2);
    EXPECT_EQ(SafeArrayPutElement(inner.get(), &second, text.get()), S_OK);
    auto outer = safe_array::vector(VT_VARIANT, 2);
    const variant wrapped = wrap(std::move(inner));
    EXPECT_EQ(SafeArrayPutElement(outer.get(), &first, wrapped.get()), S_OK);
    EXPECT_EQ(SafeArrayPutElement(outer.get(), &second, text.get()), S_OK);
    return wrap(std::move(outer));
}

TEST(FailingAllocation, LeavesVariantsAsDocumented)
{
    const variant array = mixed_array(), text(L"text"), number(1.5);
    expect_survives("VariantCopy", 4, [&] {
        variant target(7);
        const HRESULT hr = VariantCopy(target.get(), array.get());
        return if_so(target.type() == (succeeded(hr) ? array.type() : VARTYPE{VT_EMPTY}), hr);
    });
    expect_survives("VariantCopyInd", 1, [&] {
        VARIANT reference = empty_variant();
        reference.vt = VT_BYREF | VT_VARIANT;
        reference.byref = const_cast<VARIANT*>(text.get());
        const HRESULT hr = VariantCopyInd(&reference, &reference);
        return if_so(VariantClear(&reference) == S_OK, hr);
    });
    expect_survives("number to string", 1, [&] {
        variant target(7);
        const HRESULT hr = VariantChangeType(target.get(), number.get(), 0, VT_BSTR);
        return if_so(succeeded(hr) || (target.type() == VT_I4 && target->lVal == 7), hr);
    });
    const variant digits(std::wstring(1000, L'0').c_str());
    expect_survives("long string to number", 1, [&] {
        variant target(7);
        const HRESULT hr = VariantChangeType(target.get(), digits.get(), 0, VT_I4);
        return if_so(target->lVal == (succeeded(hr) ? 0 : 7), hr);
    });
    expect_survives("variant(variant)", 4, [&] { return caught([&] { variant copy(array); }); });
    expect_survives("variant(text)", 1, [&] { return caught([&] { variant copy(L"text"); }); });
    expect_survives("bstr", 1, [&] { return caught([&] { bstr copy(L"text"); }); });
    expect_survives("vector", 1, [&] { return caught([&] { safe_array::vector(VT_R8, 3); }); });
}

TEST(FailingAllocation, LeavesArraysAsDocumented)
{
    const variant array = mixed_array();
    const int32_t first = 0, second = 1;
    expect_survives("SafeArrayCopy", 4, [&] {
        safe_array copy;
        const HRESULT hr = SafeArrayCopy(array->parray, copy.put());
        return if_so(bool(copy) == succeeded(hr), hr);
    });
    expect_survives("SafeArrayGetElement", 2, [&] {
        variant element;
        const HRESULT hr = SafeArrayGetElement(array->parray, &first, element.get());
        return if_so(element.type() == (succeeded(hr) ? array.type() : VARTYPE{VT_EMPTY}), hr);
    });
    const variant text(L"text"), number(7);
    SafeArrayPutElement(array->parray, &second, number.get());
    expect_survives("SafeArrayPutElement", 1, [&] {
        const HRESULT hr = SafeArrayPutElement(array->parray, &second, text.get());
        const VARTYPE left = safe_array_access<VARIANT>(array->parray).data()[1].vt;
        SafeArrayPutElement(array->parray, &second, number.get());
        return if_so(left == (succeeded(hr) ? VT_BSTR : VT_I4), hr);
    });
}

TEST(FailingAllocation, LeavesErrorInformationAndClassesAsDocumented)
{
    com_ptr<ICreateErrorInfo> info;
    ASSERT_EQ(CreateErrorInfo(info.put()), S_OK);
    ASSERT_EQ(info->SetSource(L"first"), S_OK);
    const auto read = info.as<IErrorInfo>();
    expect_survives("CreateErrorInfo", 1, [] {
        com_ptr<ICreateErrorInfo> other;
        const HRESULT hr = CreateErrorInfo(other.put());
        return if_so(bool(other) == succeeded(hr), hr);
    });
    expect_survives("SetSource and GetSource", 2, [&] {
        HRESULT hr = info->SetSource(L"first");
        bstr text;
        if (succeeded(hr)) hr = read->GetSource(text.put());
        return if_so(succeeded(hr) == (text.view() == L"first"), hr);
    });
    bstr text;
    EXPECT_EQ(read->GetSource(text.put()), S_OK);
    EXPECT_EQ(text.view(), L"first");

    const class_entry entry{guid("00000003-0000-0000-0000-0000000000ff"), nullptr, nullptr, "", nullptr};
    const class_registration known(entry);
    expect_survives("CoGetClassObject", 1, [&] {
        com_ptr<IClassFactory> factory;
        return CoGetClassObject(entry.class_id, CLSCTX_ALL, IClassFactory::iid, factory.put_void());
    });
}

TEST(FailingAllocation, FailsTheNthOnlyAndAllFormsOfNew)
{
    // Plain calls: the compiler may leave out a new expression whose object nobody uses.
    const auto attempts = [](int n) {
        std::string failed;
        const failing_allocation armed(n);
        const auto note = [&](char form, void* block, auto... alignment) {
            if (!block) failed += form;
            ::operator delete(block, alignment...);
        };
        constexpr std::align_val_t wide{64};
        note('1', ::operator new(8, std::nothrow));
        note('2', ::operator new(8, wide, std::nothrow), wide);
        void* block = nullptr;
        caught([&] { block = ::operator new(8); });
        note('3', block);
        return std::pair(failed, armed.happened());
    };
    EXPECT_EQ(attempts(1), std::pair(std::string("1"), true));
    EXPECT_EQ(attempts(2), std::pair(std::string("2"), true));
    EXPECT_EQ(attempts(3), std::pair(std::string("3"), true));
    EXPECT_EQ(attempts(4), std::pair(std::string(""), false));
}

} // namespace
