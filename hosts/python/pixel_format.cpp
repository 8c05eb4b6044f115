#include "pixel_format.h"

#include <bit>

namespace python {
namespace {

bool is_complex(PixmatEncoding e)
{
    return e == PixmatEncoding_Complex_Float || e == PixmatEncoding_Complex_Float_Half_Even ||
           e == PixmatEncoding_Complex_Float_Half_Odd;
}

/// 0 for what is no colour.
int channels_of(PixmatEncoding e)
{
    switch (e) {
    case PixmatEncoding_RGB:
    case PixmatEncoding_BGR: return 3;
    case PixmatEncoding_RGBA:
    case PixmatEncoding_BGRA: return 4;
    default: return 0;
    }
}

[[noreturn]] void refuse(PyObject* type, const std::string& text)
{
    throw raised(type, "zelt.image: " + text);
}

std::string text_of_attribute(const py::array& a, const char* name) { return printed(a.attr(name)); }

/// Elements that are no pixels, each with a way out.
void check_elements(const py::array& a)
{
    const py::dtype dtype = a.dtype();
    const auto name = [&] { return printed(dtype); };
    const bool native = dtype.byteorder() != (std::endian::native == std::endian::little ? '>' : '<');
    if (!native)
        refuse(PyExc_TypeError,
               "the bytes of " + name() +
                   " pixels are in the other order; array.astype(array.dtype.newbyteorder('=')) makes "
                   "a copy in this machine's");
    const auto bytes = dtype.itemsize();
    switch (dtype.kind()) {
    case 'u':
    case 'i': break;
    case 'f':
        if (bytes == 4 || bytes == 8) break;
        refuse(PyExc_TypeError, name() + " pixels are not known; array.astype('" +
                                    (bytes < 4 ? "float32" : "float64") + "') makes a copy that is");
    case 'c':
        if (bytes == 8 || bytes == 16) break;
        refuse(PyExc_TypeError,
               name() + " pixels are not known; array.astype('complex128') makes a copy that is");
    case 'b': refuse(PyExc_TypeError, "bool pixels are not known; array.view('uint8') has 0 and 1 instead");
    case 'O':
        refuse(PyExc_TypeError,
               "Python objects are no pixels; array.astype('float64') makes a copy that has numbers");
    default: refuse(PyExc_TypeError, name() + " pixels are not known");
    }
    if (!(a.flags() & py::detail::npy_api::NPY_ARRAY_ALIGNED_))
        refuse(PyExc_ValueError, "the elements of the array are not aligned in memory; array.copy() is");
}

PixmatEncoding natural_encoding(const py::array& a)
{
    if (a.ndim() == 3) return a.shape(2) == 3 ? PixmatEncoding_RGB : PixmatEncoding_RGBA;
    switch (a.dtype().kind()) {
    case 'u': return PixmatEncoding_Unsigned;
    case 'i': return PixmatEncoding_Signed;
    case 'f': return PixmatEncoding_Float;
    default: return PixmatEncoding_Complex_Float;
    }
}

bool fits(PixmatEncoding encoding, const py::array& a)
{
    if (const int channels = channels_of(encoding)) return a.ndim() == 3 && a.shape(2) == channels;
    return a.ndim() == 2 &&
           (is_complex(encoding) ? a.dtype().kind() == 'c' : encoding == natural_encoding(a));
}

void check_shape(const py::array& a)
{
    const bool colour = a.ndim() == 3 && (a.shape(2) == 3 || a.shape(2) == 4);
    if (a.ndim() != 2 && !colour)
        refuse(PyExc_ValueError,
               "an image is (height, width), or (height, width, 3 or 4) in colour, not of shape " +
                   text_of_attribute(a, "shape"));
    if (!colour) return;
    if (a.dtype().kind() != 'u' || a.dtype().itemsize() != 1)
        refuse(PyExc_TypeError, "colours are uint8, not " + text_of_attribute(a, "dtype"));
    if (a.strides(2) != 1)
        refuse(PyExc_ValueError, "the channels of a pixel must lie beside each other, in order; "
                                 "numpy.ascontiguousarray(array) makes a copy where they do");
}

int32_t within_32_bits(py::ssize_t n)
{
    if (n < INT32_MIN || n > INT32_MAX)
        refuse(PyExc_ValueError, "sides and strides must be below 2^31; this array is too large");
    return static_cast<int32_t>(n);
}

int32_t bits_of(const py::array& a, py::handle given, PixmatEncoding encoding)
{
    const int channels = channels_of(encoding);
    const auto natural = static_cast<int32_t>(8 * a.dtype().itemsize() * (channels ? channels : 1));
    if (given.is_none()) return natural;
    const auto bits = given.cast<int32_t>();
    const bool integer = encoding == PixmatEncoding_Unsigned || encoding == PixmatEncoding_Signed;
    if (bits == natural || (integer && natural == 16 && bits >= 9 && bits < 16)) return bits;
    refuse(PyExc_ValueError, "pixels of " + text_of_attribute(a, "dtype") + " do not have " +
                                 std::to_string(bits) + " bits: " + std::to_string(natural) +
                                 (integer && natural == 16 ? " or fewer, to 9" : ""));
}

} // namespace

pixel_format format_of(const image_layout& l)
{
    const int bytes = (l.bits + 7) / 8;
    switch (l.encoding) {
    case PixmatEncoding_Unsigned:
        if (bytes == 1) return {"B", 'u', 1, 0};
        if (bytes == 2) return {"H", 'u', 2, 0};
        if (bytes == 4) return {"I", 'u', 4, 0};
        if (bytes == 8) return {"Q", 'u', 8, 0};
        break;
    case PixmatEncoding_Signed:
        if (bytes == 1) return {"b", 'i', 1, 0};
        if (bytes == 2) return {"h", 'i', 2, 0};
        if (bytes == 4) return {"i", 'i', 4, 0};
        if (bytes == 8) return {"q", 'i', 8, 0};
        break;
    case PixmatEncoding_Float:
        if (l.bits == 32) return {"f", 'f', 4, 0};
        if (l.bits == 64) return {"d", 'f', 8, 0};
        break;
    case PixmatEncoding_Complex_Float:
    case PixmatEncoding_Complex_Float_Half_Even:
    case PixmatEncoding_Complex_Float_Half_Odd:
        if (l.bits == 64) return {"Zf", 'c', 8, 0};
        if (l.bits == 128) return {"Zd", 'c', 16, 0};
        break;
    default: break;
    }
    return {"B", 'u', 1, bytes};
}

image_layout layout_of_array(const py::array& a, py::handle bits, py::handle given_encoding)
{
    check_elements(a);
    check_shape(a);
    const PixmatEncoding encoding =
        given_encoding.is_none() ? natural_encoding(a) : to_encoding(given_encoding);
    if (!fits(encoding, a))
        refuse(PyExc_ValueError, "an array of " + text_of_attribute(a, "dtype") + " and shape " +
                                     text_of_attribute(a, "shape") + " does not have the encoding " +
                                     printed(given_encoding));
    image_layout l;
    l.width = within_32_bits(a.shape(1));
    l.height = within_32_bits(a.shape(0));
    l.bits = bits_of(a, bits, encoding);
    l.encoding = encoding;
    l.x_stride = within_32_bits(a.strides(1));
    l.y_stride = within_32_bits(a.strides(0));
    return l;
}

PixmatEncoding to_encoding(py::handle encoding)
{
    const enumeration_info& known = enumeration_of<PixmatEncoding>::info;
    if (py::isinstance<py::str>(encoding)) {
        const auto name = encoding.cast<std::string>();
        for (const enumeration_value& v : known.values)
            if (name == v.name || std::string("PixmatEncoding_") + name == v.name)
                return static_cast<PixmatEncoding>(v.value);
        throw raised(PyExc_ValueError, "there is no encoding '" + name + "'");
    }
    return static_cast<PixmatEncoding>(encoding.cast<int32_t>());
}

} // namespace python
