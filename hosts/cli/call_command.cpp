// zelt call: any method of any facet, by name, once for each frame of its images.
#include "argument_text.h"
#include "commands.h"
#include "failure.h"
#include "value_text.h"

#include <algorithm>
#include <iostream>
#include <optional>

using namespace Qor;
using namespace Qor::Luxar;

namespace cli {
namespace {

struct call_options {
    std::string name;
    std::string output;
    std::string rounding;
    std::vector<std::string> named;
    std::vector<std::string> properties;
    read_options reading;
    bool json = false;
};

/// "NAME=VALUE", taken apart.
std::pair<std::string, std::string> split_assignment(const std::string& text)
{
    const size_t equal = text.find('=');
    if (equal == std::string::npos || equal == 0) throw usage_error("'" + text + "' is not NAME=VALUE");
    return {text.substr(0, equal), text.substr(equal + 1)};
}

/// Texts of the arguments in the order of the method; those left out are empty.
class given_texts {
public:
    given_texts(const method_info& method, std::string full_name)
        : inputs_(inputs_of(method)), texts_(inputs_.size()), name_(std::move(full_name))
    {
    }

    void add_positional(const std::string& text)
    {
        if (next_ == inputs_.size())
            throw usage_error(name_ + " takes " + std::to_string(inputs_.size()) + " arguments, '" + text +
                              "' is one more" + hint());
        set(next_++, text);
    }
    void add_named(const std::string& name, const std::string& text)
    {
        for (size_t i = 0; i < inputs_.size(); ++i)
            if (same_name(inputs_[i]->name, name) || same_name(short_name(inputs_[i]->name), name)) {
                set(i, text);
                return;
            }
        std::vector<std::string> known;
        for (const argument_info* a : inputs_) known.push_back(short_name(a->name));
        throw usage_error(name_ + " has no argument '" + name + "'" + near_misses(name, known) + hint());
    }

    void check_complete() const
    {
        for (size_t i = 0; i < inputs_.size(); ++i)
            if (!inputs_[i]->optional && (!texts_[i] || *texts_[i] == "-"))
                throw usage_error(name_ + " needs " + inputs_[i]->name + " (" + inputs_[i]->type_name + ")" +
                                  hint());
    }

    /// Values for the call; null where an optional argument is left out.
    std::vector<std::unique_ptr<argument_source>> sources(const read_options& options) const
    {
        std::vector<std::unique_ptr<argument_source>> all(inputs_.size());
        for (size_t i = 0; i < inputs_.size(); ++i)
            if (texts_[i] && *texts_[i] != "-") all[i] = parse_argument(*inputs_[i], *texts_[i], options);
        return all;
    }

private:
    std::string hint() const { return " (zelt help " + name_ + ")"; }

    /// Without the marks of type in front: pIArea is area too.
    static std::string short_name(const std::string& name)
    {
        for (const std::string mark : {"pI", "p"})
            if (name.size() > mark.size() && name.starts_with(mark) &&
                std::isupper(static_cast<unsigned char>(name[mark.size()])))
                return name.substr(mark.size());
        return name;
    }

    void set(size_t i, const std::string& text)
    {
        if (texts_[i]) throw usage_error(name_ + ": " + inputs_[i]->name + " is given twice");
        texts_[i] = text;
    }

    std::vector<const argument_info*> inputs_;
    std::vector<std::optional<std::string>> texts_;
    std::string name_;
    size_t next_ = 0;
};

/// Sets a property of an object by name, as a method call of its put.
void set_property(const facet& f, const std::string& name, const std::string& text)
{
    find_method(f, name); // names what is near when there is none
    for (const method_info& m : f.table->methods) {
        if (m.kind != DISPATCH_PROPERTYPUT || !same_name(m.name, name) || m.arguments.size() != 1) continue;
        std::vector<variant> values;
        values.push_back(parse_value(m.arguments[0], text));
        call_late(f.object.get(), m, values);
        return;
    }
    throw usage_error(f.name + "." + name + " is not a property that can be set");
}

class call {
public:
    explicit call(const call_options& options) : options_(options)
    {
        const qualified_name q = split_name(options.name);
        if (q.method.empty())
            throw usage_error("'" + options.name + "' is not Facet.Method (zelt list " + q.facet +
                              " shows what there is)");
        facet_ = lib_.find_facet(q.facet);
        method_ = &find_method(facet_, q.method);
        name_ = facet_.name + "." + method_->name;
    }

    void run(const std::vector<std::string>& rest)
    {
        given_texts texts(*method_, name_);
        take(rest, texts);
        texts.check_complete();
        check_output();
        sources_ = texts.sources(options_.reading);
        int frames = 1;
        for (const auto& source : sources_)
            if (source && source->frames() > 1) {
                if (frames > 1 && frames != source->frames())
                    throw failure(name_ + ": the stacks have " + std::to_string(frames) + " and " +
                                  std::to_string(source->frames()) + " pages");
                frames = source->frames();
            }
        choose_destination();
        set_properties();
        if (!options_.output.empty()) writer_ = create_image(options_.output, frames);
        if (options_.json && frames > 1) std::cout << '[';
        for (int frame = 0; frame < frames; ++frame) run_frame(frame, frames);
        if (options_.json && frames > 1) std::cout << "]\n";
        if (writer_) writer_->finish();
    }

private:
    void take(const std::vector<std::string>& rest, given_texts& texts) const
    {
        for (size_t i = 0; i < rest.size(); ++i) {
            const std::string& word = rest[i];
            if (!word.starts_with("--")) {
                texts.add_positional(word);
                continue;
            }
            const size_t equal = word.find('=');
            if (equal != std::string::npos) {
                texts.add_named(word.substr(2, equal - 2), word.substr(equal + 1));
            } else {
                if (i + 1 == rest.size()) throw usage_error(word + " needs a value");
                texts.add_named(word.substr(2), rest[++i]);
            }
        }
        for (const std::string& text : options_.named) {
            const auto [name, value] = split_assignment(text);
            texts.add_named(name, value);
        }
    }

    const argument_info* image_result() const
    {
        for (const argument_info& a : method_->arguments)
            if (a.way != direction::in && is_image(a)) return &a;
        return nullptr;
    }
    bool has_result() const
    {
        return std::ranges::any_of(method_->arguments,
                                   [](const argument_info& a) { return a.way != direction::in; });
    }
    bool changes_image() const { return !has_result() && method_->takes_image; }

    void check_output() const
    {
        const bool makes_image = image_result() || changes_image();
        if (makes_image && options_.output.empty())
            throw usage_error(name_ + " makes an image: give it a file with -o");
        if (!makes_image && !options_.output.empty())
            throw usage_error(name_ + " makes no image, so there is nothing for -o");
    }

    /// Of a method that has no image result: the argument whose pixels it sets.
    void choose_destination()
    {
        if (!changes_image()) return;
        const auto inputs = inputs_of(*method_);
        const auto find = [&](auto&& wanted) {
            for (size_t i = 0; i < inputs.size(); ++i)
                if (is_image(*inputs[i]) && sources_[i] && wanted(i)) return static_cast<int>(i);
            return -1;
        };
        destination_ = find([&](size_t i) { return sources_[i]->is_destination(); });
        const auto named = [&](const char* part) {
            return find([&](size_t i) {
                return std::string_view(inputs[i]->name).find(part) != std::string_view::npos;
            });
        };
        if (destination_ < 0) destination_ = named("Dst");
        if (destination_ < 0) destination_ = named("Out");
        if (destination_ < 0) destination_ = find([](size_t) { return true; });
        if (destination_ >= 0) sources_[static_cast<size_t>(destination_)]->will_change();
    }

    void set_properties()
    {
        if (!options_.rounding.empty()) {
            const facet root{"ZELT2", com_ptr<IDispatch>(lib_.root()), table_of(lib_.root())};
            set_property(root, "Rounding", options_.rounding);
        }
        for (const std::string& text : options_.properties) {
            const auto [name, value] = split_assignment(text);
            set_property(facet_, name, value);
        }
    }

    void run_frame(int frame, int frames)
    {
        std::vector<variant> values;
        com_ptr<IPixmat2> image;
        size_t input = 0;
        for (const argument_info& a : method_->arguments) {
            if (a.way == direction::result) continue;
            if (a.way == direction::out) {
                values.emplace_back();
                continue;
            }
            const auto& source = sources_[input];
            values.push_back(source ? source->value(frame) : variant::attach(missing_argument()));
            if (static_cast<int>(input) == destination_) image = query<IPixmat2>(values.back()->punkVal);
            ++input;
        }
        variant result;
        try {
            result = call_late(facet_.object.get(), *method_, values);
        } catch (zelt::error& e) {
            if (frames > 1)
                throw zelt::error(e.hresult, "page " + std::to_string(frame + 1) + ": " + message_of(e));
            throw;
        }
        show(values, result, frame, image);
        if (!writer_) return;
        if (!image) throw failure(name_ + " made no image");
        writer_->add(image.get());
    }

    /// Prints the results in the order of the method and picks the image among them out.
    void show(std::vector<variant>& values, variant& result, int frame, com_ptr<IPixmat2>& image) const
    {
        std::vector<std::pair<const argument_info*, const variant*>> shown;
        size_t place = 0;
        for (const argument_info& a : method_->arguments) {
            const variant* value = a.way == direction::result ? &result : &values[place++];
            if (a.way == direction::in) continue;
            if (is_image(a))
                image = query<IPixmat2>((*value)->punkVal);
            else
                shown.emplace_back(&a, value);
        }
        if (shown.empty()) return;
        if (options_.json) {
            if (frame > 0) std::cout << ",\n";
            if (shown.size() == 1)
                std::cout << value_json(*shown[0].second->get());
            else
                for (size_t i = 0; i < shown.size(); ++i)
                    std::cout << (i == 0 ? "{" : ", ") << json_string(shown[i].first->name) << ": "
                              << value_json(*shown[i].second->get()) << (i + 1 == shown.size() ? "}" : "");
            if (sources_frames() == 1) std::cout << '\n';
            return;
        }
        for (const auto& [a, value] : shown)
            std::cout << (shown.size() > 1 ? std::string(a->name) + ": " : std::string())
                      << value_text(*value->get()) << '\n';
    }

    int sources_frames() const
    {
        int most = 1;
        for (const auto& source : sources_)
            if (source) most = std::max(most, source->frames());
        return most;
    }

    const call_options& options_;
    library lib_;
    facet facet_;
    const method_info* method_ = nullptr;
    std::string name_;
    std::vector<std::unique_ptr<argument_source>> sources_;
    int destination_ = -1;
    std::unique_ptr<frame_writer> writer_;
};

constexpr char arguments_help[] =
    R"(Arguments stand in the order of `zelt help Facet.Method`, or are named: --sigma 2 (pIArea is --area too).
  -                      leaves an optional argument out
  frame.tif, stack.tif:3 an image; a stack without a page runs the method on each page
  new:640x480:Float:32   a new image to be written to; copy:FILE a copy of a file for the same
  3, 0.5, 3:VT_UI2, 1,-2 numbers; with a forced type; complex
  0,0,64,64  3,4         rectangles (right and bottom exclusive), points, sizes, ranges
  [1,2,1;2,4,2;1,2,1]    arrays, @FILE reads one
  Saturate, Less|Equal   values of enumerations
Examples:
  zelt call Statistics.Mean frame.tif --area 0,0,100,100
  zelt call Basic.Add a.tif b.tif -o sum.tif --rounding saturate
  zelt call Conversions.Recode new:640x480:Unsigned:8 frame.tif -o bytes.png)";

const command_registration registered(30, [](CLI::App& app) {
    CLI::App* command =
        app.add_subcommand("call", "any method on image files: zelt call Facet.Method ARGUMENTS...");
    auto o = std::make_shared<call_options>();
    command->allow_extras();
    command->add_option("-o,--output", o->output, "file for the image that the method makes")
        ->type_name("FILE");
    command->add_option("--bits", o->reading.bits, "nominal depth of the 16-bit images")
        ->check(CLI::Range(9, 16));
    command->add_option("--page", o->reading.page, "page of files that have several, from 1")
        ->check(CLI::Range(1, most_frames));
    command->add_option("--rounding", o->rounding, "fastest, wrap (without it) or saturate")
        ->type_name("MODE");
    command->add_option("--set", o->properties, "sets a property of the facet first")
        ->type_name("NAME=VALUE")
        ->expected(1)
        ->take_all();
    command->add_option("--arg", o->named, "an argument called like an option of this command")
        ->type_name("NAME=VALUE")
        ->expected(1)
        ->take_all();
    command->add_flag("--json", o->json, "results as JSON");
    command->footer(arguments_help);
    command->callback([o, command] {
        std::vector<std::string> rest = command->remaining();
        if (rest.empty()) throw usage_error("call needs Facet.Method (zelt call --help tells more)");
        o->name = rest.front();
        rest.erase(rest.begin());
        call(*o).run(rest);
    });
});

} // namespace
} // namespace cli
