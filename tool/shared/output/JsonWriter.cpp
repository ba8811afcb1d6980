#include "tool/shared/output/JsonWriter.h"

#include <nlohmann/json.hpp>

#include <algorithm>

void JsonWriter::write(std::string_view text)
{
    const bool isPlain =
        std::all_of(text.begin(), text.end(), [](char c) { return c >= 0x20 && c < 0x7F && c != '"' && c != '\\'; });
    if (!isPlain) {
        append(jsonText(text));
        return;
    }
    separate();
    put('"');
    put(text);
    put('"');
    isFirst_ = false;
}

bool JsonWriter::flush()
{
    output_.write({buffer_.data(), used_});
    used_ = 0;
    return !output_.failed();
}
