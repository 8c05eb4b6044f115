// zelt help: a facet or a method as its interface table describes it.
#include "commands.h"
#include "facets.h"
#include "value_text.h"

#include <iostream>
#include <sstream>

using namespace Qor;

namespace cli {
namespace {

std::string default_of(const argument_info& a)
{
    if (a.interface_id || a.type == VT_VARIANT) return "none";
    if (a.enumeration)
        for (const enumeration_value& v : a.enumeration->values)
            if (v.value == a.default_number) return v.name;
    if (a.type == VT_BOOL) return a.default_number != 0 ? "true" : "false";
    return number_text(a.default_number);
}

const char* result_of(const method_info& m)
{
    for (const argument_info& a : m.arguments)
        if (a.way == direction::result) return a.type_name;
    return nullptr;
}

std::string signature(const facet& f, const method_info& m)
{
    std::string text = f.name + "." + m.name;
    if (m.kind != DISPATCH_METHOD) return text;
    text += '(';
    const char* separator = "";
    for (const argument_info* a : inputs_of(m)) {
        text += separator;
        text += a->optional ? std::string("[") + a->name + "]" : a->name;
        separator = ", ";
    }
    text += ')';
    if (const char* type = result_of(m)) text += std::string(" -> ") + type;
    return text;
}

/// How a value of the argument's type is written on the command line.
std::string how_to_write(const argument_info& a)
{
    const std::string type = a.type_name;
    if (type == "IPixmat2") return "image file";
    if (type == "IRectangle") return "left,top,right,bottom (the last two exclusive)";
    if (type == "ICoordinateInt" || type == "ICoordinateFloat" || type == "IFloatVector2D") return "x,y";
    if (type == "ISizeInt") return "width,height";
    if (type == "IRangeFloat") return "low,high";
    if (type == "IComplex") return "re,im";
    if (type == "IPixmatDescriptor") return "WIDTHxHEIGHT:ENCODING:BITS";
    if (type == "IDoubleProfile") return "numbers: 1,2,3 or @FILE";
    if (type == "ILookupTable") return "low,high,colour,colour... or @FILE";
    if (a.type == VT_VARIANT) return "number, image file, re,im or [array]";
    if (a.type & VT_ARRAY) return "numbers: 1,2,3 or 1,2;3,4 or @FILE";
    return "";
}

void describe_argument(const argument_info& a, bool optional_marked)
{
    std::string line = "  " + std::string(a.name);
    line.resize(std::max<size_t>(line.size() + 2, 24), ' ');
    line += a.type_name;
    if (optional_marked && a.optional) line += ", optional, default " + default_of(a);
    if (const std::string how = how_to_write(a); a.way == direction::in && !how.empty()) line += "; " + how;
    std::cout << line << '\n';
    if (!a.enumeration) return;
    for (const enumeration_value& v : a.enumeration->values)
        std::cout << std::string(26, ' ') << v.name << " = " << v.value << '\n';
}

/// The words of a text in lines of at most `width` letters, each with a margin on its left.
std::string wrapped(const std::string& text, size_t margin, size_t width)
{
    std::istringstream words(text);
    std::string lines, line, word;
    while (words >> word) {
        if (!line.empty() && margin + line.size() + 1 + word.size() > width) {
            lines += std::string(margin, ' ') + line + '\n';
            line.clear();
        }
        line += (line.empty() ? "" : " ") + word;
    }
    return lines + std::string(margin, ' ') + line + '\n';
}

void help_method(const facet& f, const method_info& m)
{
    std::cout << signature(f, m) << "\n  " << m.help << '\n';
    if (m.pixels) std::cout << "\nPixels:\n" << wrapped(m.pixels, 2, 100);
    if (m.kind == DISPATCH_PROPERTYGET) {
        bool writable = false;
        for (const method_info& other : f.table->methods)
            writable = writable || (other.kind == DISPATCH_PROPERTYPUT && same_name(other.name, m.name));
        std::cout << "\nA property"
                  << (writable ? "; set it for a call with --set " + std::string(m.name) + "=VALUE" : "")
                  << ".\n";
    }
    if (!inputs_of(m).empty()) std::cout << "\nArguments:\n";
    for (const argument_info* a : inputs_of(m)) describe_argument(*a, true);
    bool first = true;
    for (const argument_info& a : m.arguments) {
        if (a.way == direction::in) continue;
        if (std::exchange(first, false)) std::cout << "\nResults:\n";
        describe_argument(a, false);
    }
}

void help_facet(const facet& f)
{
    std::cout << f.name << " (" << f.table->name << "): " << f.table->help << "\n\n";
    const method_info* before = nullptr;
    for (const method_info& m : f.table->methods) {
        if (!before || !same_name(before->name, m.name))
            std::cout << signature(f, m) << "\n  " << m.help << '\n';
        before = &m;
    }
}

void help(const std::string& name, const CLI::App& app)
{
    if (name.empty()) {
        std::cout << app.help();
        return;
    }
    for (const CLI::App* command : app.get_subcommands({}))
        if (command->get_name() == name) {
            std::cout << command->help("zelt");
            return;
        }
    const library lib;
    const qualified_name q = split_name(name);
    const facet f = lib.find_facet(q.facet);
    q.method.empty() ? help_facet(f) : help_method(f, find_method(f, q.method));
}

const command_registration registered(20, [](CLI::App& app) {
    CLI::App* command =
        app.add_subcommand("help", "a command, a facet or a method, with arguments and defaults");
    auto name = std::make_shared<std::string>();
    command->add_option("NAME", *name, "a command, Facet or Facet.Method");
    command->callback([name, &app] { help(*name, app); });
});

} // namespace
} // namespace cli
