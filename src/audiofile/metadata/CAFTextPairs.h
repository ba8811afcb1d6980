// The pairs of texts of a CAF file, in "info" and in basic tagging, changed one by one: what is not named stays where
// it is, to the byte. Page: docs/formats/caf.md.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"

#include <string>
#include <string_view>
#include <utility>
#include <vector>

/// Texts are bytes without NUL; they need not be UTF-8. A payload is a big-endian uint32 count, then key, NUL, value,
/// NUL for each pair.
class KT_EXPORT CAFTextPairs {
public:
    CAFTextPairs() = default;
    explicit CAFTextPairs(BytesView payload);

    /// The first value under a key; null when there is none.
    const std::string* find(std::string_view key) const;
    /// In the place of the first pair of the key, of which no other stays; behind the last pair when there is none.
    void set(std::string_view key, std::string_view value);
    void erase(std::string_view key);

    /// In the order of the file, a key as often as it stands there.
    const std::vector<std::pair<std::string, std::string>>& pairs() const { return pairs_; }
    bool isEmpty() const { return pairs_.empty() && behind_.empty(); }
    Bytes payload() const;
    friend bool operator==(const CAFTextPairs&, const CAFTextPairs&) = default;

private:
    std::vector<std::pair<std::string, std::string>> pairs_;
    Bytes behind_; // what no pair counts
};
