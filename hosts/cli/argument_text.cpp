#include "argument_text.h"

#include "array_text.h"
#include "common/value_objects.h"
#include "failure.h"
#include "number_text.h"

#include <algorithm>
#include <optional>
#include <sys/stat.h>

using namespace Qor;
using namespace Qor::Luxar;

namespace cli {
namespace {

[[noreturn]] void refuse(const argument_info& a, const std::string& text, const std::string& why)
{
    throw usage_error(std::string(a.name) + " '" + text + "' " + why);
}

class constant_source final : public argument_source {
public:
    explicit constant_source(variant value) : value_(std::move(value)) {}
    variant value(int) override { return value_; }

private:
    variant value_;
};

class file_source final : public argument_source {
public:
    file_source(const std::string& name, const read_options& options, bool destination)
        : reader_(open_image(name, options)), destination_(destination), keeps_(!destination)
    {
    }
    int frames() const override { return reader_->count(); }
    bool is_destination() const override { return destination_; }
    void will_change() override { keeps_ = false; }
    variant value(int frame) override
    {
        if (kept_) return variant(kept_.get());
        const com_ptr<IPixmat2> image = reader_->read(frames() > 1 ? frame : 0);
        if (keeps_ && frames() == 1) kept_ = image;
        return variant(image.get());
    }

private:
    std::unique_ptr<frame_reader> reader_;
    bool destination_;
    bool keeps_;
    com_ptr<IPixmat2> kept_;
};

class new_image_source final : public argument_source {
public:
    explicit new_image_source(const image_layout& layout) : layout_(layout) {}
    bool is_destination() const override { return true; }
    variant value(int) override
    {
        return variant(zelt::new_image(layout_.width, layout_.height, layout_.bits, layout_.encoding).get());
    }

private:
    image_layout layout_;
};

/// "640x480:Unsigned:16".
image_layout parse_layout(const argument_info& a, const std::string& text)
{
    const auto wrong = [&] {
        refuse(a, text, "is not WIDTHxHEIGHT:ENCODING:BITS, as in 640x480:Unsigned:16");
    };
    const size_t x = text.find('x');
    const size_t colon = text.find(':');
    const size_t last = text.rfind(':');
    if (x == std::string::npos || colon == std::string::npos || colon < x || last == colon) wrong();
    const auto number = [&](const std::string& part) {
        const auto n = parse_integer(part);
        if (!n || *n < 1 || *n > INT32_MAX) wrong();
        return static_cast<int32_t>(*n);
    };
    const std::string name = text.substr(colon + 1, last - colon - 1);
    PixmatEncoding encoding = PixmatEncoding_Unsigned;
    if (!find_encoding(name, &encoding)) refuse(a, text, "has no encoding '" + name + "'");
    return packed_layout(number(text.substr(0, x)), number(text.substr(x + 1, colon - x - 1)),
                         number(text.substr(last + 1)), encoding);
}

std::unique_ptr<argument_source> parse_image(const argument_info& a, const std::string& text,
                                             const read_options& options)
{
    if (text.starts_with("new:")) return std::make_unique<new_image_source>(parse_layout(a, text.substr(4)));
    const bool copy = text.starts_with("copy:");
    return std::make_unique<file_source>(copy ? text.substr(5) : text, options, copy);
}

/// By name, with or without its prefix, or by number; several joined by '|'.
variant parse_enumeration(const argument_info& a, const std::string& text)
{
    int64_t sum = 0;
    for (const std::string& part : split(text, '|')) {
        if (const auto number = parse_integer(part)) {
            sum |= *number;
            continue;
        }
        const auto& values = a.enumeration->values;
        const auto found = std::ranges::find_if(values, [&](const enumeration_value& v) {
            const std::string name = v.name;
            if (same_name(name, part)) return true;
            const size_t start = name.size() - std::min(name.size(), part.size());
            return start > 0 && name[start - 1] == '_' && same_name(name.substr(start), part);
        });
        if (found == values.end()) {
            std::string known;
            for (const enumeration_value& v : values)
                known += (known.empty() ? "" : ", ") + std::string(v.name);
            refuse(a, text, "is none of " + known);
        }
        sum |= found->value;
    }
    if (sum < INT32_MIN || sum > INT32_MAX) refuse(a, text, "is out of range");
    return variant(static_cast<int32_t>(sum));
}

variant parse_plain(const argument_info& a, const std::string& text)
{
    if (a.type == VT_BSTR) return variant(widen(text).c_str());
    if (a.type == VT_BOOL) {
        for (const char* yes : {"true", "yes", "1", "-1"})
            if (same_name(text, yes)) return variant(true);
        for (const char* no : {"false", "no", "0"})
            if (same_name(text, no)) return variant(false);
        refuse(a, text, "is neither true nor false");
    }
    variant value;
    if (const auto type = find_type(text)) // an element type such as VT_R8 is a number too
        value = variant(static_cast<int32_t>(*type));
    else if (const auto number = parse_number(text))
        value = *number;
    else
        refuse(a, text, "is not a number");
    const bool whole = a.type != VT_R4 && a.type != VT_R8;
    if (whole && value.type() == VT_R8) refuse(a, text, "is not a whole number");
    if (failed(VariantChangeType(value.get(), value.get(), 0, a.type))) refuse(a, text, "is out of range");
    return value;
}

variant parse_object(const argument_info& a, const std::string& text)
{
    const std::string type = a.type_name;
    const auto numbers = [&](size_t count, const char* form) {
        const auto list = parse_numbers(text);
        if (!list || list->size() != count) refuse(a, text, std::string("is not ") + form);
        return *list;
    };
    const auto integer = [&](double n) {
        if (n != static_cast<double>(static_cast<int64_t>(n)) || n < INT32_MIN || n > INT32_MAX)
            refuse(a, text, "wants whole numbers");
        return static_cast<int32_t>(n);
    };
    const auto make = [](const auto& object) { return variant(static_cast<IDispatch*>(object.get())); };
    if (type == "IRectangle") {
        const rectangle r = parse_rectangle(a.name, text);
        return make(zelt::make_rectangle(r.left, r.top, r.right, r.bottom));
    }
    if (type == "ICoordinateInt") {
        const auto n = numbers(2, "x,y");
        return make(zelt::make_point(integer(n[0]), integer(n[1])));
    }
    if (type == "ICoordinateFloat") {
        const auto n = numbers(2, "x,y");
        return make(zelt::make_float_point(n[0], n[1]));
    }
    if (type == "IFloatVector2D") {
        const auto n = numbers(2, "x,y");
        com_ptr<IFloatVector2D> vector;
        zelt::check(Common::MakeFloatVector2D(n[0], n[1], vector.put()));
        return make(vector);
    }
    if (type == "ISizeInt") {
        const auto n = numbers(2, "width,height");
        return make(host::make_size(integer(n[0]), integer(n[1])));
    }
    if (type == "IRangeFloat") {
        const auto n = numbers(2, "low,high");
        return make(host::make_range(n[0], n[1]));
    }
    if (type == "IComplex") {
        const auto value = parse_complex(text);
        if (!value) refuse(a, text, "is not re,im");
        return make(host::make_complex(*value));
    }
    if (type == "IPixmatDescriptor") return make(host::make_descriptor(parse_layout(a, text)));
    if (type == "ILookupTable") {
        const auto list = text.starts_with('@') ? numbers_of_file(text.substr(1)) : parse_numbers(text);
        if (!list || list->size() < 3) refuse(a, text, "is not low,high,colour,colour...");
        try {
            return make(host::make_lookup_table(*list));
        } catch (const std::invalid_argument& e) {
            throw usage_error(std::string(e.what()) + ", or #rrggbb");
        }
    }
    refuse(a, text, "cannot be given: a " + type + " has no form for the command line");
}

/// A number, a complex number, an array; nothing for anything else, which may be the name of a file.
std::optional<variant> parse_operand(const argument_info& a, const std::string& text)
{
    if (text.starts_with('[') || text.starts_with('@')) return parse_array(a.name, text, VT_R8);
    if (same_name(text, "true") || same_name(text, "false")) return variant(same_name(text, "true"));
    const size_t colon = text.rfind(':');
    if (colon != std::string::npos)
        if (const auto type = find_type(text.substr(colon + 1)))
            if (const auto number = parse_number(text.substr(0, colon))) {
                const bool whole = *type != VT_R4 && *type != VT_R8;
                variant value = *number;
                if ((whole && value.type() == VT_R8) ||
                    failed(VariantChangeType(value.get(), value.get(), 0, *type)))
                    refuse(a, text, "does not fit its type");
                return value;
            }
    if (auto number = parse_number(text)) return std::move(*number);
    if (const auto complex = parse_complex(text))
        return variant(static_cast<IDispatch*>(host::make_complex(*complex).get()));
    return {};
}

} // namespace

rectangle parse_rectangle(const std::string& name, const std::string& text)
{
    const auto list = parse_numbers(text);
    rectangle r;
    int32_t* const sides[] = {&r.left, &r.top, &r.right, &r.bottom};
    bool good = list && list->size() == 4;
    for (size_t i = 0; good && i < 4; ++i) {
        const double n = (*list)[i];
        good = n >= INT32_MIN && n <= INT32_MAX && n == static_cast<int32_t>(n);
        if (good) *sides[i] = static_cast<int32_t>(n);
    }
    if (!good) throw usage_error(name + " '" + text + "' is not left,top,right,bottom");
    return r;
}

variant parse_value(const argument_info& a, const std::string& text)
{
    if (a.enumeration) return parse_enumeration(a, text);
    if (a.interface_id) return parse_object(a, text);
    if (a.type & VT_ARRAY) return parse_array(a.name, text, VT_EMPTY);
    if (a.type != VT_VARIANT) return parse_plain(a, text);
    auto operand = parse_operand(a, text);
    if (!operand) refuse(a, text, "is not a value");
    return std::move(*operand);
}

std::unique_ptr<argument_source> parse_argument(const argument_info& a, const std::string& text,
                                                const read_options& options)
{
    if (is_image(a)) return parse_image(a, text, options);
    if (a.type == VT_VARIANT && !a.interface_id) {
        if (auto operand = parse_operand(a, text))
            return std::make_unique<constant_source>(std::move(*operand));
        return parse_image(a, text, options);
    }
    return std::make_unique<constant_source>(parse_value(a, text));
}

} // namespace cli
