// SPDX-License-Identifier: Apache-2.0
// ovrinresize._native: numpy arrays in and out of the C++ layer, which checks and resizes. Pictures
// come as tuples of planes; of RGBA and RGB that is one array. Names of formats, filters and the
// like are strings. The package's own functions have the documentation.
#include <ovrinresize.hpp>

#include <pybind11/numpy.h>
#include <pybind11/pybind11.h>

#include <exception>
#include <string>
#include <utility>
#include <vector>

namespace py = pybind11;

namespace {

// ---- Errors -------------------------------------------------------------------------------------

// What ovrin::require throws, as Python's exceptions.
void translate(std::exception_ptr pending) {
    try {
        std::rethrow_exception(std::move(pending));
    } catch (const ovrin::Failure& failure) {
        const bool memory = failure.code() == ovrin::ErrorCode::kNoMemory;
        PyErr_SetString(memory ? PyExc_MemoryError : PyExc_ValueError, failure.what());
    }
}

std::string type_name(const py::handle& object) {
    return Py_TYPE(object.ptr())->tp_name;
}

// ---- Names --------------------------------------------------------------------------------------

template <class Value>
using Names = std::vector<std::pair<const char*, Value>>;

const Names<ovrin::Format>& formats() {
    static const Names<ovrin::Format> names = {{"rgba", ovrin::Format::kRgba8888},
                                               {"rgb", ovrin::Format::kRgb888},
                                               {"i420", ovrin::Format::kI420},
                                               {"nv21", ovrin::Format::kNv21}};
    return names;
}

const Names<ovrin::Filter>& filters() {
    static const Names<ovrin::Filter> names = {
        {"quarter", ovrin::Filter::kQuarter},
        {"nearest", ovrin::Filter::kNearest},
        {"bilinear", ovrin::Filter::kBilinear},
        {"bilinear_bands", ovrin::Filter::kBilinearBands},
        {"bilinear_halving", ovrin::Filter::kBilinearHalving},
        {"lanczos", ovrin::Filter::kLanczos}};
    return names;
}

const Names<ovrin::Threads>& thread_choices() {
    static const Names<ovrin::Threads> names = {{"auto", ovrin::Threads::kAuto},
                                                {"one", ovrin::Threads::kOne},
                                                {"many", ovrin::Threads::kMany}};
    return names;
}

const Names<ovrin::Fit>& fits() {
    static const Names<ovrin::Fit> names = {{"contain", ovrin::Fit::kContain},
                                            {"cover", ovrin::Fit::kCover},
                                            {"fill", ovrin::Fit::kFill}};
    return names;
}

const Names<ovrin::Gravity>& gravities() {
    static const Names<ovrin::Gravity> names = {
        {"northwest", ovrin::Gravity::kNorthWest}, {"north", ovrin::Gravity::kNorth},
        {"northeast", ovrin::Gravity::kNorthEast}, {"west", ovrin::Gravity::kWest},
        {"center", ovrin::Gravity::kCenter},       {"east", ovrin::Gravity::kEast},
        {"southwest", ovrin::Gravity::kSouthWest}, {"south", ovrin::Gravity::kSouth},
        {"southeast", ovrin::Gravity::kSouthEast}};
    return names;
}

template <class Value>
Value value_of(const py::object& name, const Names<Value>& names, const char* what) {
    if (!py::isinstance<py::str>(name)) {
        throw py::type_error(std::string(what) + ": a name is needed, not " + type_name(name));
    }
    const auto text = name.cast<std::string>();
    std::string known;
    for (const auto& [known_name, value] : names) {
        if (text == known_name) return value;
        known += (known.empty() ? "" : ", ") + std::string(known_name);
    }
    throw py::value_error(std::string(what) + " '" + text + "' is unknown; there are " + known);
}

// ---- Sizes --------------------------------------------------------------------------------------

// Throws for a side below 1 or above kLargestSide. Sides are of any size here.
ovrin::Size checked_size(ovrin::Format format, int64_t width, int64_t height,
                         const std::string& name) {
    if (width > INT32_MAX || height > INT32_MAX) {
        throw py::value_error(name + ": " + std::to_string(width) + "x" + std::to_string(height) +
                              " is too large, sides go up to " +
                              std::to_string(ovrin::kLargestSide));
    }
    const ovrin::Size size = {static_cast<int32_t>(width), static_cast<int32_t>(height)};
    if (ovrin::picture_bytes(format, size.width, size.height) == 0) {
        ovrin::require(ovrin::check(ovrin::ConstView(format, size.width, size.height, true, {}),
                                    name.c_str()));
    }
    return size;
}

// ---- Arrays -------------------------------------------------------------------------------------

struct PlaneShape {
    const char* name;
    py::ssize_t sample;       // bytes
    py::ssize_t subsampling;  // pixels to a sample, in either direction
};

const std::vector<PlaneShape>& plane_shapes(ovrin::Format format) {
    static const std::vector<PlaneShape> shapes[] = {{{"RGBA", 4, 1}},
                                                     {{"RGB", 3, 1}},
                                                     {{"Y", 1, 1}, {"U", 1, 2}, {"V", 1, 2}},
                                                     {{"Y", 1, 1}, {"VU", 2, 2}}};
    return shapes[static_cast<size_t>(format)];
}

std::string shape_text(const std::vector<py::ssize_t>& shape) {
    std::string text = "(";
    for (size_t i = 0; i < shape.size(); ++i) {
        text += (i == 0 ? "" : ", ") + std::to_string(shape[i]);
    }
    return text + (shape.size() == 1 ? ",)" : ")");
}

std::vector<py::ssize_t> shape_of(const py::array& array) {
    return {array.shape(), array.shape() + array.ndim()};
}

py::array checked_array(const py::handle& object, const std::string& name) {
    if (!py::isinstance<py::array>(object)) {
        throw py::type_error(name + ": a numpy array of uint8 is needed, not " + type_name(object));
    }
    auto array = py::reinterpret_borrow<py::array>(object);
    if (!py::isinstance<py::array_t<uint8_t>>(array)) {
        throw py::type_error(name + ": a numpy array of uint8 is needed, not of " +
                             py::str(array.dtype()).cast<std::string>());
    }
    return array;
}

// Whether the C++ layer can describe how the array's samples lie. Strides of axes of length 1 mean
// nothing, whatever numpy says.
bool is_describable(const py::array& array, py::ssize_t sample) {
    const py::ssize_t height = array.shape(0);
    const py::ssize_t width = array.shape(1);
    if (sample > 1 && array.strides(2) != 1) return false;
    const py::ssize_t pixel = width > 1 ? array.strides(1) : sample;
    if (pixel < sample || pixel > INT32_MAX / width) return false;
    const py::ssize_t row = height > 1 ? array.strides(0) : width * pixel;
    return row >= (width - 1) * pixel + sample && row <= INT32_MAX;
}

// Of an array that is describable.
template <class Byte>
ovrin::BasicPlane<Byte> plane_of(Byte* data, const py::array& array, py::ssize_t sample) {
    const py::ssize_t height = array.shape(0);
    const py::ssize_t width = array.shape(1);
    const py::ssize_t pixel = width > 1 ? array.strides(1) : sample;
    const py::ssize_t row = height > 1 ? array.strides(0) : width * pixel;
    const py::ssize_t bytes = (height - 1) * row + (width - 1) * pixel + sample;
    return {data, static_cast<size_t>(bytes), static_cast<int32_t>(row),
            static_cast<int32_t>(pixel)};
}

// Planes that lie packed, one behind the other, are a picture in one buffer: the C++ layer need not
// put them together for the functions that want that.
template <class Byte>
ovrin::BasicView<Byte> in_one_buffer(const ovrin::BasicView<Byte>& view) {
    Byte* next = view.planes[0].data;
    const std::vector<PlaneShape>& shapes = plane_shapes(view.format);
    for (size_t i = 0; i < shapes.size(); ++i) {
        const ovrin::BasicPlane<Byte>& plane = view.planes[i];
        const py::ssize_t step = shapes[i].subsampling;
        const py::ssize_t width = (view.width + step - 1) / step;
        const py::ssize_t height = (view.height + step - 1) / step;
        const bool packed =
            plane.pixel_stride == shapes[i].sample && plane.row_stride == width * shapes[i].sample;
        if (plane.data != next || !packed) return view;
        next += width * height * shapes[i].sample;
    }
    const auto bytes = static_cast<size_t>(next - view.planes[0].data);
    return {view.format, view.width, view.height, true, {view.planes[0].data, bytes}};
}

// The arrays of a picture; their shapes fit the size.
struct Picture {
    ovrin::Format format;
    ovrin::Size size;
    std::vector<py::array> planes;
};

void check_shape(const Picture& picture, size_t i, const std::string& name) {
    const PlaneShape& shape = plane_shapes(picture.format)[i];
    const py::ssize_t step = shape.subsampling;
    std::vector<py::ssize_t> wanted = {(picture.size.height + step - 1) / step,
                                       (picture.size.width + step - 1) / step};
    if (shape.sample > 1) wanted.push_back(shape.sample);
    const std::vector<py::ssize_t> has = shape_of(picture.planes[i]);
    if (has == wanted) return;
    throw py::value_error(name + ": " + shape.name + " needs the shape " + shape_text(wanted) +
                          ", has " + shape_text(has));
}

std::vector<py::array> checked_planes(ovrin::Format format, const py::tuple& planes,
                                      const std::string& name) {
    const size_t needed = plane_shapes(format).size();
    if (planes.size() != needed) {
        throw py::value_error(name + ": " + std::to_string(needed) + " planes are needed, not " +
                              std::to_string(planes.size()));
    }
    std::vector<py::array> arrays;
    for (const py::handle plane : planes) arrays.push_back(checked_array(plane, name));
    return arrays;
}

// A picture of that size.
Picture checked_picture(ovrin::Format format, const py::tuple& planes, const ovrin::Size& size,
                        const std::string& name) {
    Picture picture = {format, size, checked_planes(format, planes, name)};
    for (size_t i = 0; i < picture.planes.size(); ++i) check_shape(picture, i, name);
    return picture;
}

// A picture whose first plane says its size.
Picture checked_picture(ovrin::Format format, const py::tuple& planes, const std::string& name) {
    const PlaneShape& shape = plane_shapes(format)[0];
    const py::array first = checked_planes(format, planes, name)[0];
    const py::ssize_t axes = shape.sample > 1 ? 3 : 2;
    if (first.ndim() != axes) {
        throw py::value_error(name + ": " + shape.name + " needs " + std::to_string(axes) +
                              " axes, has the shape " + shape_text(shape_of(first)));
    }
    return checked_picture(format, planes,
                           checked_size(format, first.shape(1), first.shape(0), name), name);
}

using Packed = py::array_t<uint8_t, py::array::c_style>;

// Arrays that the layer cannot describe are replaced by packed copies; with `packed`, all that are
// not packed.
ovrin::ConstView view_to_read(Picture& picture, bool packed = false) {
    ovrin::ConstView view(picture.format, picture.size.width, picture.size.height, false, {});
    const std::vector<PlaneShape>& shapes = plane_shapes(picture.format);
    for (size_t i = 0; i < shapes.size(); ++i) {
        py::array& array = picture.planes[i];
        if (packed || !is_describable(array, shapes[i].sample)) array = Packed(array);
        view.planes[i] =
            plane_of(static_cast<const uint8_t*>(array.data()), array, shapes[i].sample);
    }
    return in_one_buffer(view);
}

ovrin::View view_to_write(Picture& picture, const std::string& name) {
    ovrin::View view(picture.format, picture.size.width, picture.size.height, false, {});
    const std::vector<PlaneShape>& shapes = plane_shapes(picture.format);
    for (size_t i = 0; i < shapes.size(); ++i) {
        py::array& array = picture.planes[i];
        if (!array.writeable()) throw py::value_error(name + ": the array is read-only");
        if (!is_describable(array, shapes[i].sample)) {
            throw py::value_error(name + ": strides of " +
                                  shape_text({array.strides(), array.strides() + array.ndim()}) +
                                  " cannot be written; rows and samples must go forward, and the "
                                  "bytes of a sample lie side by side");
        }
        view.planes[i] =
            plane_of(static_cast<uint8_t*>(array.mutable_data()), array, shapes[i].sample);
    }
    return in_one_buffer(view);
}

// ---- What Python calls --------------------------------------------------------------------------

// Runs without the interpreter's lock. `work` touches no Python object and gives a Status.
template <class Work>
void run_unlocked(const Work& work) {
    ovrin::Status status;
    {
        const py::gil_scoped_release unlocked;
        status = work();
    }
    ovrin::require(status);
}

void resize(const py::object& format, const py::tuple& src, const py::tuple& dst, int64_t width,
            int64_t height, const py::object& filter, const py::object& threads) {
    const ovrin::Format format_value = value_of(format, formats(), "format");
    const ovrin::Filter filter_value = value_of(filter, filters(), "filter");
    const ovrin::Threads threads_value = value_of(threads, thread_choices(), "threads");
    const ovrin::Size size = checked_size(format_value, width, height, "dst");
    Picture from = checked_picture(format_value, src, "src");
    Picture to = checked_picture(format_value, dst, size, "dst");
    const ovrin::ConstView src_view = view_to_read(from);
    const ovrin::View dst_view = view_to_write(to, "dst");
    run_unlocked([&] { return ovrin::resize(src_view, dst_view, filter_value, threads_value); });
}

void letterbox(const py::object& format, const py::tuple& src, const py::tuple& canvas,
               int64_t width, int64_t height, const py::object& fit, const py::object& gravity,
               const py::object& threads) {
    const ovrin::Format format_value = value_of(format, formats(), "format");
    const ovrin::Fit fit_value = value_of(fit, fits(), "fit");
    const ovrin::Gravity gravity_value = value_of(gravity, gravities(), "gravity");
    const ovrin::Threads threads_value = value_of(threads, thread_choices(), "threads");
    const ovrin::Size size = checked_size(format_value, width, height, "canvas");
    Picture from = checked_picture(format_value, src, "src");
    Picture to = checked_picture(format_value, canvas, size, "canvas");
    const ovrin::View view = view_to_write(to, "canvas");
    ovrin::Fitted fitted = ovrin::fit(view_to_read(from), view, fit_value, gravity_value);
    // A target record has one row length. Where it is the canvas that is unsuitable, it stays so.
    if (fitted.status.code == ovrin::ErrorCode::kStrideUnsuitable) {
        fitted = ovrin::fit(view_to_read(from, true), view, fit_value, gravity_value);
    }
    run_unlocked([&] { return ovrin::draw(fitted, threads_value); });
}

py::tuple rect_tuple(const ovrin::Rect& rect) {
    return py::make_tuple(rect.x, rect.y, rect.width, rect.height);
}

// The part of the source and the rectangle of the canvas.
py::tuple placement(const py::object& format, int64_t src_width, int64_t src_height,
                    int64_t canvas_width, int64_t canvas_height, const py::object& fit,
                    const py::object& gravity) {
    const ovrin::Format format_value = value_of(format, formats(), "format");
    const int32_t grid = plane_shapes(format_value).size() > 1 ? 2 : 1;
    const ovrin::Placement placed = ovrin::placement(
        checked_size(format_value, src_width, src_height, "src"),
        checked_size(format_value, canvas_width, canvas_height, "canvas"),
        value_of(fit, fits(), "fit"), value_of(gravity, gravities(), "gravity"), grid);
    return py::make_tuple(rect_tuple(placed.part), rect_tuple(placed.rect));
}

size_t picture_bytes(const py::object& format, int64_t width, int64_t height,
                     const std::string& name) {
    const ovrin::Format format_value = value_of(format, formats(), "format");
    const ovrin::Size size = checked_size(format_value, width, height, name);
    return ovrin::picture_bytes(format_value, size.width, size.height);
}

void premultiply(const py::object& array) {
    Picture rgba = checked_picture(ovrin::Format::kRgba8888, py::make_tuple(array), "picture");
    const ovrin::View view = view_to_write(rgba, "picture");
    run_unlocked([&] { return ovrin::premultiply(view); });
}

void unpremultiply(const py::object& array, int opaque) {
    Picture rgba = checked_picture(ovrin::Format::kRgba8888, py::make_tuple(array), "picture");
    const ovrin::View view = view_to_write(rgba, "picture");
    run_unlocked([&] { return ovrin::unpremultiply(view, opaque); });
}

int white_after(const py::object& filter) {
    return ovrin::white_after(value_of(filter, filters(), "filter"));
}

}  // namespace

PYBIND11_MODULE(_native, module) {
    py::register_exception_translator(&translate);
    module.attr("VERSION") = ovrin::version();
    module.attr("LARGEST_SIDE") = ovrin::kLargestSide;
    module.def("resize", &resize, py::arg("format"), py::arg("src"), py::arg("dst"),
               py::arg("width"), py::arg("height"), py::arg("filter"), py::arg("threads"));
    module.def("letterbox", &letterbox, py::arg("format"), py::arg("src"), py::arg("canvas"),
               py::arg("width"), py::arg("height"), py::arg("fit"), py::arg("gravity"),
               py::arg("threads"));
    module.def("placement", &placement, py::arg("format"), py::arg("src_width"),
               py::arg("src_height"), py::arg("canvas_width"), py::arg("canvas_height"),
               py::arg("fit"), py::arg("gravity"));
    module.def("picture_bytes", &picture_bytes, py::arg("format"), py::arg("width"),
               py::arg("height"), py::arg("name"));
    module.def("premultiply", &premultiply, py::arg("picture"));
    module.def("unpremultiply", &unpremultiply, py::arg("picture"), py::arg("opaque"));
    module.def("white_after", &white_after, py::arg("filter"));
}
