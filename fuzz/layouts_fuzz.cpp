// Images of any layout, through everything that walks their pixels. Images lie at both ends of heap blocks of exactly
// their size, alone or several in one, so that an access outside their pixels is noticed; a call that fails must not
// have written anything.
#include "fuzz_input.h"

#include <memory>
#include <vector>

namespace {

using namespace fuzz;

com_ptr<IPixmat2> from_factory(const image_layout& layout, PixmatCreateMode mode)
{
    com_ptr<IPixmat2> image;
    const HRESULT hr =
        create<IPixmatFactory>(CLSID_PixmatFactory)->Create(descriptor_of(layout).get(), mode, image.put());
    const bool sound = layout.width >= 0 && layout.height >= 0 && layout.bits >= 1;
    const int64_t row_bytes = (int64_t{layout.bits} + 7) / 8 * layout.width;
    const bool too_long = mode == PixmatCreateMode_Packed && row_bytes > std::numeric_limits<int32_t>::max();
    require(hr == (!sound ? E_INVALIDARG : too_long ? E_OUTOFMEMORY : S_OK) && succeeded(hr) == !!image);
    return image;
}

class stage {
public:
    explicit stage(input& in)
    {
        const size_t images = 1 + in.pick(5);
        for (size_t i = 0; i < images; ++i) add(in);
    }

    /// One of the images, sometimes none.
    IPixmat2* any(input& in) const
    {
        const size_t n = in.pick(images_.size() * 4 + 1);
        return n == images_.size() * 4 ? nullptr : images_[n % images_.size()].get();
    }
    std::vector<std::vector<uint8_t>> contents() const
    {
        std::vector<std::vector<uint8_t>> all;
        for (const block& b : blocks_) all.emplace_back(b.bytes.get(), b.bytes.get() + b.size);
        return all;
    }

private:
    struct block {
        std::unique_ptr<uint8_t[]> bytes;
        size_t size;
    };

    void add(input& in)
    {
        const image_layout layout = any_layout(in);
        const bool packed = in.pick(8) == 0;
        const image_layout made =
            packed ? packed_layout(layout.width, layout.height, std::max(layout.bits, 1), layout.encoding)
                   : layout;
        if (!is_small(made) || !is_small(layout)) return add_small();
        const bool sound = layout.width >= 0 && layout.height >= 0 && layout.bits >= 1;
        com_ptr<IPixmat2> image;
        switch (in.pick(sound ? 4 : 1)) {
        case 0:
            image = from_factory(layout, packed ? PixmatCreateMode_Packed : PixmatCreateMode_Layout);
            break;
        case 1:
            if (fits_last_block(layout)) {
                image = wrap(layout, blocks_.back());
                break;
            }
            [[fallthrough]];
        default: image = wrap(layout, new_block(layout, in));
        }
        if (image) images_.push_back(image);
        if (images_.empty()) add_small();
    }

    void add_small()
    {
        images_.push_back(
            from_factory(packed_layout(3, 2, 16, PixmatEncoding_Unsigned), PixmatCreateMode_Packed));
    }

    const block& new_block(const image_layout& layout, input& in)
    {
        const reach r = reach_of(layout);
        const auto size = static_cast<size_t>(r.high - r.low);
        blocks_.push_back({std::unique_ptr<uint8_t[]>(new uint8_t[size]), size});
        const auto pattern = in.take<uint64_t>();
        for (size_t i = 0; i < size; ++i)
            blocks_.back().bytes[i] = static_cast<uint8_t>((pattern >> (i % 8 * 8)) * (i / 8 + 1));
        return blocks_.back();
    }
    bool fits_last_block(const image_layout& layout) const
    {
        const reach r = reach_of(layout);
        return !blocks_.empty() && r.high - r.low <= static_cast<__int128>(blocks_.back().size);
    }
    static com_ptr<IPixmat2> wrap(const image_layout& layout, const block& b)
    {
        com_ptr<IPixmat2> image;
        const reach r = reach_of(layout); // the lowest byte is the block's first
        void* data =
            reinterpret_cast<void*>(reinterpret_cast<intptr_t>(b.bytes.get()) - static_cast<intptr_t>(r.low));
        require(WrapPixmat(layout, data, false, nullptr, nullptr, image.put()) == S_OK);
        return image;
    }

    std::vector<block> blocks_;
    std::vector<com_ptr<IPixmat2>> images_;
};

struct facets {
    com_ptr<IConversions2> conversions;
    com_ptr<IFlatFielding> flat;
    com_ptr<IStatistics> statistics;
    com_ptr<IBasicOps2> basic;
    com_ptr<IZELT2> root = create<IZELT2>(CLSID_ZELT2NoDispatch);

    facets()
    {
        require(root->get_Conversions(conversions.put()) == S_OK);
        require(root->get_FlatFielding(flat.put()) == S_OK);
        require(root->get_Statistics(statistics.put()) == S_OK);
        require(root->get_Basic(basic.put()) == S_OK);
    }
};

HRESULT convert(const facets& f, const stage& s, input& in)
{
    IPixmat2* const dst = s.any(in);
    IPixmat2* const src = s.any(in);
    const auto area = any_area(in);
    const auto point = any_point(in);
    com_ptr<IPixmat2> out;
    const size_t way = in.pick(4);
    if (way == 0) return f.conversions->Recode(dst, src, area.get(), point.get());
    if (way == 1) return f.conversions->Cast(dst, src, area.get(), point.get());
    const image_layout layout = any_layout(in);
    if (!is_small(layout)) return S_OK;
    const auto descriptor = descriptor_of(layout);
    return way == 2 ? f.conversions->RecodeEx(src, descriptor.get(), area.get(), point.get(), out.put())
                    : f.conversions->CastEx(src, descriptor.get(), area.get(), point.get(), out.put());
}

HRESULT correct(const facets& f, const stage& s, input& in)
{
    IPixmat2* const dst = s.any(in);
    IPixmat2* const src = s.any(in);
    IPixmat2* const dark = s.any(in);
    IPixmat2* const gain = s.any(in);
    const auto encoding = static_cast<PixmatEncoding>(in.pick(19));
    com_ptr<IPixmat2> out;
    switch (in.pick(7)) {
    case 0: return f.flat->ToDarkRef(dst, src, in.number());
    case 1: return f.flat->ToDarkRefEx(src, encoding, in.number(), out.put());
    case 2: {
        const double norm = in.real();
        return f.flat->ToGainRef(dst, src, norm, in.number());
    }
    case 3: {
        const double norm = in.real();
        return f.flat->ToGainRefEx(src, encoding, norm, in.number(), out.put());
    }
    case 4: return f.flat->Flatten(dst, src, dark, gain, in.number());
    case 5: return f.flat->FlattenEx(src, encoding, dark, gain, in.number(), out.put());
    default: {
        const double ratio = in.real();
        IPixmat2* const brief = s.any(in);
        return f.flat->FlattenDouble(dst, src, brief, ratio, dark, gain, in.number());
    }
    }
}

/// All but divisions, where a zero is the processor's fault by definition.
HRESULT calculate(const facets& f, const stage& s, input& in)
{
    using method = HRESULT (IBasicOps2::*)(IPixmat2*, VARIANT, IPixmat2*, IPixmat2**) noexcept;
    constexpr method methods[] = {&IBasicOps2::Add,      &IBasicOps2::Subtract, &IBasicOps2::ReverseSubtract,
                                  &IBasicOps2::Multiply, &IBasicOps2::Min,      &IBasicOps2::Max};
    f.root->put_Rounding(static_cast<ZELT_Rounding>(1 + in.pick(3)));
    IPixmat2* const first = s.any(in);
    IPixmat2* const dst = in.chance() ? s.any(in) : nullptr;
    variant second;
    switch (in.pick(5)) {
    case 0: second = variant(in.number()); break;
    case 1: second = variant(in.real()); break;
    case 2: second = variant(static_cast<float>(in.number()) / 8); break;
    case 3: {
        const auto number = create<IComplex>(CLSID_Complex);
        number->put_Real(in.real());
        number->put_Imaginary(in.real());
        second = variant(number.get());
        break;
    }
    default: second = variant(s.any(in));
    }
    if (in.pick(8) == 0) return f.basic->SetTo(first, *second.get(), any_area(in).get());
    com_ptr<IPixmat2> out;
    return (f.basic.get()->*in.one_of(methods))(first, *second.get(), dst, out.put());
}

HRESULT measure(const facets& f, const stage& s, input& in)
{
    IPixmat2* const image = s.any(in);
    const auto area = any_area(in);
    IStatistics* const statistics = f.statistics.get();
    statistics->put_SubsampleFactor(1); // what an earlier input left
    statistics->put_SubsampleFactor(in.number());
    double number = 0;
    LONG count = 0;
    VARIANT_BOOL yes = 0;
    com_ptr<IRectangle> box;
    com_ptr<ICoordinateInt> where;
    com_ptr<ICoordinateFloat> centre;
    com_ptr<IPixmat2> copy;
    switch (in.pick(8)) {
    case 0: {
        using scalar = HRESULT (IStatistics::*)(IPixmat2*, IRectangle*, double*) noexcept;
        constexpr scalar scalars[] = {&IStatistics::Minimum,      &IStatistics::Maximum,
                                      &IStatistics::Mean,         &IStatistics::SumSquares,
                                      &IStatistics::MinimumCount, &IStatistics::MaximumCount};
        return (statistics->*in.one_of(scalars))(image, area.get(), &number);
    }
    case 7: {
        const HRESULT hr = statistics->MinimumPosition(image, area.get(), where.put());
        statistics->MaximumPosition(image, area.get(), where.put());
        statistics->CenterOfGravity(image, area.get(), centre.put());
        return hr;
    }
    case 1: {
        const LONG i = in.number();
        return statistics->Moment(image, i, in.number(), area.get(), &number);
    }
    case 2: {
        const double value = in.real();
        return statistics->Count(image, value, in.number(), area.get(), &count);
    }
    case 3: {
        const double low = in.real();
        return statistics->CountRange(image, low, in.real(), area.get(), &count);
    }
    case 4: return statistics->BoundingBox(image, box.put());
    case 5: {
        const HRESULT hr = statistics->IsNaN(image, &yes);
        return failed(hr) ? hr : statistics->IsFinite(image, &yes);
    }
    default: return image ? image->Clone(copy.put()) : S_OK;
    }
}

/// The converter's pixel pipeline, which no method of these facets reaches.
HRESULT transfer(const stage& s, input& in)
{
    IPixmat2* const src = s.any(in);
    IPixmat2* const dst = s.any(in);
    if (!src || !dst) return S_OK;
    com_ptr<IPixmatDescriptor> from, to;
    com_ptr<IPixmatLock> reading, writing;
    com_ptr<IPixmatTransfer> pipeline;
    if (failed(src->GetDescriptor(from.put())) || failed(dst->GetDescriptor(to.put())) ||
        failed(src->OpenRead(nullptr, 1.0, reading.put())) || failed(dst->OpenWrite(writing.put())))
        return S_OK;
    HRESULT hr = create<IPixmatConverter>(CLSID_PixmatConverter)
                     ->ConvertCopy(layout_of(from.get()), layout_of(to.get()), pipeline.put());
    if (failed(hr)) return hr;
    uint32_t table[7];
    for (uint32_t& entry : table) entry = in.take<uint32_t>();
    if (in.chance()) {
        const double low = in.real();
        pipeline->SetLookupTable(table, static_cast<LONG>(in.pick(8)), low, in.real());
    }
    if (in.chance()) pipeline->SetContrast(in.real());
    if (in.chance()) pipeline->SetBrightness(in.real());
    if (in.chance()) pipeline->SetGamma(in.real());
    if (in.chance()) pipeline->SetSigma(in.real());
    return pipeline->Run(reading->Data(0), writing->Data(0), nullptr, nullptr);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    static const facets f;
    input in(data, size);
    const stage s(in);
    for (int step = 0; step < 8 && !in.empty(); ++step) {
        const auto before = s.contents();
        HRESULT hr = S_OK;
        switch (in.pick(5)) {
        case 0: hr = convert(f, s, in); break;
        case 1: hr = correct(f, s, in); break;
        case 2: hr = measure(f, s, in); break;
        case 3: hr = calculate(f, s, in); break;
        default: hr = transfer(s, in);
        }
        require(hr == S_OK || (failed(hr) && s.contents() == before));
        require(hr != E_OUTOFMEMORY &&
                hr != E_UNEXPECTED); // everything is small, and every failure has its own code
    }
    return 0;
}
