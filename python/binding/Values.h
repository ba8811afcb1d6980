// The library's mixed values as Python's.
#pragma once

#include "platform/core/FourCC.h"
#include "platform/core/Value.h"

#include <pybind11/pybind11.h>

#include <string_view>

/// UTF-8; what is none becomes surrogates, as in paths.
pybind11::str textFrom(std::string_view text);
/// The text as one object that stays: for keys, of which there are not many.
pybind11::handle keyFrom(std::string_view text);
/// None, bool, int, float, str, bytes, list, dict; a date becomes a datetime in UTC.
pybind11::object objectFrom(const platform::Value& value);
pybind11::dict objectFrom(const platform::Dictionary& values);
