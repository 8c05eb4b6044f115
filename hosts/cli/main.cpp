// The program `zelt`: exit status 0, 1 when the work failed, 2 when the command was not understood.
#include "commands.h"
#include "facets.h"
#include "failure.h"
#include "image_pixels.h"
#include "output_file.h"

#include <algorithm>
#include <csignal>
#include <cstdio>
#include <iostream>
#include <unistd.h>

namespace cli {
namespace {

command_registration* first_command = nullptr;

constexpr char examples[] = R"(Examples:
  zelt list                                           what can be called
  zelt help FlatFielding.Flatten                      one method: arguments, defaults, values
  zelt call Basic.Multiply frame.tif 1.5 -o brighter.tif
  zelt call Basic.Subtract frame.fits dark.fits -o clean.fits --rounding saturate
  zelt call Statistics.CenterOfGravity star.tif --json
  zelt stats stack.tif:1 stack.tif:2 --area 0,0,100,100
Images are TIFF, PNG or FITS files. 'stack.tif:3' is the third page of a file, without a page all are meant.)";

int say(const char* message, int status)
{
    std::cout.flush();
    std::fprintf(stderr, "zelt: %s\n", message);
    return status;
}

std::string with_code(const zelt::error& e)
{
    char code[16];
    std::snprintf(code, sizeof code, "0x%08X", static_cast<unsigned>(e.hresult));
    return message_of(e) + " (code " + code + ")";
}

/// Integer division by a pixel that is 0 ends in a fault of the processor; here it ends with a message.
extern "C" void on_divide_fault(int)
{
    constexpr char text[] = "zelt: integer division by zero: a pixel or number that divides is 0\n";
    if (write(STDERR_FILENO, text, sizeof text - 1) < 0) _exit(1);
    _exit(1);
}

/// A misspelt command is told as one.
void require_command(const CLI::App& app, const std::string& name)
{
    std::vector<std::string> known;
    for (const CLI::App* command : app.get_subcommands({})) known.push_back(command->get_name());
    if (std::ranges::find(known, name) == known.end())
        throw usage_error("there is no command '" + name + "'" + near_misses(name, known) +
                          " (zelt --help tells more)");
}

int run(int argc, char** argv)
{
    CLI::App app("Image processing for instruments, from the command line.", "zelt");
    app.set_version_flag("--version", "zelt " ZELT_VERSION);
    app.footer(examples);
    app.require_subcommand(1);
    app.get_formatter()->column_width(28);
    command_registration::add_all(app);
    if (argc > 1 && argv[1][0] != '-') require_command(app, argv[1]);
    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError& e) {
        if (e.get_exit_code() == 0) return app.exit(e);
        return say((std::string(e.what()) + " (zelt --help tells more)").c_str(), 2);
    }
    return 0;
}

} // namespace

command_registration::command_registration(int place, void (*add)(CLI::App&)) noexcept
    : place_(place), add_(add)
{
    command_registration** link = &first_command;
    while (*link && (*link)->place_ <= place_) link = &(*link)->next_;
    next_ = *link;
    *link = this;
}

void command_registration::add_all(CLI::App& app)
{
    for (const command_registration* c = first_command; c; c = c->next_) c->add_(app);
}

} // namespace cli

int main(int argc, char** argv)
{
    using namespace cli;
    remove_unfinished_output_on_signals();
    std::signal(SIGFPE, on_divide_fault);
    int status = 0;
    try {
        status = run(argc, argv);
    } catch (const usage_error& e) {
        status = say(e.what(), 2);
    } catch (const zelt::error& e) {
        status = say(with_code(e).c_str(), 1);
    } catch (const std::bad_alloc&) {
        status = say("there is not enough memory", 1);
    } catch (const std::exception& e) {
        status = say(e.what(), 1);
    }
    std::cout.flush();
    if (!std::cout && status == 0) status = say("the output cannot be written", 1);
    return status;
}
