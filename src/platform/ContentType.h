// Content types: identifiers that say what kind of data a file holds, and which kind is a special case of which.
#pragma once

#include "platform/String.h"

#include <string>

namespace platform {

/// A content type, named by its identifier ("public.audio") or a MIME type ("audio/flac"), in any case. Every subtype
/// of "audio/" is an audio type.
class KT_EXPORT ContentType {
public:
    /// `identifier` need not be known.
    explicit ContentType(String identifier) : identifier_(std::move(identifier)) {}
    /// As it was given; may be null.
    const String& identifier() const { return identifier_; }

    /// Whether this type is `other` or a special case of it; false when either is unknown.
    bool conformsTo(const ContentType& other) const;

    /// "public.audio".
    static const ContentType& audio();
    /// "org.xiph.flac".
    static const ContentType& flac();

private:
    String identifier_;
};

} // namespace platform
