// The pairs of texts of a CAF file, in "info" and in basic tagging, changed one by one: pairs that are not named stay
// as they are, to the byte. Page: docs/formats/caf.md.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"

#include <string>
#include <string_view>
#include <utility>
#include <vector>

/// Pairs of texts, in order. Texts are bytes without NUL; they need not be UTF-8. A payload is a big-endian uint32
/// count, then key, NUL, value, NUL for each pair.
class KT_EXPORT CAFTextPairs {
public:
    CAFTextPairs() = default;
    /// Reads the pairs that are there, whatever the count claims.
    explicit CAFTextPairs(BytesView payload);

    /// The first value under a key; null when there is none.
    const std::string* find(std::string_view key) const;
    /// Replaces the first pair of the key and removes its others; adds a pair after the last when there is none.
    void set(std::string_view key, std::string_view value);
    /// Removes every pair of the key.
    void erase(std::string_view key);

    /// In the order of the file; a key may occur more than once.
    const std::vector<std::pair<std::string, std::string>>& pairs() const { return pairs_; }
    /// Whether a payload would be only its count.
    bool isEmpty() const { return pairs_.empty() && behind_.empty(); }
    /// The payload: what was read, with the changes since.
    Bytes payload() const;
    friend bool operator==(const CAFTextPairs&, const CAFTextPairs&) = default;

private:
    std::vector<std::pair<std::string, std::string>> pairs_;
    Bytes behind_; // what no pair counts
};
