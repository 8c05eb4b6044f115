// The transfer object: pixels through a lookup table or through levels.
#pragma once

#include "com/implements.h"
#include "pixmat/levels.h"
#include "zelt/pixmat/pixmat.h"

#include <vector>

namespace Qor::Luxar {

class CPixmatTransfer final : public implements<IPixmatTransfer> {
public:
    CPixmatTransfer(const image_layout& source, const image_layout& target) noexcept
        : source_layout_(source), target_layout_(target)
    {
    }

    HRESULT Run(const void* source, void* target, const rectangle* source_area,
                const coordinate<int32_t>* target_point) noexcept override;
    HRESULT SetLookupTable(const uint32_t* entries, LONG count, double low, double high) noexcept override;
    HRESULT SetContrast(double value) noexcept override;
    HRESULT SetBrightness(double value) noexcept override;
    HRESULT SetGamma(double value) noexcept override;
    HRESULT SetSigma(double value) noexcept override;

private:
    HRESULT set_level(double& level, double value, bool positive) noexcept;
    HRESULT recode(const void* source, void* target) const;
    HRESULT look_up(const ZELT::memory_2d& from, const ZELT::memory_2d& to) const;
    HRESULT level(const ZELT::memory_2d& from, const ZELT::memory_2d& to) const;
    bool levels_change_nothing() const;

    const image_layout source_layout_;
    const image_layout target_layout_;
    std::vector<ZELT::colour_32> table_;
    double low_ = 0.0;
    double high_ = 0.0;
    Convert::levels levels_;
    bool levels_set_ = false;
};

} // namespace Qor::Luxar
