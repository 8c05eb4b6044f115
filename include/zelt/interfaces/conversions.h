// Conversions between image formats.
#pragma once

#include "zelt/com/safe_array.h"
#include "zelt/pixmat/pixmat.h"

namespace Qor::Luxar::ZELT {

/// Both conversions of images, Recode and Cast, share their rules for regions.
///
/// Regions    `pISrcArea` null means the whole source. Without `pIDstPoint` the area lands at (0, 0) and nothing is
///            clipped: an area that does not fit the destination is E_INVALIDARG. With it the area lands there and is
///            clipped to the destination's right and bottom. A negative coordinate of the point becomes 0 and its
///            opposite replaces (is not added to) the area's left or top; scripts rely on this. An area that is empty
///            after clipping is a success that changes nothing.
/// Changed    the destination rectangle is announced as the changed region.
/// In place   allowed, also where regions overlap or two images share memory: the result is that of separate images.
struct IConversions2 : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0331-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IConversions2";
    using base = IDispatch;

    /// Carries pixel values over to the destination's format: rounded half away from zero and limited to its nominal
    /// range; to float unscaled; grey and colour into each other (see IPixmatConverter::ConvertRecode).
    /// Whole images of equal size and pixel type are copied as they are, values above a lower nominal range included.
    /// Fails  E_INVALIDARG for a null image or a region outside; E_NOTIMPL for a pair of formats without mapping; what
    ///        the images answer, unchanged; E_INVALIDARG "Unsupported Pixmat encoding/bits". Nothing is committed then.
    virtual HRESULT Recode(IPixmat2* pIDstImage, IPixmat2* pISrcImage, IRectangle* pISrcArea,
                           ICoordinateInt* pIDstPoint) noexcept = 0;
    /// Recode into a new image with the layout of `pIDescr`.
    /// Fails  as Recode; E_INVALIDARG for a null input or descriptor, E_POINTER for a null `ppIOut`, before any work.
    virtual HRESULT RecodeEx(IPixmat2* pIIn, IPixmatDescriptor* pIDescr, IRectangle* pISrcArea,
                             ICoordinateInt* pIDstPoint, IPixmat2** ppIOut) noexcept = 0;
    /// The plain numeric conversion: truncation toward zero, low bits kept, nothing limited (see
    /// IPixmatConverter::ConvertCast). Fails as Recode.
    virtual HRESULT Cast(IPixmat2* pIDstImage, IPixmat2* pISrcImage, IRectangle* pISrcArea,
                         ICoordinateInt* pIDstPoint) noexcept = 0;
    /// Cast into a new image with the layout of `pIDescr`. Fails as RecodeEx.
    virtual HRESULT CastEx(IPixmat2* pIIn, IPixmatDescriptor* pIDescr, IRectangle* pISrcArea,
                           ICoordinateInt* pIDstPoint, IPixmat2** ppIOut) noexcept = 0;

    // The rest of the table is declared; until its methods come they answer E_NOTIMPL.
    virtual HRESULT Copy(IPixmat2* pIIn, IRectangle* pISrcArea, IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT Paste(IPixmat2* pIIn, IPixmat2* pISelection, ICoordinateInt* pIDstPoint) noexcept = 0;
    virtual HRESULT ToGrey(IPixmat2* pIIn, LONG bits, IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT ToSafeArray(IPixmat2* pIIn, uint16_t varType, ULONG layout, IRectangle* pISrcArea,
                                VARIANT* pArray) noexcept = 0;
    virtual HRESULT FromSafeArray(VARIANT array, PixmatEncoding encoding, LONG bits, ULONG layout,
                                  IPixmat2* pIOut, IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT Reformat(IPixmat2* pIDstImage, IPixmat2* pIIn, ULONG layout,
                             IRectangle* pISrcArea) noexcept = 0;
    virtual HRESULT ReformatEx(IPixmat2* pIIn, ULONG layout, LONG bits, PixmatEncoding encoding,
                               IRectangle* pISrcArea, IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT ApplyLUT(IPixmat2* pIIn, ILookupTable* pILUT, PixmatEncoding encoding,
                             IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT ApplyLevels(IPixmat2* pIIn, double contrast, double brightness, double gamma,
                                double sigma, LONG bits, PixmatEncoding encoding,
                                IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT Interleave(IPixmat2* pIIn, IPixmat2* pIPartial, LONG offset, LONG skip) noexcept = 0;
    virtual HRESULT Split(IPixmat2* pIIn, LONG offset, LONG skip, IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT ApplyLUTEx(IPixmat2* pIIn, IPixmat2* pIOut, ILookupTable* pILUT) noexcept = 0;
    virtual HRESULT ApplyLevelsEx(IPixmat2* pIIn, IPixmat2* pIOut, double contrast, double brightness,
                                  double gamma, double sigma) noexcept = 0;
};

/// The first generation; each method is the second generation's of that name, Cut is its Copy.
struct IConversions : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0330-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IConversions";
    using base = IDispatch;

    virtual HRESULT Recode(IPixmat2* pIDstImage, IPixmat2* pISrcImage, IRectangle* pISrcArea,
                           ICoordinateInt* pIDstPoint) noexcept = 0;
    virtual HRESULT RecodeEx(IPixmat2* pIIn, IPixmatDescriptor* pIDescr, IRectangle* pISrcArea,
                             ICoordinateInt* pIDstPoint, IPixmat2** ppIOut) noexcept = 0;
    /// Has no implementation: E_NOTIMPL whatever is passed. Use IConversions2::Cast.
    virtual HRESULT Cast(IPixmat2* pIA, IPixmatDescriptor* pIOutDescr) noexcept = 0;
    virtual HRESULT Cut(IPixmat2* pIIn, IRectangle* pISrcArea, IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT Paste(IPixmat2* pIIn, IPixmat2* pISelection, ICoordinateInt* pIDstPoint) noexcept = 0;
    virtual HRESULT ToGrey(IPixmat2* pIIn, LONG bits, IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT ToSafeArray(IPixmat2* pIIn, uint16_t varType, ULONG layout, IRectangle* pISrcArea,
                                VARIANT* pArray) noexcept = 0;
    virtual HRESULT FromSafeArray(VARIANT array, PixmatEncoding encoding, LONG bits, ULONG layout,
                                  IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT Reformat(IPixmat2* pIIn, ULONG layout, LONG bits, PixmatEncoding encoding,
                             IRectangle* pISrcArea, IPixmat2** ppIOut) noexcept = 0;
};

} // namespace Qor::Luxar::ZELT
