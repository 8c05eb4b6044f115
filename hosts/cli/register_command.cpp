// zelt register, zelt unregister: whether hosts find the library by the names of its classes.
#include "commands.h"

#include <zelt/module.h>
#include <zelt/zelt.h>

namespace cli {
namespace {

const command_registration registered(90, [](CLI::App& app) {
    app.add_subcommand("register",
                       "let component hosts find the library by name: for the user, as root for the machine")
        ->callback([] { zelt::check(DllRegisterServer()); });
    app.add_subcommand("unregister", "undo register")->callback([] { zelt::check(DllUnregisterServer()); });
});

} // namespace
} // namespace cli
