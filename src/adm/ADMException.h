// What the ADM parser raises: a name, a reason for people, and rarely more.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/Value.h"

#include <exception>
#include <string>
#include <utility>

inline constexpr const char* kADMExceptionMalformedIDString = "MalformedIDString";
inline constexpr const char* kADMExceptionMalformedDefinition = "MalformedDefinition";
inline constexpr const char* kADMExceptionUnsupportedDefinition = "UnsupportedDefinition";
inline constexpr const char* kADMExceptionWrongIDPrefix = "WrongIDPrefix";
inline constexpr const char* kADMExceptionMissingDefinition = "MissingDefinition";

class KT_EXPORT ADMException : public std::exception {
public:
    ADMException(std::string name, std::string reason, platform::Dictionary userInfo = {})
        : name_(std::move(name)),
          reason_(std::move(reason)),
          userInfo_(std::move(userInfo))
    {
    }
    ~ADMException() override;

    /// One of the constants above.
    const std::string& name() const { return name_; }
    const std::string& reason() const { return reason_; }
    const platform::Dictionary& userInfo() const { return userInfo_; }
    const char* what() const noexcept override { return reason_.c_str(); }

private:
    std::string name_;
    std::string reason_;
    platform::Dictionary userInfo_;
};
