// How often operator new was called in this test program.
#pragma once

#include <cstddef>

std::size_t allocationCount();
