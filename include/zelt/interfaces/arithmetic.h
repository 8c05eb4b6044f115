// Pixel-wise operations: an image with a second image or a number.
#pragma once

#include "zelt/interfaces/enums.h"
#include "zelt/pixmat/pixmat.h"

namespace Qor::Luxar::ZELT {

/// Where the first generation's AddOffset puts the second image.
enum ZELT_Offset : int32_t {
    ZELT_Offset_Integer = 0,  ///< at whole pixels: the position is rounded down
    ZELT_Offset_SubPixel = 1, ///< between pixels
};

enum ZELT_AutoThreshold_Method : int32_t {
    ZELT_AutoThreshold_Basic_Global = 0,
};

/// Combines images with images and numbers, pixel by pixel.
/// What holds for Add, Subtract, ReverseSubtract, Multiply, Divide, ReverseDivide, Min, Max and SetTo:
/// Pixels     Unsigned and Signed of up to 32 bits (stored in one, two or four bytes; one that lies closer to its
///            neighbour than its storage is refused), Float 32 and 64, Complex_Float and both half-complex
///            encodings of 64 and 128 bits, and RGB, RGBA, BGR as told below. The result has the type of the
///            output; a new output has the descriptor of the first operand, nominal bits included.
/// Arguments  pIA: the first operand. b: the second one, an image of the same size; or VT_I1, VT_UI1, VT_I2,
///            VT_UI2, VT_I4, VT_UI4, VT_R4, VT_R8 and nothing else for real images; for complex ones also an
///            IComplex or a one-dimensional array of two VT_R4 or VT_R8, real part first. pIOutImg: receives the
///            result, if given. ppIOut: may be null then.
/// Types      Images: the output must have the encoding and bits of pIA, or else of b, and the size of pIA. Two
///            integers are computed in 32 bits, as signed numbers when both are Signed, else as unsigned ones:
///            negative numbers then count as huge. An integer or Float 32 with Float 32 is computed in float,
///            anything with Float 64 in double. A complex output takes complex numbers of either width and Float,
///            as real part, and computes in its own width.
///            Numbers: a number counts as an image of its type. The output may be larger than pIA, its other
///            pixels stay; it may have any real type when pIA is Unsigned or Float, else that of pIA.
/// Rounding   Fastest and Wrap: integers keep their low bits, in the width of the storage. Real values go through
///            truncation to 64 bits (0 for NaN and what lies beyond). Float outputs get the value itself.
///            Saturate: limited to the nominal range of the output (12 bits: 0 to 4095), Float to 0 to 1; a value
///            that is not >= the lower limit becomes the lower limit, so does NaN. The comparison is that of the
///            computing type: in unsigned 32 bits 5 - 10 becomes the upper limit of an unsigned type, and an
///            Unsigned operand turns small positive results of a Signed output into its lower limit. Float 32
///            knows the limits of 32-bit integers rounded up by one; that one keeps its low bits too.
///            32-bit integers overflow by wrapping in every mode. Complex outputs ignore the mode.
/// Complex    (a + ib)(c + id) is (ac - bd) + i(bc + ad); (a + ib) / (c + id) is
///            (ac + bd) / (cc + dd) + i(bc - ad) / (cc + dd), each product and sum rounded as it stands.
/// Spectra    A half-complex pIA with a complex number (or array), or with an image that is not half-complex, is
///            first expanded (IFourier::ExpandHalfComplex) into a new Complex_Float image of its full width, which
///            then also is the output: pIOutImg is not used, and a call that only names pIOutImg changes nothing.
/// Colour     An RGB, RGBA or BGR output takes the other operand in Float: it is truncated to one byte and acts on
///            each of the three colour bytes, which wrap. A fourth byte stays. There is no colour with numbers.
/// Division   A ZERO DIVISOR IN INTEGER ARITHMETIC IS A PROCESSOR FAULT (SIGFPE), NOT AN ERROR CODE: never divide
///            by an integer image with zero pixels, or by 0 (ReverseDivide: never give such a pIA). Integers are
///            truncated toward zero, floats follow IEEE.
/// In place   the output may be either operand: it is then opened for writing only.
/// NaN        Min and Max give the first operand when one of both is NaN.
/// Threads    everything runs on the calling thread.
/// Fails      in this order, without text where none is told; nothing is written:
///            E_INVALIDARG for a null pIA; E_POINTER for no pIOutImg and no ppIOut;
///            the answer to the query, "Right argument must be scalar or IPixmat2", for an object that is neither
///            image nor IComplex (E_POINTER for a null one);
///            E_NOTIMPL "Half-complex image must be first operand";
///            E_INVALIDARG "Can't operate on images of different size";
///            E_INVALIDARG for an output of another size (images), E_NOTIMPL for a smaller one (numbers);
///            E_INVALIDARG "Supplied destination image must have same type as at least one of the arguments";
///            E_INVALIDARG for any other combination of types, Min and Max of complex ones among them;
///            E_UNEXPECTED for a rounding mode that is none. What an image answers comes back unchanged.
struct IBasicOps2 : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0341-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IBasicOps2";
    using base = IDispatch;

    /// pIA + b
    virtual HRESULT Add(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;
    /// pIA - b
    virtual HRESULT Subtract(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;
    /// b - pIA
    virtual HRESULT ReverseSubtract(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg,
                                    IPixmat2** ppIOut) noexcept = 0;
    /// pIA * b
    virtual HRESULT Multiply(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;
    /// pIA / b. A zero in an integer b is a processor fault.
    virtual HRESULT Divide(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;
    /// b / pIA. A zero in an integer pIA is a processor fault.
    virtual HRESULT ReverseDivide(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg,
                                  IPixmat2** ppIOut) noexcept = 0;

    /// Fills an image, or a rectangle of it, with a number or with the pixels of another image.
    /// Arguments  b: as above; an image has the size of the rectangle. pIRect: null means the whole image.
    /// Values     as by Add under Fastest: 300 is 44 in 8 bits.
    /// In place   always. A half-complex image with a complex number is expanded like any other pIA, so that the
    ///            call has no effect.
    /// Fails      E_POINTER for a null image; E_INVALIDARG for a rectangle that leaves it; then as above.
    virtual HRESULT SetTo(IPixmat2* pIImg, VARIANT b, IRectangle* pIRect) noexcept = 0;

    // What holds for AddOffset to Extend below: "real" means Unsigned and Signed of 8 to 32 bits and Float 32 and 64. A
    // double becomes an integer by truncation; one that leaves the type keeps its low bits, and NaN or what lies
    // beyond 64 bits is 0. Images that share memory in part give what separate ones would. A text goes with
    // E_INVALIDARG unless another code is told; a code without text stands alone. What an image answers comes back
    // unchanged. Everything runs on the calling thread.

    /// Blends pIB into pIA at a position between pixels.
    /// Pixels     both real, of any two types, or both RGB or both BGR of 24 bits, each byte on its own.
    /// Arguments  pIPos: where the origin of pIB falls in pIA, in pixels. fa, fb: weights of pIA and pIB.
    /// Values     fa * pIA + fb * (sum of the neighbours in pIB, each with its bilinear weight), in double:
    ///            first the pixel itself, then its left neighbour, then the two above. What lies outside pIB adds
    ///            nothing, so that its rim fades. Pixels of pIA that no neighbour of any weight touches stay as they
    ///            are: at a whole position these are all but those below pIB.
    /// In place   always; pIB may be pIA.
    /// NaN        a position that is NaN, infinite or so far away that nothing meets changes nothing and succeeds.
    /// Fails      E_INVALIDARG for a null argument; E_NOTIMPL for other pixels.
    virtual HRESULT AddOffset(IPixmat2* pIA, IPixmat2* pIB, ICoordinateFloat* pIPos, double fa,
                              double fb) noexcept = 0;
    /// The weighted sum of two images, with pIB at a whole position.
    /// Pixels     real, of any two types. A new output has the descriptor of pIA, nominal bits included; a given one
    ///            has the size and storage of pIA.
    /// Arguments  pIPos: where the origin of pIB falls in pIA; null means (0, 0). ppIOut: may be null if pIOut is
    ///            given.
    /// Values     fa * pIA, and + fb * (ratio * pIB) where pIB lies, in double. ratio: between integers the ratio
    ///            of their nominal ranges, 65536 / 256 for pIA of 16 bits and pIB of 8; else 1.
    /// In place   the output may be either operand.
    /// Fails      in this order: E_POINTER for no pIOut and no ppIOut; E_INVALIDARG for a null image;
    ///            "AddIntegerOffset: Source and destination image must be equal in size"; E_NOTIMPL for other pixels;
    ///            E_INVALIDARG for an output of another storage.
    virtual HRESULT AddIntegerOffset(IPixmat2* pIA, IPixmat2* pIB, ICoordinateInt* pIPos, double fa,
                                     double fb, IPixmat2* pIOut, IPixmat2** ppIOut) noexcept = 0;

    /// The lesser of pIA and b, always under Fastest. No complex images.
    virtual HRESULT Min(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;
    /// The greater of pIA and b, always under Fastest. No complex images.
    virtual HRESULT Max(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;

    // What holds for Abs, Threshold, Normalize and AutoThreshold: a new output has the descriptor of pIImage, nominal
    // bits included; a given one has its size and pixel type, depths of 9 to 16 bits being one type, 17 to 32 another.
    // The output may be pIImage, which is then opened for writing only; images that share memory in part give what
    // separate ones would. ppIOut may be null. Images without pixels succeed. Everything runs on the calling thread.
    // Unless told otherwise: pixels are Unsigned and Signed of 8 to 32 bits and Float 32 and 64. Fails, in this order:
    // E_INVALIDARG for a null pIImage; what an image answers, unchanged; E_NOTIMPL for other pixels, and for those of
    // 17 to 24 bits that lie in three bytes; E_INVALIDARG for an output of another size or type.

    /// Absolute values.
    /// Pixels     Signed of exactly 8, 16 and 32 bits, Float 32 and 64. Unsigned of 1 to 32 bits is copied, into an
    ///            output of any type that values can be carried over to (IPixmatConverter::ConvertRecode); in place
    ///            nothing happens.
    /// Values     the most negative integer stays what it is: -128 for 8 bits.
    /// NaN        stays.
    /// Fails      E_INVALIDARG "Abs(): Output image must have same format as input image" for an output of another
    ///            size, before pixels are looked at.
    virtual HRESULT Abs(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;
    /// Replaces pixels below one limit and above another.
    /// Arguments  lowLimit, lowValue, highLimit, highValue: coerced to the pixel's type like any VARIANT, real numbers
    ///            to integers by rounding half to even. What cannot be coerced, because it is no number or does not
    ///            fit, is no failure: lowLimit and lowValue then are the lowest finite value of the type, highLimit
    ///            and highValue the highest. Types are those of the storage: 12 bits reach to 65535.
    /// Values     lowValue for a pixel below lowLimit, else highValue for one above highLimit, else the pixel. Where
    ///            highLimit is below lowLimit, lowLimit wins.
    /// NaN        stays.
    virtual HRESULT Threshold(IPixmat2* pIImage, VARIANT lowLimit, VARIANT lowValue, VARIANT highLimit,
                              VARIANT highValue, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;
    /// Stretches the contrast between two fractions of the histogram.
    /// Arguments  low, high: from 0 to 1. The stretch starts at the histogram's bin lo, in which the pixels so far
    ///            become more than low times all (rounded down), and ends at hi, from lo on the first one in which
    ///            they become at least high times all (rounded up). Where hi is not above lo, nothing is stretched:
    ///            offset 0 and factor 1 stand below.
    /// Bins       8 and 16 bits: one for each value. Others: one for each 1 of max - min, from min on, but no more
    ///            than 65536; Float has at least 1024.
    /// Values     8 and 16 bits: (p - lo) times the quotient of 255 or 65535 by hi - lo (rounded first, so that hi
    ///            itself may fall one short of the top), minus 128 or 32768 for Signed; limited to the type and
    ///            truncated. An image of Signed pixels without a stretch is lowered all the same.
    ///            32 bits: alike, but the factor is the whole quotient of 4294967295 by hi - lo, a coarse one.
    ///            Float: (p - lo) times 1 / (hi - lo), not limited, plus the least positive normal number of the
    ///            type. All in double.
    /// NaN        stays; it counts as a pixel of the first bin and is neither min nor max. Infinities put all pixels
    ///            into the first bin, so that nothing is stretched.
    /// Fails      E_INVALIDARG "Normalize(): low, high must be in [0, 1] range" for low below 0 or high above 1, after
    ///            a null pIImage; a low of 1 and more, high below low and NaN stretch nothing.
    virtual HRESULT Normalize(IPixmat2* pIImage, double low, double high, IPixmat2* pIOutImg,
                              IPixmat2** ppIOut) noexcept = 0;
    /// Whether two images have the same pixels. Images of different size, encoding or bits are not equal; strides may
    /// differ.
    /// Pixels     Unsigned, Signed (by their stored bytes), Float and complex of any kind (by value, so that NaN
    ///            differs from itself and 0 equals -0); RGB, RGBA and BGR of 24 or 32 bits, all bytes.
    /// Values     VARIANT_TRUE or VARIANT_FALSE. Images without pixels are equal.
    /// Fails      E_INVALIDARG for a null image; E_POINTER for a null pResult; E_NOTIMPL for images of one format with
    ///            other pixels: integers below 8 bits or of 64, BGRA, anything else.
    virtual HRESULT Equals(IPixmat2* pIImgA, IPixmat2* pIImgB, VARIANT_BOOL* pResult) noexcept = 0;
    /// Splits an image into two classes at a limit that comes from its histogram.
    /// Arguments  belowValue, aboveValue: as lowValue and highValue of Threshold. method: only
    ///            ZELT_AutoThreshold_Basic_Global is there.
    /// Values     as Threshold with both limits at T, so that a pixel equal to T stays. T starts in the middle of the
    ///            occupied bins and moves to the middle between the means of the bins below it and from it on, until a
    ///            step is not above 0.1. T COUNTS BINS: it is a pixel's value only where there is one bin for each value
    ///            from 0 on. Integers truncate it, keeping the low bits.
    /// Bins       (p - min) times a scale, truncated. The scale is 1 for ranges (max - min) of 127 to 65535; below,
    ///            it is 128 / (range + 1), in whole numbers for 8 bits, with 128 bins, so that T may be far from any
    ///            pixel; this also holds for the whole range of a type of 16 or of signed 8 bits. Above 65535 the
    ///            scale is 0 and so is T. Ranges of 32 bits wrap, those of Float are rounded to the type.
    /// NaN        stays, and counts as a pixel of the first bin.
    /// Fails      E_INVALIDARG for another method.
    virtual HRESULT AutoThreshold(IPixmat2* pIImage, VARIANT belowValue, VARIANT aboveValue,
                                  ZELT_AutoThreshold_Method method, IPixmat2* pIOutImg,
                                  IPixmat2** ppIOut) noexcept = 0;
    /// Blanks a frame around an image.
    /// Pixels     real. A new output has the descriptor of pIImage; a given one has its size and storage.
    /// Arguments  imgMargins: width of the frame in pixels on the right and at the bottom; on the left and at the top
    ///            it is one more, deliberately. A negative number makes no frame.
    /// Values     the frame gets the lowest value of the type: 0 for Unsigned, -32768 for Signed of 16 bits; for Float
    ///            the least positive normal number.
    /// In place   allowed.
    /// Fails      in this order: E_INVALIDARG for a null image or an output of another size; E_NOTIMPL for other
    ///            pixels; E_INVALIDARG for an output of another storage. E_POINTER, after the work, for a null ppIOut.
    virtual HRESULT Margins(IPixmat2* pIImage, LONG imgMargins, IPixmat2* pIOutImg,
                            IPixmat2** ppIOut) noexcept = 0;
    /// Blends two images by a mask: base * (1 - w) + combine * w, in double.
    /// Pixels     real; all images have one size, encoding and bits. A new output has the descriptor of pIBaseImage.
    /// Values     w is the mask mapped to 0 to 1 over the range of its storage (not that of its nominal bits): p
    ///            times the reciprocal of the highest value of an Unsigned type, p minus the lowest value times the
    ///            reciprocal of the range of a Signed one, so that the highest weight is 1. Float is its own weight,
    ///            also outside 0 to 1.
    /// In place   the output may be any of the inputs.
    /// Fails      in this order: E_INVALIDARG for a null image; "all input images must be of the same format";
    ///            "input and output images must be of the same format"; E_NOTIMPL for other pixels.
    ///            E_POINTER, after the work, for a null ppIOut.
    virtual HRESULT Combine(IPixmat2* pIBaseImage, IPixmat2* pICombineImage, IPixmat2* pIWeightMask,
                            IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;

    /// e to the power of each pixel.
    /// Pixels     Float 32 and 64; the result has the format of the input.
    /// Values     within one unit in the last place, computed in the precision of the pixel, with the same bits on every
    ///            processor. Infinite beyond the largest number (Float 64 from 1.79769e308 on), 0 below the smallest.
    /// In place   allowed.
    /// NaN        gives NaN.
    /// Fails      "null IPixmat2" (E_INVALIDARG); E_INVALIDARG for an output of another encoding, depth or size, "Exp():
    ///            Output image must have same format as input image"; E_NOTIMPL without text for any other pixel
    ///            type; E_POINTER, after the work, for a null ppIOut.
    virtual HRESULT Exp(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;
    /// The natural logarithm of each pixel: of 0 negative infinity, of a negative number NaN.
    /// What else holds for Exp holds here; the text is "Log(): Output image must have same format as input image".
    virtual HRESULT Log(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;
    /// Shades a colour image by a mask.
    /// Pixels     pIImage: RGB, RGBA or BGR of 24 or 32 bits; pIMask: real, of the same size. The output has the format
    ///            of pIImage, a new one its descriptor.
    /// Arguments  weight: how much the mask counts; 0 leaves the colours, 1 puts the mask in their place.
    /// Values     pow(c / 255, 1 - weight) * 255 * pow(m, weight) for each colour byte c, truncated, with m the mask
    ///            mapped to 0 to 1 as in Combine. A fourth byte is not written.
    /// In place   allowed.
    /// Fails      in this order: E_INVALIDARG for a null image; E_NOTIMPL "Source image must have color encoding";
    ///            "Image and mask must have the same size"; "input and output images must be of the same format";
    ///            E_NOTIMPL for other pixels. E_POINTER, after the work, for a null ppIOut.
    virtual HRESULT Modulate(IPixmat2* pIImage, IPixmat2* pIMask, double weight, IPixmat2* pIOutImage,
                             IPixmat2** ppIOut) noexcept = 0;
    /// Cuts an image to a rectangle that may reach beyond it, and pads it there.
    /// Pixels     real, integers of 9 to 16 bits among them but none of 17 to 31. A new output declares the bits of its
    ///            storage; a given one has the pixel type of pIImage.
    /// Arguments  pIExtendedImageDomain: the part of the plane that the output shows, in pixels of pIImage; a left
    ///            of -2 pads two pixels there. boundaryCondition: only ZELT_BoundaryCondition_ConstantValue is there.
    ///            padValue: truncated to the pixel type.
    /// In place   allowed.
    /// Fails      in this order: E_NOTIMPL for another boundary condition; E_INVALIDARG for a null rectangle or one
    ///            with negative sides; E_OUTOFMEMORY for a new output too large for memory; E_INVALIDARG, as told:
    ///            "null IPixmat2"; "Extend: src and dst pixel types must be identical"; "Extend: dst size mismatch";
    ///            "Extend: unsupported pixel type". E_POINTER, after the work, for a null ppIPixmat.
    virtual HRESULT Extend(IPixmat2* pIImage, IRectangle* pIExtendedImageDomain,
                           ZELT_BoundaryCondition boundaryCondition, double padValue, IPixmat2* pIOut,
                           IPixmat2** ppIPixmat) noexcept = 0;

    /// Each pixel to the same power.
    /// Pixels     Float 32 and 64; the result has the type and size of the input.
    /// Arguments  exponent: any number; for Float 32 it is rounded to a 32-bit float first.
    /// Values     within one unit in the last place, with the same bits on every processor; squares (2) and square
    ///            roots (0.5) exactly rounded. Zeros, infinite numbers and negative pixels as the C standard has them:
    ///            a negative pixel to an exponent that is not whole is NaN; to an odd one it keeps its sign.
    /// In place   allowed.
    /// NaN        gives NaN, except that any pixel to the power 0, and 1 to any power, is 1.
    /// Fails      E_INVALIDARG, in this order: "null IPixmat2"; "Power: src and dst pixel types must be identical";
    ///            "Power: unsupported pixel type"; "Power: src and dst must have the same size".
    ///            E_POINTER, after the work, for a null ppIOut.
    virtual HRESULT Power(IPixmat2* pIA, double exponent, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;
};

/// The first generation: in place, or (Ex) into a new image. What IBasicOps2 says of each operation holds.
/// Arguments  r: a rounding mode for this call; 0 means that of the facet. A mode given here is set on the facet
///            for the length of the call: do not call one facet from two threads with different modes.
///            pIOutDescr: what the new image is made from; null means the descriptor of the first operand.
/// Spectra    what IBasicOps2 expands comes back from Ex as a new full image; in place it is lost, and nothing
///            changes.
/// Fails      E_INVALIDARG for a null image; Ex: E_POINTER for a null ppIOut; E_INVALIDARG with the text told
///            for a descriptor of another size; then as IBasicOps2.
struct IBasicOps : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0340-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IBasicOps";
    using base = IDispatch;

    virtual HRESULT Add(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept = 0;
    /// "Requested output image of addition has different size"
    virtual HRESULT AddEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                          IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT Subtract(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept = 0;
    /// "Requested output image of subtraction has different size"
    virtual HRESULT SubtractEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                               IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT ReverseSubtract(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept = 0;
    /// "Requested output image of subtraction has different size"
    virtual HRESULT ReverseSubtractEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r,
                                      IPixmatDescriptor* pIOutDescr, IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT Multiply(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept = 0;
    /// "Requested output image of multiplication has different size"
    virtual HRESULT MultiplyEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                               IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT Divide(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept = 0;
    /// "Requested output image of division has different size"
    virtual HRESULT DivideEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                             IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT ReverseDivide(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept = 0;
    /// "Requested output image of division has different size"
    virtual HRESULT ReverseDivideEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                                    IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT SetTo(IPixmat2* pIImg, VARIANT b, IRectangle* pIRect) noexcept = 0;
    /// With weights 1 and 1. Under ZELT_Offset_Integer the position is rounded down first; an unknown mode is
    /// E_INVALIDARG.
    virtual HRESULT AddOffset(IPixmat2* pIA, IPixmat2* pIB, ICoordinateFloat* pIPos,
                              ZELT_Offset mode) noexcept = 0;
    virtual HRESULT Min(IPixmat2* pIA, VARIANT b) noexcept = 0;
    /// "Requested output image of min has different size"
    virtual HRESULT MinEx(IPixmat2* pIA, VARIANT b, IPixmatDescriptor* pIOutDescr,
                          IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT Max(IPixmat2* pIA, VARIANT b) noexcept = 0;
    /// "Requested output image of max has different size"
    virtual HRESULT MaxEx(IPixmat2* pIA, VARIANT b, IPixmatDescriptor* pIOutDescr,
                          IPixmat2** ppIOut) noexcept = 0;
    /// As IBasicOps2::Abs, in place.
    virtual HRESULT Abs(IPixmat2* pIImage) noexcept = 0;
    /// "Requested output image of abs has different size"
    virtual HRESULT AbsEx(IPixmat2* pIImage, IPixmatDescriptor* pIOutDescr, IPixmat2** ppIOut) noexcept = 0;
    virtual HRESULT Threshold(IPixmat2* pIImage, VARIANT lowLimit, VARIANT lowValue, VARIANT highLimit,
                              VARIANT highValue) noexcept = 0;
    /// "Requested output image of ThresholdEx has different size"
    virtual HRESULT ThresholdEx(IPixmat2* pIImage, VARIANT lowLimit, VARIANT lowValue, VARIANT highLimit,
                                VARIANT highValue, IPixmatDescriptor* pIOutDescr,
                                IPixmat2** ppIOut) noexcept = 0;
};

/// Trigonometry, pixel by pixel. Angles are in radians. What holds for all methods:
/// Pixels     Unsigned and Signed of up to 32 bits, Float 32 and 64. The result is a Float 32 image of the same size.
/// Arguments  pIOutImg: receives the result, if given. ppIOut: the result, with a reference added.
/// Values     a pixel becomes a 32-bit float first (a 64-bit float and a large integer are rounded); the result lies
///            within one unit in its last place (Atan, Atan2 and, for angles below 2^22, Tan: 0.6), and has the same
///            bits on every processor. Zeros keep their sign in Sin, Tan, Asin and Atan.
/// In place   the output may be the input, or either of both, when that is Float 32.
/// NaN        gives NaN, as does an infinite angle, and a value outside [-1, 1] in Asin and Acos.
/// Threads    everything runs on the calling thread.
/// Fails      E_INVALIDARG, in this order: "null IPixmat2"; "ZELT::Math images must have the same size" for an output
///            of another size; "Math result image must be float"; "ZELT::Math: unsupported pixel type".
///            E_POINTER, after the work, for a null ppIOut.
struct IMath : IDispatch {
    static constexpr GUID iid = guid("5a1e0000-0342-4000-8000-00000000c0de");
    static constexpr const char* interface_name = "IMath";
    using base = IDispatch;

    /// Sine of an angle of any size.
    virtual HRESULT Sin(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;
    /// Cosine of an angle of any size.
    virtual HRESULT Cos(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;
    /// Tangent of an angle of any size.
    virtual HRESULT Tan(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;
    /// The angle from -pi/2 to pi/2 with this sine.
    virtual HRESULT Asin(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;
    /// The angle from 0 to pi with this cosine.
    virtual HRESULT Acos(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;
    /// The angle from -pi/2 to pi/2 with this tangent; the ends belong to infinite pixels.
    virtual HRESULT Atan(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept = 0;

    /// The angle from -pi to pi between the x axis and the point with y from pIImageA and x from pIImageB.
    /// Values     zeros and infinite numbers as in the C standard: (0, -0) is pi, (-0, -0) is -pi, two infinite ones
    ///            lie on a diagonal.
    /// Fails      E_INVALIDARG, in this order: "null IPixmat2"; "ZELT::Math images must have the same pixel type";
    ///            "ZELT::Math images must have the same size"; "ZELT::Math result image must be float";
    ///            "ZELT::Math: unsupported pixel type".
    virtual HRESULT Atan2(IPixmat2* pIImageA, IPixmat2* pIImageB, IPixmat2* pIOutImg,
                          IPixmat2** ppIOut) noexcept = 0;
};

} // namespace Qor::Luxar::ZELT

namespace Qor {

template <>
struct enumeration_of<Luxar::ZELT::ZELT_Offset> {
    static constexpr enumeration_value values[] = {
        {"ZELT_Offset_Integer", 0},
        {"ZELT_Offset_SubPixel", 1},
    };
    static constexpr enumeration_info info{"ZELT_Offset", values};
};

template <>
struct enumeration_of<Luxar::ZELT::ZELT_AutoThreshold_Method> {
    static constexpr enumeration_value values[] = {
        {"ZELT_AutoThreshold_Basic_Global", 0},
    };
    static constexpr enumeration_info info{"ZELT_AutoThreshold_Method", values};
};

} // namespace Qor
