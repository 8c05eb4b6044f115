// Writing and removing the registration record that zelt/module_record.h describes.
#pragma once

#include <string>

namespace Qor::Luxar::ZELT {

/// Where this process registers: for the machine as root without XDG_DATA_HOME, else for the user. Throws
/// HResultException when the user has no data folder.
std::string record_to_write();

/// Puts a file in place of an older one, whole or not at all. Makes missing folders.
void replace_file(const std::string& name, const std::string& content);

/// Removes a file if there is one.
void remove_file(const std::string& name);

} // namespace Qor::Luxar::ZELT
