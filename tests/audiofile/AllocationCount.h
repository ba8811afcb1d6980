// Counts the calls of operator new in this test program.
#pragma once

#include <cstddef>

std::size_t allocationCount();
