// What the ADM parser raises: a name, a reason for people, and sometimes details.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/Value.h"

#include <exception>
#include <string>
#include <utility>

/// an ID that does not have the form of its prefix
inline constexpr const char* kADMExceptionMalformedIDString = "MalformedIDString";
/// an attribute or a sub-element is missing, or there are too many
inline constexpr const char* kADMExceptionMalformedDefinition = "MalformedDefinition";
/// a type or a format that the library does not read
inline constexpr const char* kADMExceptionUnsupportedDefinition = "UnsupportedDefinition";
/// an ID with the prefix of another kind of element
inline constexpr const char* kADMExceptionWrongIDPrefix = "WrongIDPrefix";
/// a reference to an element that the document does not have
inline constexpr const char* kADMExceptionMissingDefinition = "MissingDefinition";

/// The one exception of this room.
class KT_EXPORT ADMException : public std::exception {
public:
    /// `name` is one of the constants above.
    ADMException(std::string name, std::string reason, platform::Dictionary userInfo = {})
        : name_(std::move(name)),
          reason_(std::move(reason)),
          userInfo_(std::move(userInfo))
    {
    }
    ~ADMException() override;

    /// One of the constants above.
    const std::string& name() const { return name_; }
    /// A sentence for people, in English.
    const std::string& reason() const { return reason_; }
    /// Details, such as the ID of the element; mostly empty.
    const platform::Dictionary& userInfo() const { return userInfo_; }
    /// The same text as reason().
    const char* what() const noexcept override { return reason_.c_str(); }

private:
    std::string name_;
    std::string reason_;
    platform::Dictionary userInfo_;
};
