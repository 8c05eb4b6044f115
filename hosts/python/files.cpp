#include "files.h"

#include "codecs.h"
#include "failure.h"
#include "image.h"
#include "image_file.h"

#include <mutex>

namespace python {
namespace {

/// Readers and writers run without the interpreter lock. What fails in them is told as a failure of the library.
template <class Work>
auto work_on_file(Work&& work)
{
    // The codecs are loaded at first use, by one thread.
    static std::mutex mutex;
    const without_lock unlocked;
    const std::lock_guard one_at_a_time(mutex);
    try {
        return work();
    } catch (const cli::failure& e) {
        throw zelt::error(E_FAIL, e.what());
    } catch (const cli::usage_error& e) {
        throw zelt::error(E_INVALIDARG, e.what());
    }
}

py::object read(const std::string& path, int bits, int page)
{
    const com_ptr<IPixmat2> image = work_on_file([&] { return cli::read_image(path, {bits, page}); });
    return wrap_image(image.get());
}

int count(const std::string& path)
{
    return work_on_file([&] { return cli::open_image(path)->count(); });
}

void write(const std::string& path, const py::object& image)
{
    com_ptr<IPixmat2> pixels = is_image_object(image.ptr())
                                   ? com_ptr(reinterpret_cast<image_body*>(image.ptr())->image)
                                   : image_over_array(image, py::none(), py::none());
    work_on_file([&] { cli::write_image(path, pixels.get()); });
}

py::bytes png_of(const py::object& image)
{
    const com_ptr<IPixmat2> pixels(reinterpret_cast<image_body*>(image.ptr())->image);
    const std::vector<uint8_t> file = work_on_file([&] { return cli::codecs().encode_png(pixels.get()); });
    return {reinterpret_cast<const char*>(file.data()), file.size()};
}

} // namespace

void add_file_functions(py::module_& module)
{
    module.def("read_image", &read);
    module.def("count_images", &count);
    module.def("write_image", &write);
    module.def("png_of", &png_of);
}

} // namespace python
