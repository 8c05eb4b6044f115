// The library by name: facets, their methods as the interface tables describe them, and late-bound calls.
#pragma once

#include "common/interfaces.h"

#include <span>
#include <string>
#include <vector>

namespace cli {

using Qor::argument_info;
using Qor::com_ptr;
using Qor::IDispatch;
using Qor::interface_info;
using Qor::method_info;

using host::inputs_of;
using host::is_image;
using host::table_of;

struct facet {
    std::string name;
    com_ptr<IDispatch> object;
    const interface_info* table;
};

/// The root object and what it offers.
class library {
public:
    library();

    IDispatch* root() const noexcept { return root_.get(); }
    std::vector<std::string> facet_names() const;
    /// Case does not matter. usage_error with names that are near for an unknown one.
    facet find_facet(const std::string& name) const;

private:
    com_ptr<IDispatch> root_;
    const interface_info* table_;
};

/// "Facet.Method", taken apart; `method` is empty for a facet alone.
struct qualified_name {
    std::string facet;
    std::string method;
};
qualified_name split_name(const std::string& text);

/// A row of the table, the get of a property before its put. usage_error with names that are near.
const method_info& find_method(const facet& f, const std::string& name);

bool same_name(const std::string& a, const std::string& b);

/// ": did you mean A or B?", or empty when nothing is near.
std::string near_misses(const std::string& name, std::span<const std::string> known);

/// Of an object that is called, by name and through IDispatch, as a script would: values for all arguments but the
/// result, in order. Places of out arguments are filled. A zero divisor of whole numbers is refused. Throws zelt::error.
Qor::variant call_late(IDispatch* object, const method_info& method, std::vector<Qor::variant>& values);

/// Reads a property without arguments.
Qor::variant get_late(IDispatch* object, const method_info& property);

} // namespace cli
