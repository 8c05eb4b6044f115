// Flat-field correction: dark and gain references, and what they do to camera frames.
#pragma once

#include "zelt/pixmat/pixmat.h"

namespace Qor::Luxar::ZELT {

/// A camera frame is corrected with two references: a dark one is subtracted, a gain one is multiplied in.
/// What holds for all methods:
/// Pixels     a kind is encoding and storage: depths of 1 to 8 bits count as one byte, 9 to 16 as two, 17 to
///            32 as four, 33 to 64 as eight. There are kinds for Unsigned and Signed of one, two and four
///            bytes and Float of four and eight. Pixels that lie closer together than their storage (24 bits
///            in three bytes) have no kernels.
/// Size       that of the source; every other image must be at least as large, its other pixels stay as they
///            are.
/// In place   the destination may be any of the other images.
/// Threads    Flatten, FlattenEx and FlattenDouble run on the facet's own pool; a second call waits for the
///            first.
/// Ex         the new image has the input's descriptor with another encoding: the same bits, offset and
///            strides.
/// Fails      E_INVALIDARG for a null image that is not optional, and for one that is too small; E_NOTIMPL
///            for a combination of types without kernel; E_POINTER for a null ppIOut; what an image answers,
///            unchanged. None of these has a text of ours, and nothing is written.
struct IFlatFielding : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0320-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IFlatFielding";
    using base = IDispatch;

    /// Makes a dark reference of a recorded dark frame: each pixel less the offset.
    /// Pixels     both images of one kind; or the source Unsigned and the destination Signed, of the same
    ///            one, two or four bytes.
    /// Arguments  offset: cut to the width of the pixels; converted for Float.
    /// Values     integers wrap: 3 less 5 is 254 in one byte, or -2 where the destination is Signed.
    virtual HRESULT ToDarkRef(IPixmat2* pIDstImage, IPixmat2* pISrcImage, LONG offset) noexcept = 0;

    /// ToDarkRef into a new image.
    virtual HRESULT ToDarkRefEx(IPixmat2* pIIn, PixmatEncoding encoding, LONG offset,
                                IPixmat2** ppIOut) noexcept = 0;

    /// Makes a gain reference of a recorded flat frame: what each pixel must be multiplied with to reach the
    /// norm.
    /// Pixels     a destination Unsigned of one, two or four bytes takes a source of its own kind and becomes
    ///            a fixed-point map; Float of four bytes takes a source of any kind; Float of eight bytes
    ///            takes any source of eight bytes and reads it as Float.
    /// Arguments  Norm: when it is not >= 0 (the default), the mean of the source, which must then be of a
    ///            kind.
    ///            scaleFactor: of fixed-point maps; its low five bits count, and 2^31 counts as negative.
    /// Values     Float: the smaller of Norm / p and 50; 50 for a pixel that is not above 0, since it saw no
    ///            signal.
    ///            Fixed point of n bits: Norm * 2^n / (p * 2^scaleFactor), rounded, at most 2^n - 1; 2^n - 1
    ///            for a pixel of 0. So 16 bits with scaleFactor 1 store a gain of 1 as 32768.
    /// NaN        a NaN pixel gets 50; a NaN in the mean makes NaN of all gains of pixels above 0.
    virtual HRESULT ToGainRef(IPixmat2* pIDstImage, IPixmat2* pISrcImage, double Norm,
                              LONG scaleFactor) noexcept = 0;

    /// ToGainRef into a new image.
    virtual HRESULT ToGainRefEx(IPixmat2* pIIn, PixmatEncoding encoding, double Norm, LONG scaleFactor,
                                IPixmat2** ppIOut) noexcept = 0;

    /// Corrects a frame: S - D, or (S - D) * G with a gain reference.
    /// Pixels     all images of one kind; or a source Unsigned of two bytes, a dark reference Unsigned or
    ///            Signed of two bytes, a gain Unsigned of two or Float of four bytes, and a destination of
    ///            any kind (mixed types).
    /// Arguments  pIGainRefImage: null, or an image without data, means no gain.
    ///            scaleFactor: of fixed-point gains, as in ToGainRef; products are shifted right by
    ///            (16 - scaleFactor) & 31 as 32-bit numbers without sign.
    /// Values     without gain: limited to the type for one and two bytes; wrapping for four bytes of one
    ///            kind, exact for Signed 32, Float 32 and Float 64 from mixed types. Unsigned 32 from mixed
    ///            types is a threshold: 0 for a negative difference, else 0xFFFFFFFF.
    ///            Fixed-point gain: the difference is cut to the width of a destination of one or two bytes,
    ///            multiplied in 32 bits and shifted, and keeps its low bits; nothing saturates. To Float 32
    ///            and Float 64 the product is formed in that type, truncated, its low 32 bits shifted. Images
    ///            of one Float kind: the plain product.
    ///            Float gain: the difference, cut as above, taken as unsigned for Unsigned 32, times the gain
    ///            in single precision; half is added in single precision, the floor keeps its low bits. To
    ///            Float 32 and Float 64 the plain product in that type.
    /// NaN        a product that is NaN or beyond 64 bits is 0 as an integer.
    virtual HRESULT Flatten(IPixmat2* pIDstImage, IPixmat2* pISrcImage, IPixmat2* pIDarkRefImage,
                            IPixmat2* pIGainRefImage, LONG scaleFactor) noexcept = 0;

    /// Flatten into a new image.
    virtual HRESULT FlattenEx(IPixmat2* pIIn, PixmatEncoding encoding, IPixmat2* pIDarkRefImage,
                              IPixmat2* pIGainRefImage, LONG scaleFactor, IPixmat2** ppIOut) noexcept = 0;

    /// Corrects two exposures of one scene and merges them: L of the long and H of the short one, t the
    /// largest value of the long one's depth, k the ratio of their times.
    /// Pixels     the exposures Unsigned of at most 16 bits; the destination Signed, written as 16-bit
    ///            numbers up to 16 bits and as 32-bit ones beyond; dark and gain as the texts below say.
    /// Arguments  pISrcImageShort, pIDarkRefImage, pIGainRefImage: may each be null; without a short exposure
    ///            the rules of Flatten for mixed types apply to the long one. scaleFactorShortExposure: k.
    ///            scaleFactor: as in Flatten.
    /// Values     "limited" truncates into the type's range, "shifted" is the right shift of Flatten.
    ///            no references    L >= t: L * k limited. Else to 16 bits: -32768 for H below 32768, else
    ///                             32767; to 32 bits: H below 65535, else 0x7FFFFFFF.
    ///            dark             L >= t: (L - D) * k limited. Else H - D, within the type.
    ///            dark, Float gain L >= t: (H - D) * k * G limited. Else (L - D) * G, rounded as in Flatten;
    ///                             within 16 bits, or the low 32 bits.
    ///            dark, fixed gain L >= t: (H - D) * k * G truncated, its low 32 bits shifted, limited. Else
    ///                             (L - D) * G shifted; within 16 bits, or as it is.
    ///            Which exposure is scaled differs with and without a gain; this is meant, and so is the
    ///            threshold in 16 bits.
    ///            Eight lanes      With all three optional images, a Signed dark, a fixed gain, a destination
    ///                             of at most 16 bits, a scaleFactor of 2 or more, exposures and references
    ///                             with offset 0 and x stride 2, all data aligned to 16 bytes, all y strides
    ///                             twice the width and a pixel count divisible by 8, everything is computed
    ///                             in 16-bit lanes instead: v is L - D where t > L as signed numbers, else
    ///                             the low bits of (H - D) * k with k truncated to 16 bits; the result is the
    ///                             high half of the signed product v * G, shifted left by scaleFactor (0 from
    ///                             16 on).
    /// NaN        limited, a NaN is 0.
    /// Fails      E_INVALIDARG, in this order: no text for a null destination or long exposure;
    ///            "Destination image must be signed"; "Source image must be unsigned 16 max";
    ///            "Dark reference must be 16 bit signed or unsigned";
    ///            "Gain reference must be 16 bit unsigned or 32 bit float";
    ///            "Short exposure must be same encoding as long exposure" (all of its descriptor must be the
    ///            same);
    ///            "Gain reference provided without dark reference".
    ///            E_NOTIMPL for a long exposure alone.
    virtual HRESULT FlattenDouble(IPixmat2* pIDstImage, IPixmat2* pISrcImageLong, IPixmat2* pISrcImageShort,
                                  double scaleFactorShortExposure, IPixmat2* pIDarkRefImage,
                                  IPixmat2* pIGainRefImage, LONG scaleFactor) noexcept = 0;
};

} // namespace Qor::Luxar::ZELT
