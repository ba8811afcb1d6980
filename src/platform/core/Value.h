// The closed variant for mixed values: dictionaries of tags, property lists, details of errors.
#pragma once

#include "platform/core/Bytes.h"

#include <cstdint>
#include <map>
#include <string>
#include <type_traits>
#include <utility>
#include <variant>
#include <vector>

/// Services of the system and the values that they speak in; everything below the classes for hosts.
namespace platform {

class Value;
/// Values in order.
using Array = std::vector<Value>;
/// Values by UTF-8 text, in the order of the bytes of the keys.
using Dictionary = std::map<std::string, Value, std::less<>>;

/// A point in time: seconds since 2001-01-01 00:00:00 UTC, the epoch of property lists.
struct Date {
    double secondsSince2001 = 0; // with fractions; may be negative
    friend bool operator==(const Date&, const Date&) = default;
};

/// One value; a default-constructed one is null (which no property list can hold). Text is UTF-8.
class Value {
public:
    /// The kinds; std::monostate is null.
    using Variant =
        std::variant<std::monostate, bool, std::int64_t, double, Date, std::string, Bytes, Array, Dictionary>;

    /// Null.
    Value() = default;
    /// Each holds a value of that kind; integers of any width become 64 bits.
    Value(bool value) : value_(value) {}
    template <class T>
        requires(std::is_integral_v<T> && !std::is_same_v<T, bool>)
    Value(T value) : value_(static_cast<std::int64_t>(value)) {}
    Value(double value) : value_(value) {}
    Value(Date value) : value_(value) {}
    Value(std::string value) : value_(std::move(value)) {}
    Value(const char* value) : value_(std::string(value)) {}
    Value(Bytes value) : value_(std::move(value)) {}
    Value(Array value) : value_(std::move(value)) {}
    Value(Dictionary value) : value_(std::move(value)) {}

    /// Whether the value is default-constructed.
    bool isNull() const { return std::holds_alternative<std::monostate>(value_); }

    /// The value as a `T`, one of the alternatives of Variant; null when it is of another kind.
    template <class T>
    const T* get() const
    {
        return std::get_if<T>(&value_);
    }
    /// The same, to be changed in place.
    template <class T>
    T* get()
    {
        return std::get_if<T>(&value_);
    }

    /// The value as a variant, for std::visit.
    const Variant& variant() const { return value_; }
    friend bool operator==(const Value&, const Value&) = default;

private:
    Variant value_;
};

/// The value under `key` as a `T`, or null when it is absent or of another kind.
template <class T>
const T* find(const Dictionary& dictionary, std::string_view key)
{
    const auto found = dictionary.find(key);
    return found == dictionary.end() ? nullptr : found->second.get<T>();
}

} // namespace platform
