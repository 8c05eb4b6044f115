// zelt stats: the scalar statistics of images side by side.
#include "argument_text.h"
#include "commands.h"
#include "failure.h"
#include "value_text.h"

#include <algorithm>
#include <cmath>
#include <iostream>
#include <optional>

using namespace Qor;
using namespace Qor::Luxar;

namespace cli {
namespace {

struct stats_options {
    std::vector<std::string> files;
    std::string area;
    read_options reading;
    bool json = false;
};

struct line {
    std::string label;
    std::string key;
    variant value;
};

class measure {
public:
    measure() : facet_(lib_.find_facet("Statistics")) {}

    std::vector<line> of(IPixmat2* image, const std::optional<rectangle>& area) const
    {
        const image_layout layout = layout_of(image);
        const rectangle r = area.value_or(rectangle{0, 0, layout.width, layout.height});
        const double pixels = (double{1} * r.right - r.left) * (double{1} * r.bottom - r.top);
        const com_ptr<IRectangle> object =
            area ? zelt::make_rectangle(r.left, r.top, r.right, r.bottom) : nullptr;
        const auto ask = [&](const char* name, bool with_area = true) {
            const method_info& m = find_method(facet_, name);
            std::vector<variant> values(inputs_of(m).size(), variant::attach(missing_argument()));
            values[0] = variant(image);
            if (with_area && object) values[1] = variant(object.get());
            return call_late(facet_.object.get(), m, values);
        };

        // How many pixels have a value: MinimumCount and MaximumCount take the first pixel twice.
        const auto count = [&](const variant& value) {
            const method_info& m = find_method(facet_, "Count");
            std::vector<variant> values(inputs_of(m).size(), variant::attach(missing_argument()));
            values[0] = variant(image);
            values[1] = value;
            if (object) values.back() = variant(object.get());
            return call_late(facet_.object.get(), m, values);
        };

        const variant minimum = ask("Minimum");
        const variant maximum = ask("Maximum");
        const double mean = ask("Mean")->dblVal;
        const double squares = ask("SumSquares")->dblVal;
        const double variance = squares / pixels - mean * mean; // of all pixels, not of a sample
        std::vector<line> lines;
        lines.push_back({"pixel type", "type", variant(widen(format_name(layout)).c_str())});
        lines.push_back({"width", "width", variant(r.right - r.left)});
        lines.push_back({"height", "height", variant(r.bottom - r.top)});
        lines.push_back({"minimum", "minimum", minimum});
        lines.push_back({"  count", "minimum_count", count(minimum)});
        lines.push_back({"  at", "minimum_position", ask("MinimumPosition")});
        lines.push_back({"maximum", "maximum", maximum});
        lines.push_back({"  count", "maximum_count", count(maximum)});
        lines.push_back({"  at", "maximum_position", ask("MaximumPosition")});
        lines.push_back({"mean", "mean", variant(mean)});
        lines.push_back({"standard deviation", "standard_deviation",
                         variant(std::isnan(variance) ? variance : std::sqrt(std::max(variance, 0.0)))});
        lines.push_back({"sum of squares", "sum_of_squares", variant(squares)});
        lines.push_back({"centre of gravity", "centre_of_gravity", ask("CenterOfGravity")});
        lines.push_back({"range from", "range_minimum", ask("RangeMin", false)});
        lines.push_back({"range to", "range_maximum", ask("RangeMax", false)});
        lines.push_back({"all finite", "finite", ask("IsFinite", false)});
        lines.push_back({"has NaN", "nan", ask("IsNaN", false)});
        return lines;
    }

private:
    library lib_;
    facet facet_;
};

struct column {
    std::string file;
    int page; ///< 0 for a file with one image
    std::vector<line> lines;
};

void print_json(const std::vector<column>& columns)
{
    std::cout << '[';
    const char* separator = "";
    for (const column& c : columns) {
        std::cout << separator << "{\"file\": " << json_string(c.file);
        if (c.page) std::cout << ", \"page\": " << c.page;
        for (const line& l : c.lines)
            std::cout << ", " << json_string(l.key) << ": " << value_json(*l.value.get());
        std::cout << '}';
        separator = ",\n ";
    }
    std::cout << "]\n";
}

/// Numbers stand right-aligned under the name of their image.
void print_table(const std::vector<column>& columns)
{
    const size_t rows = columns[0].lines.size() + 1;
    std::vector<std::vector<std::string>> cells(rows);
    cells[0].push_back("");
    for (const line& l : columns[0].lines) cells[&l - columns[0].lines.data() + 1].push_back(l.label);
    for (const column& c : columns) {
        cells[0].push_back(c.file + (c.page ? ":" + std::to_string(c.page) : ""));
        for (size_t i = 0; i < c.lines.size(); ++i)
            cells[i + 1].push_back(value_text(*c.lines[i].value.get()));
    }
    for (const auto& row : cells) {
        std::string text;
        for (size_t c = 0; c < row.size(); ++c) {
            size_t width = 0;
            for (const auto& other : cells) width = std::max(width, other[c].size());
            const std::string blanks(width - row[c].size(), ' ');
            text += c == 0 ? row[c] + blanks : "  " + blanks + row[c];
        }
        std::cout << text << '\n';
    }
}

void stats(const stats_options& options)
{
    std::optional<rectangle> area;
    if (!options.area.empty()) area = parse_rectangle("--area", options.area);
    const measure statistics;
    std::vector<column> columns;
    for (const std::string& name : options.files) {
        const auto reader = open_image(name, options.reading);
        for (int i = 0; i < reader->count(); ++i) {
            const com_ptr<IPixmat2> image = reader->read(i);
            try {
                columns.push_back({name, reader->count() > 1 ? i + 1 : 0, statistics.of(image.get(), area)});
            } catch (const zelt::error& e) {
                throw zelt::error(e.hresult, name + ": " + message_of(e));
            }
        }
    }
    options.json ? print_json(columns) : print_table(columns);
}

const command_registration registered(40, [](CLI::App& app) {
    CLI::App* command =
        app.add_subcommand("stats", "minimum, maximum, mean and their kin of images, side by side");
    auto o = std::make_shared<stats_options>();
    command->add_option("IMAGE", o->files, "image files; a stack gives a column for each page")->required();
    command->add_option("--area", o->area, "this rectangle only; right and bottom exclusive")
        ->type_name("L,T,R,B");
    command->add_option("--bits", o->reading.bits, "nominal depth of the 16-bit images")
        ->check(CLI::Range(9, 16));
    command->add_option("--page", o->reading.page, "page of files that have several, from 1")
        ->check(CLI::Range(1, most_frames));
    command->add_flag("--json", o->json, "as JSON");
    command->footer("Example:\n  zelt stats frame.tif dark.tif --area 0,0,100,100");
    command->callback([o] { stats(*o); });
});

} // namespace
} // namespace cli
