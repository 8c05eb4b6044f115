#include "array_text.h"

#include "common/value_objects.h"
#include "failure.h"
#include "number_text.h"

#include <algorithm>
#include <cstring>
#include <fstream>
#include <sstream>

using namespace Qor;

namespace cli {
namespace {

using rows_of_words = std::vector<std::vector<std::string>>;

/// Numbers stand between commas or blanks. Nothing between two commas is a word, and no number: a gap in a table must not
/// move what follows.
std::vector<std::string> words_of(const std::string& line)
{
    std::vector<std::string> words;
    for (const std::string& part : split(line, ',')) {
        std::istringstream blanks(part);
        const size_t before = words.size();
        for (std::string word; blanks >> word;) words.push_back(word);
        if (words.size() == before) words.emplace_back();
    }
    return words;
}

/// A '#' that starts a line makes it a comment.
rows_of_words rows_of_file(const std::string& path)
{
    std::ifstream file(path);
    if (!file) throw failure(path + ": " + std::strerror(errno));
    rows_of_words rows;
    for (std::string line; std::getline(file, line);)
        if (!line.starts_with('#') && line.find_first_not_of(" \t\r") != line.npos)
            rows.push_back(words_of(line));
    if (file.bad()) throw failure(path + ": cannot be read");
    return rows;
}

rows_of_words rows_of_text(const std::string& text)
{
    rows_of_words rows;
    for (const std::string& row : split(text, ';')) rows.push_back(words_of(row));
    return rows;
}

variant element(const std::string& name, const std::string& word, VARTYPE type)
{
    if (type == VT_DISPATCH) {
        const auto value = parse_complex(word);
        const auto alone = parse_number(word);
        variant real;
        if (!value && alone && succeeded(VariantChangeType(real.put(), alone->get(), 0, VT_R8)))
            return variant(static_cast<IDispatch*>(host::make_complex(real->dblVal).get()));
        if (!value) throw usage_error(name + ": '" + word + "' is not a number");
        return variant(static_cast<IDispatch*>(host::make_complex(*value).get()));
    }
    auto number = parse_number(word);
    if (!number) throw usage_error(name + ": '" + word + "' is not a number");
    const bool cut = number->type() == VT_R8 && type != VT_R4 && type != VT_R8;
    if (cut || failed(VariantChangeType(number->get(), number->get(), 0, type)))
        throw usage_error(name + ": '" + word + "' does not fit the array's type");
    return std::move(*number);
}

VARTYPE type_of(const rows_of_words& rows, VARTYPE type)
{
    bool all_whole = true;
    for (const auto& row : rows)
        for (const std::string& word : row) {
            if (word.ends_with('i') && parse_complex(word)) return VT_DISPATCH;
            all_whole = all_whole && parse_integer(word);
        }
    return type != VT_EMPTY ? type : static_cast<VARTYPE>(all_whole ? VT_I4 : VT_R8);
}

} // namespace

variant parse_array(const std::string& name, const std::string& text, VARTYPE type)
{
    std::string body = text;
    if (const size_t colon = body.rfind(':'); colon != std::string::npos)
        if (const auto given = find_type(body.substr(colon + 1))) {
            type = *given;
            body.resize(colon);
        }
    const bool from_file = body.starts_with('@');
    if (body.starts_with('[') && body.ends_with(']')) body = body.substr(1, body.size() - 2);
    rows_of_words rows = from_file ? rows_of_file(body.substr(1)) : rows_of_text(body);
    if (rows.empty()) throw usage_error(name + " '" + text + "' holds no numbers");
    if (from_file && std::ranges::all_of(rows, [](const auto& row) { return row.size() == 1; })) {
        for (size_t y = 1; y < rows.size(); ++y)
            rows[0].push_back(rows[y][0]); // a list, written down the page
        rows.resize(1);
    }
    const size_t columns = rows[0].size();
    if (std::ranges::any_of(rows, [&](const auto& row) { return row.size() != columns; }))
        throw usage_error(name + " '" + text + "' has rows of different length");

    const bool plane = rows.size() > 1 || body.find(';') != std::string::npos;
    type = type_of(rows, type);
    // The leftmost dimension runs along a row.
    const SAFEARRAYBOUND bounds[] = {{static_cast<uint32_t>(columns), 0},
                                     {static_cast<uint32_t>(rows.size()), 0}};
    safe_array array = safe_array::attach(SafeArrayCreate(type, plane ? 2 : 1, bounds));
    if (!array) throw failure(name + ": the array is too large");
    for (size_t y = 0; y < rows.size(); ++y)
        for (size_t x = 0; x < columns; ++x) {
            const variant value = element(name, rows[y][x], type);
            const int32_t place[] = {static_cast<int32_t>(x), static_cast<int32_t>(y)};
            const void* data =
                type == VT_DISPATCH ? static_cast<const void*>(value->pdispVal) : &value->llVal;
            zelt::check(SafeArrayPutElement(array.get(), place, data));
        }
    VARIANT result = empty_variant();
    result.vt = static_cast<VARTYPE>(VT_ARRAY | type);
    result.parray = array.detach();
    return variant::attach(result);
}

std::optional<std::vector<double>> numbers_of_file(const std::string& path)
{
    std::vector<double> numbers;
    for (const auto& row : rows_of_file(path))
        for (const std::string& word : row) {
            const auto some = parse_numbers(word);
            if (!some) return {};
            numbers.insert(numbers.end(), some->begin(), some->end());
        }
    return numbers;
}

} // namespace cli
