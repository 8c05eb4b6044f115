// Arguments as they are typed, turned into the values that a method takes. What cannot be one is a usage_error that
// names the argument.
#pragma once

#include "facets.h"
#include "image_file.h"

#include <memory>

namespace cli {

/// Gives an argument's value for each frame of a call.
class argument_source {
public:
    virtual ~argument_source() = default;
    /// More than 1 for a stack.
    virtual int frames() const { return 1; }
    virtual Qor::variant value(int frame) = 0;
    /// Typed as new:... or copy:..., so meant to be written to.
    virtual bool is_destination() const { return false; }
    /// The image is written to: each frame needs its own.
    virtual void will_change() {}
};

std::unique_ptr<argument_source> parse_argument(const argument_info& a, const std::string& text,
                                                const read_options& options);

/// A value that is no image, for a property.
Qor::variant parse_value(const argument_info& a, const std::string& text);

/// "left,top,right,bottom".
Qor::Luxar::rectangle parse_rectangle(const std::string& name, const std::string& text);

} // namespace cli
