#include "binding/Values.h"

#include <map>
#include <string>

namespace py = pybind11;

namespace {

py::object timeFrom(const platform::Date& date)
{
    const py::module_ datetime = py::module_::import("datetime");
    const py::object start =
        datetime.attr("datetime")(2001, 1, 1, py::arg("tzinfo") = datetime.attr("timezone").attr("utc"));
    try {
        return start + datetime.attr("timedelta")(py::arg("seconds") = date.secondsSince2001);
    } catch (py::error_already_set& error) {
        if (!error.matches(PyExc_OverflowError) && !error.matches(PyExc_ValueError))
            throw;
        return py::float_(date.secondsSince2001); // beyond the years that Python knows
    }
}

struct Maker {
    py::object operator()(std::monostate) const { return py::none(); }
    py::object operator()(bool value) const { return py::bool_(value); }
    py::object operator()(std::int64_t value) const { return py::int_(value); }
    py::object operator()(double value) const { return py::float_(value); }
    py::object operator()(const platform::Date& value) const { return timeFrom(value); }
    py::object operator()(const std::string& value) const { return textFrom(value); }
    py::object operator()(const Bytes& value) const
    {
        return py::bytes(reinterpret_cast<const char*>(value.data()), value.size());
    }
    py::object operator()(const platform::Array& value) const
    {
        py::list list;
        for (const platform::Value& each : value)
            list.append(objectFrom(each));
        return list;
    }
    py::object operator()(const platform::Dictionary& value) const { return objectFrom(value); }
};

} // namespace

py::str textFrom(std::string_view text)
{
    PyObject* const made = PyUnicode_DecodeUTF8(text.data(), static_cast<Py_ssize_t>(text.size()), "surrogateescape");
    if (made == nullptr)
        throw py::error_already_set();
    return py::reinterpret_steal<py::str>(made);
}

py::handle keyFrom(std::string_view text)
{
    static auto* const keys = new std::map<std::string, PyObject*, std::less<>>; // the interpreter's lock guards it
    const auto found = keys->find(text);
    if (found != keys->end())
        return found->second;
    return keys->emplace(text, textFrom(text).release().ptr()).first->second;
}

py::object objectFrom(const platform::Value& value)
{
    return std::visit(Maker(), value.variant());
}

py::dict objectFrom(const platform::Dictionary& values)
{
    py::dict made;
    for (const auto& [key, value] : values)
        made[textFrom(key)] = objectFrom(value);
    return made;
}
