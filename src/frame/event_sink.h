// The library's listener to images.
#pragma once

#include "com/implements.h"
#include "zelt/pixmat/pixmat.h"

#include <atomic>

namespace Qor::Luxar::ZELT {

/// Forwards the notifications of images to an observer, which does not own the sink and is not owned by it. An observer
/// that goes sets another one first (null: nobody) and sees to it that no notification is under way.
class CPixmatEventSink final : public implements<IPixmatEvents> {
public:
    class Observer {
    public:
        virtual HRESULT OnPixmatChanged(IPixmat2* image, const rectangle* changed) noexcept = 0;

    protected:
        ~Observer() = default;
    };

    /// What a new sink has: does nothing.
    class NullObserver final : public Observer {
    public:
        HRESULT OnPixmatChanged(IPixmat2*, const rectangle*) noexcept override { return S_OK; }
    };

    void SetObserver(Observer* observer) noexcept { observer_.store(observer ? observer : &nobody_); }

    HRESULT OnPixmatChanged(IPixmat2* image, const rectangle* changed) noexcept override
    {
        return observer_.load()->OnPixmatChanged(image, changed);
    }

private:
    NullObserver nobody_;
    std::atomic<Observer*> observer_{&nobody_}; // images tell of changes on any thread
};

} // namespace Qor::Luxar::ZELT
