// How a command joins the program: its source registers a function that adds it. Nothing else lists commands.
//
//     namespace {
//     const cli::command_registration registered(50, [](CLI::App& app) {
//         CLI::App* command = app.add_subcommand("demo", "corrects an example");
//         auto options = std::make_shared<demo_options>();
//         command->add_option("-o", options->output, "...");
//         command->callback([options] { run_demo(*options); });
//     });
//     }
//
// A command reports what went wrong by throwing failure or usage_error (failure.h) or zelt::error.
#pragma once

#include <CLI/CLI.hpp>

namespace cli {

class command_registration {
public:
    /// `place` orders the overview in the help; commands of one place stand as they are linked.
    command_registration(int place, void (*add)(CLI::App&)) noexcept;
    command_registration(const command_registration&) = delete;
    command_registration& operator=(const command_registration&) = delete;

    static void add_all(CLI::App& app);

private:
    int place_;
    void (*add_)(CLI::App&);
    command_registration* next_ = nullptr;
};

} // namespace cli
