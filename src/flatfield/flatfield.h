// The facet of flat-field correction.
#pragma once

#include "com/implements.h"
#include "threads/multi_threaded_pool.h"
#include "zelt/interfaces/flatfield.h"

namespace Qor::Luxar::ZELT {

class CFlatFielding : public automation<IFlatFielding> {
public:
    HRESULT ToDarkRef(IPixmat2* pIDstImage, IPixmat2* pISrcImage, LONG offset) noexcept override;
    HRESULT ToDarkRefEx(IPixmat2* pIIn, PixmatEncoding encoding, LONG offset,
                        IPixmat2** ppIOut) noexcept override;
    HRESULT ToGainRef(IPixmat2* pIDstImage, IPixmat2* pISrcImage, double Norm,
                      LONG scaleFactor) noexcept override;
    HRESULT ToGainRefEx(IPixmat2* pIIn, PixmatEncoding encoding, double Norm, LONG scaleFactor,
                        IPixmat2** ppIOut) noexcept override;
    HRESULT Flatten(IPixmat2* pIDstImage, IPixmat2* pISrcImage, IPixmat2* pIDarkRefImage,
                    IPixmat2* pIGainRefImage, LONG scaleFactor) noexcept override;
    HRESULT FlattenEx(IPixmat2* pIIn, PixmatEncoding encoding, IPixmat2* pIDarkRefImage,
                      IPixmat2* pIGainRefImage, LONG scaleFactor, IPixmat2** ppIOut) noexcept override;
    HRESULT FlattenDouble(IPixmat2* pIDstImage, IPixmat2* pISrcImageLong, IPixmat2* pISrcImageShort,
                          double scaleFactorShortExposure, IPixmat2* pIDarkRefImage, IPixmat2* pIGainRefImage,
                          LONG scaleFactor) noexcept override;

private:
    Thread::MultiThreadedPool pool_{0, nullptr};
};

using CFlatFieldingDisp = scripting<CFlatFielding>;

} // namespace Qor::Luxar::ZELT
