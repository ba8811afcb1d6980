// A block of a channel that feeds a loudspeaker.
#pragma once

#include "adm/ADMAudioBlockFormat.h"

#include <optional>
#include <utility>

/// A block of a channel that feeds one loudspeaker.
class KT_EXPORT ADMAudioBlockFormat_DirectSpeaker : public ADMAudioBlockFormat {
public:
    /// Raises what the constructor of ADMAudioBlockFormat raises.
    explicit ADMAudioBlockFormat_DirectSpeaker(const platform::XMLAttributes& attributes)
        : ADMAudioBlockFormat(attributes)
    {
    }
    /// For the factory, which has split the ID already.
    ADMAudioBlockFormat_DirectSpeaker(const Identity& identity, const platform::XMLAttributes& attributes)
        : ADMAudioBlockFormat(identity, attributes)
    {
    }
    ~ADMAudioBlockFormat_DirectSpeaker() override;

    /// The loudspeaker ("M+030" or a URN), untrimmed; null when it is not given.
    const std::optional<std::string>& speakerLabel() const { return speakerLabel_; }
    void setSpeakerLabel(std::optional<std::string> value) { speakerLabel_ = std::move(value); }
    /// Kept: a document's "position" does not change it, since the label alone names the loudspeaker.
    const ADMPosition& position() const { return position_; }
    void setPosition(const ADMPosition& value) { position_ = value; }

    void setSubElement(std::string_view name, std::string_view value,
                       const platform::XMLAttributes& attributes) override;
    std::string description() const override;

private:
    std::optional<std::string> speakerLabel_;
    ADMPosition position_;
};
