// zelt list: every facet and method, one line each.
#include "commands.h"
#include "facets.h"

#include <iostream>

namespace cli {
namespace {

void list(const std::string& only)
{
    const library lib;
    std::vector<std::string> names = lib.facet_names();
    if (!only.empty()) names = {lib.find_facet(only).name};
    for (const std::string& name : names) {
        const facet f = lib.find_facet(name);
        std::cout << f.name << ": " << f.table->help << '\n';
        const method_info* before = nullptr;
        for (const method_info& m : f.table->methods) {
            const bool second_half =
                before && same_name(before->name, m.name); // a property's put after its get
            before = &m;
            if (second_half) continue;
            std::string full = f.name + "." + m.name;
            full.resize(std::max<size_t>(full.size() + 1, 40), ' ');
            std::cout << "  " << full << m.help << '\n';
        }
    }
}

const command_registration registered(10, [](CLI::App& app) {
    CLI::App* command = app.add_subcommand("list", "facets and their methods, one line each");
    auto only = std::make_shared<std::string>();
    command->add_option("FACET", *only, "this facet only");
    command->callback([only] { list(*only); });
});

} // namespace
} // namespace cli
