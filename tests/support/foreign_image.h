// An image of somebody else: answers like ours, counts what is asked of it, and fails where a test tells it to.
#pragma once

#include "support/foreign_object.h"
#include "zelt/pixmat/pixmat.h"

#include <string>
#include <vector>

namespace Qor::Luxar::ZELT::Test {

/// Where a foreign image fails, with E_ACCESSDENIED.
enum class failing { nothing, descriptor, descriptor_value, open_read, open_write, commit };

class foreign_image : public foreign_object<IPixmat2> {
public:
    foreign_image(const image_layout& layout, void* data, failing where = failing::nothing)
        : layout_(layout), data_(static_cast<uint8_t*>(data)), where_(where)
    {
    }

    std::vector<std::string> calls; ///< "read", "write", "commit", "release" in their order

    HRESULT GetDescriptor(IPixmatDescriptor** out) noexcept override
    {
        if (where_ == failing::descriptor) return E_ACCESSDENIED;
        *out = new descriptor(*this);
        return S_OK;
    }
    HRESULT OpenRead(IRectangle*, double, IPixmatLock** out) noexcept override
    {
        return open("read", failing::open_read, out);
    }
    HRESULT OpenWrite(IPixmatLock** out) noexcept override { return open("write", failing::open_write, out); }
    HRESULT Clone(IPixmat2**) noexcept override { return E_NOTIMPL; }
    HRESULT StartNotifications(IPixmatEvents*, PixmatEventMode) noexcept override { return E_NOTIMPL; }
    HRESULT StopNotifications(IPixmatEvents*) noexcept override { return E_NOTIMPL; }

private:
    class lock final : public implements<IPixmatLock> {
    public:
        lock(foreign_image& image, std::string kind) : image_(&image), kind_(std::move(kind)) {}
        ~lock() override { image_->calls.push_back("release " + kind_); }
        uint8_t* Data(LONG) noexcept override { return image_->data_; }
        HRESULT Commit(const rectangle*) noexcept override
        {
            image_->calls.push_back("commit");
            return image_->where_ == failing::commit ? E_ACCESSDENIED : S_OK;
        }

    private:
        com_ptr<foreign_image> image_;
        std::string kind_;
    };

    class descriptor final : public foreign_object<IPixmatDescriptor> {
    public:
        explicit descriptor(foreign_image& image) : image_(&image) {}
        HRESULT get_Width(LONG* v) noexcept override { return give(image_->layout_.width, v); }
        HRESULT get_Height(LONG* v) noexcept override { return give(image_->layout_.height, v); }
        HRESULT get_Bits(LONG* v) noexcept override { return give(image_->layout_.bits, v); }
        HRESULT get_Encoding(PixmatEncoding* v) noexcept override
        {
            return give(image_->layout_.encoding, v);
        }
        HRESULT get_Offset(LONG* v) noexcept override { return give(image_->layout_.offset, v); }
        HRESULT get_XStride(LONG* v) noexcept override { return give(image_->layout_.x_stride, v); }
        HRESULT get_YStride(LONG* v) noexcept override
        {
            return image_->where_ == failing::descriptor_value ? E_ACCESSDENIED
                                                               : give(image_->layout_.y_stride, v);
        }
        HRESULT put_Width(LONG) noexcept override { return E_NOTIMPL; }
        HRESULT put_Height(LONG) noexcept override { return E_NOTIMPL; }
        HRESULT put_Bits(LONG) noexcept override { return E_NOTIMPL; }
        HRESULT put_Encoding(PixmatEncoding) noexcept override { return E_NOTIMPL; }
        HRESULT put_Offset(LONG) noexcept override { return E_NOTIMPL; }
        HRESULT put_XStride(LONG) noexcept override { return E_NOTIMPL; }
        HRESULT put_YStride(LONG) noexcept override { return E_NOTIMPL; }

    private:
        template <class T>
        static HRESULT give(T from, T* to) noexcept
        {
            *to = from;
            return S_OK;
        }
        com_ptr<foreign_image> image_;
    };

    HRESULT open(const char* kind, failing here, IPixmatLock** out) noexcept
    {
        calls.push_back(kind);
        if (where_ == here) return E_ACCESSDENIED;
        *out = new lock(*this, kind);
        return S_OK;
    }

    image_layout layout_;
    uint8_t* data_;
    failing where_;
};

} // namespace Qor::Luxar::ZELT::Test
