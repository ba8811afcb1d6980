// What each family adds to the module.
#pragma once

#include <pybind11/pybind11.h>

void bindReader(pybind11::module_& module);
void bindDescription(pybind11::module_& module);
void bindChunks(pybind11::module_& module);
void bindOverview(pybind11::module_& module);
void bindAdm(pybind11::module_& module);
void bindLocks(pybind11::module_& module);
void bindMeta(pybind11::module_& module);
void bindTags(pybind11::module_& module);
void bindProject(pybind11::module_& module);
