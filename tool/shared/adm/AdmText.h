// Names, IDs and numbers of ADM documents in sentences.
#pragma once

#include <string>
#include <string_view>

/// The start of a very long text. A small document could otherwise produce gigabytes by repeating names of 16 KB.
std::string shortened(const std::string& text);

/// "1 object", "4,000 objects".
std::string countText(std::size_t count, std::string_view noun);
