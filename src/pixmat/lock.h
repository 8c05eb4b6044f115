// Access to an image's pixels. Small objects: every operation makes a few of them.
#pragma once

#include "com/implements.h"
#include "pixmat/image.h"

namespace Qor::Luxar {

class read_lock final : public implements<IPixmatLock> {
public:
    explicit read_lock(com_ptr<CPixmat>&& image) noexcept : image_(std::move(image)) {}

    uint8_t* Data(LONG) noexcept override { return image_->data(); }
    HRESULT Commit(const rectangle*) noexcept override { return E_INVALIDARG; }

private:
    com_ptr<CPixmat> image_;
};

class write_lock final : public implements<IPixmatLock> {
public:
    explicit write_lock(com_ptr<CPixmat>&& image) noexcept : image_(std::move(image)) {}
    ~write_lock() override
    {
        if (!committed_) image_->forget_statistics();
    }

    uint8_t* Data(LONG) noexcept override { return image_->data(); }
    HRESULT Commit(const rectangle* changed) noexcept override
    {
        committed_ = true;
        image_->tell_of_change(changed);
        return S_OK;
    }

private:
    com_ptr<CPixmat> image_;
    bool committed_ = false;
};

} // namespace Qor::Luxar
