// Every facet of every root, and every method of theirs, from the interface tables alone.
#pragma once

#include "frame/image_access.h"
#include "frame/value_objects.h"
#include "zelt/com/class_registry.h"
#include "zelt/com/safe_array.h"
#include "zelt/interfaces/zelt.h"

#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <vector>

namespace Qor::Luxar::ZELT::Test {

inline const interface_info& described(IDispatch* object)
{
    com_ptr<ITypeInfo> type;
    EXPECT_EQ(object->GetTypeInfo(0, LOCALE_USER_DEFAULT, type.put()), S_OK);
    return *type->Describe();
}

/// Calls the body with each facet of a new root of each class, and the facet's name.
inline void for_each_facet(
    const std::function<void(IDispatch*, const interface_info&, const std::string&)>& body)
{
    for (const GUID& class_id : {CLSID_ZELT, CLSID_ZELT2, CLSID_ZELT2NoDispatch}) {
        com_ptr<IDispatch> root;
        ASSERT_EQ(CoCreateInstance(class_id, nullptr, CLSCTX_ALL, IDispatch::iid, root.put_void()), S_OK);
        for (const method_info& property : described(root.get()).methods) {
            if (property.arguments.empty() || !property.arguments[0].interface_id) continue;
            DISPPARAMS none{};
            variant facet;
            ASSERT_EQ(root->Invoke(property.id, GUID_NULL, 0, DISPATCH_PROPERTYGET, &none, facet.put(),
                                   nullptr, nullptr),
                      S_OK)
                << property.name;
            body(facet->pdispVal, described(facet->pdispVal), std::string(property.name));
        }
    }
}

/// Arguments that suit any method: small images, an area inside them, small numbers.
class ordinary_arguments {
public:
    ordinary_arguments()
    {
        for (int i = 0; i < 4; ++i) {
            com_ptr<IPixmat2> image;
            CheckHResult(
                CreateImageFromLayout(packed_layout(8, 6, 16, PixmatEncoding_Unsigned), image.put()));
            fill(image.get(), i);
            images_.push_back(image);
        }
        CheckHResult(images_[0]->GetDescriptor(descriptor_.put()));
        CheckHResult(Common::MakeRectangle(1, 1, 5, 4, area_.put()));
        CheckHResult(Common::MakeCoordinateInt(2, 1, point_.put()));
        CheckHResult(Common::MakeCoordinateFloat(2.5, 1.5, real_point_.put()));
    }

    /// A value for the n-th argument of a method; results are empty.
    variant value(const argument_info& a, size_t n) const
    {
        if (a.way != direction::in) return {};
        const std::string type = a.type_name;
        if (type == "IPixmat2") return variant(images_[n % images_.size()].get());
        if (type == "IPixmatDescriptor") return variant(descriptor_.get());
        if (type == "IRectangle") return variant(area_.get());
        if (type == "ICoordinateInt") return variant(point_.get());
        if (type == "ICoordinateFloat") return variant(real_point_.get());
        if (a.interface_id) return variant(static_cast<IUnknown*>(nullptr));
        if (a.type == VT_BSTR) return variant(L"Minimum");
        if (a.type == VT_ARRAY) return variant::attach(array());
        if (a.enumeration) return variant(a.enumeration->values[0].value);
        return a.optional ? variant(a.default_number) : variant(1);
    }

    /// The pixels of all images, one after the other.
    std::vector<uint8_t> pixels() const
    {
        std::vector<uint8_t> all;
        for (const auto& image : images_) {
            const ImageReadAccess access(image.get());
            const uint8_t* first = access.view().data;
            all.insert(all.end(), first, first + 8 * 6 * 2);
        }
        return all;
    }

private:
    static void fill(IPixmat2* image, int seed)
    {
        ImageWriteAccess access(image);
        for (int i = 0; i < 8 * 6 * 2; ++i)
            access.view().data[i] = static_cast<uint8_t>(37 * i + 11 * seed + 1);
        CheckHResult(access.Commit());
    }
    static VARIANT array()
    {
        VARIANT v = empty_variant();
        v.parray = SafeArrayCreateVector(VT_R8, 0, 3);
        v.vt = VT_ARRAY | VT_R8;
        return v;
    }

    std::vector<com_ptr<IPixmat2>> images_;
    com_ptr<IPixmatDescriptor> descriptor_;
    com_ptr<IRectangle> area_;
    com_ptr<ICoordinateInt> point_;
    com_ptr<ICoordinateFloat> real_point_;
};

/// A late-bound call with arguments in reading order, made ready so that making it allocates nothing of its own.
class late_call {
public:
    late_call(IDispatch* object, const method_info& m, const std::vector<variant>& arguments)
        : object_(object), m_(m)
    {
        for (size_t i = arguments.size(); i-- > 0;) reversed_.push_back(*arguments[i].get());
    }
    /// The code is the method's own, also when it failed.
    HRESULT operator()(variant* result)
    {
        DISPPARAMS params{reversed_.data(), nullptr, static_cast<uint32_t>(reversed_.size()), 0};
        EXCEPINFO exception{};
        const HRESULT hr = object_->Invoke(m_.id, GUID_NULL, LOCALE_USER_DEFAULT, m_.kind, &params,
                                           result->put(), &exception, nullptr);
        for (BSTR text : {exception.bstrSource, exception.bstrDescription, exception.bstrHelpFile})
            SysFreeString(text);
        return hr == DISP_E_EXCEPTION ? exception.scode : hr;
    }

private:
    IDispatch* object_;
    const method_info& m_;
    std::vector<VARIANT> reversed_; // borrowed from the arguments
};

} // namespace Qor::Luxar::ZELT::Test
