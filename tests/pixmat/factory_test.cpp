#include "pixmat_objects.h"
#include "support/failing_new.h"

namespace Qor::Luxar::Test {
namespace {

using ZELT::Test::with_failing_allocation;

TEST(Factory, PacksWhateverTheStridesSayInModeTwo)
{
    const image_layout odd{5, 3, 12, PixmatEncoding_Signed, 99, -7, 0};
    EXPECT_EQ(layout_of(new_image(odd, PixmatCreateMode_Packed).get()),
              packed_layout(5, 3, 12, PixmatEncoding_Signed));
    EXPECT_EQ(layout_of(new_image(odd, PixmatCreateMode_Layout).get()), odd);
}

TEST(Factory, RefusesWhatIsNoImage)
{
    const auto answer = [](image_layout l, int mode = PixmatCreateMode_Layout) {
        com_ptr<IPixmat2> image;
        const HRESULT hr = try_create(l, static_cast<PixmatCreateMode>(mode), image);
        EXPECT_FALSE(image);
        return hr;
    };
    const image_layout good = packed_layout(4, 3, 8, PixmatEncoding_Unsigned);
    for (const int mode : {0, 3, -1}) EXPECT_EQ(answer(good, mode), E_INVALIDARG);
    for (const int mode : {1, 2}) {
        EXPECT_EQ(answer({-1, 3, 8, PixmatEncoding_Unsigned, 0, 1, 4}, mode), E_INVALIDARG);
        EXPECT_EQ(answer({4, INT32_MIN, 8, PixmatEncoding_Unsigned, 0, 1, 4}, mode), E_INVALIDARG);
        EXPECT_EQ(answer({4, 3, 0, PixmatEncoding_Unsigned, 0, 1, 4}, mode), E_INVALIDARG);
        EXPECT_EQ(answer({4, 3, -8, PixmatEncoding_Unsigned, 0, 1, 4}, mode), E_INVALIDARG);
    }
    const auto factory = create<IPixmatFactory>(CLSID_PixmatFactory);
    com_ptr<IPixmat2> image;
    EXPECT_EQ(factory->Create(nullptr, PixmatCreateMode_Layout, image.put()), E_INVALIDARG);
    EXPECT_EQ(factory->Create(descriptor_of(good).get(), PixmatCreateMode_Layout, nullptr), E_POINTER);
}

TEST(Factory, AnswersSizesBeyondMemoryAtOnce)
{
    constexpr int32_t high = INT32_MAX;
    com_ptr<IPixmat2> image;
    for (const image_layout& l : {image_layout{high, high, 8, PixmatEncoding_Unsigned, 0, 1, high},
                                  {high, high, 64, PixmatEncoding_Float, high, high, INT32_MIN},
                                  {high, high, high, PixmatEncoding_Data, INT32_MIN, INT32_MIN, INT32_MIN}})
        for (const auto mode : {PixmatCreateMode_Layout, PixmatCreateMode_Packed})
            EXPECT_EQ(try_create(l, mode, image), E_OUTOFMEMORY);
    EXPECT_EQ(try_create(packed_layout(1 << 29, 1, 64, PixmatEncoding_Float), PixmatCreateMode_Packed, image),
              E_OUTOFMEMORY)
        << "its row does not fit a stride";
}

TEST(Factory, RefusesPackedRowsWhoseStrideHasWrapped)
{
    com_ptr<IPixmat2> image;
    for (const image_layout& l : {packed_layout(1 << 29, 1, 64, PixmatEncoding_Float),
                                  packed_layout((1 << 30) + 1, 2, 32, PixmatEncoding_Unsigned),
                                  packed_layout(1 << 30, 3, 16, PixmatEncoding_Signed)})
        EXPECT_EQ(try_create(l, PixmatCreateMode_Layout, image), E_INVALIDARG) << l.width;
}

/// A descriptor of somebody else; the n-th property fails.
class failing_descriptor final : public foreign_object<IPixmatDescriptor> {
public:
    explicit failing_descriptor(int n) : left_(n) {}
    HRESULT get_Width(LONG* v) noexcept override { return give(4, v); }
    HRESULT get_Height(LONG* v) noexcept override { return give(3, v); }
    HRESULT get_Bits(LONG* v) noexcept override { return give(8, v); }
    HRESULT get_Encoding(PixmatEncoding* v) noexcept override { return give(PixmatEncoding_Unsigned, v); }
    HRESULT get_Offset(LONG* v) noexcept override { return give(0, v); }
    HRESULT get_XStride(LONG* v) noexcept override { return give(1, v); }
    HRESULT get_YStride(LONG* v) noexcept override { return give(4, v); }
    HRESULT put_Width(LONG) noexcept override { return E_FAIL; }
    HRESULT put_Height(LONG) noexcept override { return E_FAIL; }
    HRESULT put_Bits(LONG) noexcept override { return E_FAIL; }
    HRESULT put_Encoding(PixmatEncoding) noexcept override { return E_FAIL; }
    HRESULT put_Offset(LONG) noexcept override { return E_FAIL; }
    HRESULT put_XStride(LONG) noexcept override { return E_FAIL; }
    HRESULT put_YStride(LONG) noexcept override { return E_FAIL; }

private:
    template <class T>
    HRESULT give(T answer, T* value) noexcept
    {
        *value = answer;
        return --left_ == 0 ? E_UNEXPECTED : S_OK;
    }
    int left_;
};

TEST(Factory, ReadsForeignDescriptorsAndPassesTheirFailuresOn)
{
    const auto factory = create<IPixmatFactory>(CLSID_PixmatFactory);
    com_ptr<IPixmat2> image;
    for (int n = 1; n <= 7; ++n)
        EXPECT_EQ(factory->Create(make<failing_descriptor>(n).get(), PixmatCreateMode_Layout, image.put()),
                  E_UNEXPECTED);
    EXPECT_EQ(factory->Create(make<failing_descriptor>(8).get(), PixmatCreateMode_Layout, image.put()), S_OK);
}

TEST(Factory, SaysWhenMemoryRunsOut)
{
    const image_layout layout = packed_layout(40, 30, 16, PixmatEncoding_Unsigned);
    const auto factory = create<IPixmatFactory>(CLSID_PixmatFactory);
    const auto descriptor = descriptor_of(layout);
    com_ptr<IPixmat2> image, copy;
    com_ptr<IPixmatLock> lock;
    com_ptr<IPixmatDescriptor> found;
    const auto everything = [&] {
        HRESULT hr = factory->Create(descriptor.get(), PixmatCreateMode_Packed, image.put());
        if (succeeded(hr)) hr = image->Clone(copy.put());
        if (succeeded(hr)) hr = image->GetDescriptor(found.put());
        if (succeeded(hr)) hr = image->OpenRead(nullptr, 1.0, lock.put());
        if (succeeded(hr)) hr = image->OpenWrite(lock.put());
        return hr;
    };
    const int64_t before = ZELT::Test::live_allocations();
    int n = 1;
    for (;; ++n) {
        const HRESULT hr = with_failing_allocation(n, everything);
        if (hr == S_OK) break;
        lock = nullptr, found = nullptr, copy = nullptr, image = nullptr;
        ASSERT_EQ(hr, E_OUTOFMEMORY) << n;
        ASSERT_EQ(ZELT::Test::live_allocations(), before) << n;
    }
    EXPECT_GT(n, 7);
}

TEST(Component, ClassesAreFoundByName)
{
    const std::pair<const wchar_t*, GUID> classes[] = {{L"ZELT.PixmatDescriptor", CLSID_PixmatDescriptor},
                                                       {L"ZELT.PixmatFactory", CLSID_PixmatFactory},
                                                       {L"ZELT.PixmatConverter", CLSID_PixmatConverter}};
    for (const auto& [name, id] : classes) {
        GUID found{};
        EXPECT_EQ(CLSIDFromProgID(name, &found), S_OK);
        EXPECT_EQ(found, id);
        EXPECT_EQ(CLSIDFromProgID((std::wstring(name) + L".1").c_str(), &found), S_OK);
        EXPECT_EQ(found, id);
        com_ptr<IUnknown> object;
        const auto outer = make<failing_descriptor>(1);
        EXPECT_EQ(CoCreateInstance(id, outer.get(), CLSCTX_ALL, IUnknown::iid, object.put_void()),
                  CLASS_E_NOAGGREGATION);
        EXPECT_EQ(CoCreateInstance(id, nullptr, CLSCTX_ALL, IPixmatLock::iid, object.put_void()),
                  E_NOINTERFACE);
    }
}

TEST(Component, PropertiesOfADescriptorAreReachedByName)
{
    const auto descriptor = make<CPixmatDescriptor>();
    image_layout layout;
    EXPECT_EQ(read_layout(descriptor.get(), layout), S_OK);
    EXPECT_EQ(layout, image_layout{});
    OLECHAR* names[] = {const_cast<OLECHAR*>(L"width"),  const_cast<OLECHAR*>(L"Height"),
                        const_cast<OLECHAR*>(L"BITS"),   const_cast<OLECHAR*>(L"Encoding"),
                        const_cast<OLECHAR*>(L"Offset"), const_cast<OLECHAR*>(L"XStride"),
                        const_cast<OLECHAR*>(L"YStride")};
    int32_t number = 10;
    for (OLECHAR* name : names) {
        DISPID id = DISPID_UNKNOWN, put_id = DISPID_PROPERTYPUT;
        ASSERT_EQ(descriptor->GetIDsOfNames(GUID_NULL, &name, 1, LOCALE_USER_DEFAULT, &id), S_OK);
        variant value(++number), found;
        DISPPARAMS put{value.get(), &put_id, 1, 1}, get{nullptr, nullptr, 0, 0};
        EXPECT_EQ(descriptor->Invoke(id, GUID_NULL, LOCALE_USER_DEFAULT, DISPATCH_PROPERTYPUT, &put, nullptr,
                                     nullptr, nullptr),
                  S_OK);
        EXPECT_EQ(descriptor->Invoke(id, GUID_NULL, LOCALE_USER_DEFAULT, DISPATCH_PROPERTYGET, &get,
                                     found.put(), nullptr, nullptr),
                  S_OK);
        EXPECT_EQ(found->lVal, number);
    }
    EXPECT_EQ(read_layout(descriptor.get(), layout), S_OK);
    EXPECT_EQ(layout, (image_layout{11, 12, 13, static_cast<PixmatEncoding>(14), 15, 16, 17}));
    EXPECT_EQ(descriptor->get_Width(nullptr), E_POINTER);
    EXPECT_EQ(descriptor->get_YStride(nullptr), E_POINTER);
}

/// Every interface that scripts see has one row a method, in slot order (what is for bare memory left out), with help.
template <class I>
void check_table(std::vector<std::string> names)
{
    const interface_info& table = table_of<I>();
    EXPECT_STREQ(table.name, I::interface_name);
    EXPECT_EQ(table.id, I::iid);
    std::vector<std::string> found;
    for (const method_info& m : table.methods) {
        if (m.kind != DISPATCH_PROPERTYPUT) found.push_back(m.name);
        EXPECT_GT(std::strlen(m.help), 2u) << m.name;
    }
    EXPECT_EQ(found, names) << I::interface_name;
}

TEST(Component, TablesDescribeTheInterfaces)
{
    check_table<IPixmatDescriptor>({"Width", "Height", "Bits", "Encoding", "Offset", "XStride", "YStride"});
    check_table<IPixmat2>({"GetDescriptor", "Clone", "StartNotifications", "StopNotifications"});
    check_table<IPixmatFactory>({"Create"});
    check_table<ICoordinateInt>({"X", "Y"});
    check_table<ICoordinateFloat>({"X", "Y"});
    check_table<IRectangle>({"Left", "Top", "Right", "Bottom"});
    check_table<IFloatVector2D>({"X", "Y"});
    check_table<ISizeInt>({"Width", "Height"});
    check_table<IRangeFloat>({"Low", "High"});
    check_table<ILookupTable>({"Count", "Entry", "Low", "High"});
    for (const enumeration_value& v : enumeration_of<PixmatEncoding>::values)
        EXPECT_EQ(v.name, "PixmatEncoding_" +
                              std::string(ZELT::GetPixmatEncodingName(static_cast<PixmatEncoding>(v.value))));
    EXPECT_EQ(std::size(enumeration_of<PixmatEncoding>::values), 18u);
}

} // namespace
} // namespace Qor::Luxar::Test
