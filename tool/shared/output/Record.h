// A verb's data about one file: named values, for both JSON and CSV.
#pragma once

#include "platform/core/JsonWriter.h"
#include "platform/core/Value.h"
#include "tool/shared/output/Output.h"

#include <optional>
#include <string>
#include <utility>
#include <vector>

/// A number that is unknown when it is zero or less, as knownMember() takes it.
template <class Number>
std::optional<Number> positive(Number number)
{
    return number > 0 ? std::optional(number) : std::nullopt;
}

class Record {
public:
    struct Field {
        std::string name;
        platform::Value value;
    };

    Record& member(std::string name, platform::Value value)
    {
        fields_.push_back({std::move(name), std::move(value)});
        return *this;
    }
    // Unknown values are omitted.

    template <class T>
    Record& knownMember(std::string name, const std::optional<T>& value)
    {
        return value ? member(std::move(name), *value) : *this;
    }
    Record& knownMember(std::string name, const std::string& text)
    {
        return text.empty() ? *this : member(std::move(name), text);
    }

    /// Writes into an object that has begun.
    void write(JsonWriter& json) const
    {
        for (const Field& field : fields_)
            json.member(field.name, field.value);
    }
    const std::vector<Field>& fields() const { return fields_; }

private:
    std::vector<Field> fields_;
};
