// zelt copy: images into another file, pixels as they are: a change of format, pages picked out, stacks put together.
#include "commands.h"
#include "image_file.h"

namespace cli {
namespace {

struct copy_options {
    std::vector<std::string> files;
    std::string output;
    read_options reading;
};

void copy(const copy_options& options)
{
    std::vector<std::unique_ptr<frame_reader>> readers;
    int frames = 0;
    for (const std::string& name : options.files) {
        readers.push_back(open_image(name, options.reading));
        frames += readers.back()->count();
    }
    const auto writer = create_image(options.output, frames);
    for (auto& reader : readers) {
        for (int i = 0; i < reader->count(); ++i) writer->add(reader->read(i).get());
        reader.reset();
    }
    writer->finish();
}

const command_registration registered(50, [](CLI::App& app) {
    CLI::App* command = app.add_subcommand("copy", "images into another file: other formats, pages, stacks");
    auto o = std::make_shared<copy_options>();
    command->add_option("IMAGE", o->files, "image files, one after the other")->required();
    command->add_option("-o,--output", o->output, "file to write: .tif, .png or .fits")
        ->type_name("FILE")
        ->required();
    command->add_option("--bits", o->reading.bits, "nominal depth of the 16-bit images")
        ->check(CLI::Range(9, 16));
    command->add_option("--page", o->reading.page, "page of files that have several, from 1")
        ->check(CLI::Range(1, most_frames));
    command->footer(
        "Examples:\n  zelt copy frame.fits -o frame.tif\n  zelt copy a.tif b.tif stack.tif:3 -o all.fits");
    command->callback([o] { copy(*o); });
});

} // namespace
} // namespace cli
