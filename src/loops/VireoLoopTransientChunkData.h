// The transients of a loop: where its events begin.
#pragma once

#include "loops/VireoLoopChunkData.h"

#include <cstdint>
#include <utility>
#include <vector>

/// One transient.
class VireoLoopTransient {
public:
    VireoLoopTransient() = default;
    /// `frame` is its position in the sound.
    VireoLoopTransient(std::int32_t transientType, std::uint64_t frame) : _transientType(transientType), _frame(frame)
    {
    }

    /// The type in the file, kept as it is.
    std::int32_t transientType() const { return _transientType; }
    void setTransientType(std::int32_t transientType) { _transientType = transientType; }
    /// The position in the sound, in frames.
    std::uint64_t frame() const { return _frame; }
    void setFrame(std::uint64_t frame) { _frame = frame; }
    friend bool operator==(const VireoLoopTransient&, const VireoLoopTransient&) = default;

private:
    std::int32_t _transientType = 0;
    std::uint64_t _frame = 0;
};

/// The transients of a loop. AIFF keeps 32 bits of a position and the time of writing; CAF keeps 64 bits and no time.
/// Records that a chunk counts but does not hold are left out.
class KT_EXPORT VireoLoopTransientChunkData : public VireoLoopChunkData {
public:
    bool isEmpty() const override { return _transients.empty(); }
    std::optional<Bytes> aifDataRepresentation() const override;
    std::optional<Bytes> cafDataRepresentation() const override;
    void readFromAIFData(BytesView data) override;
    void readFromCafData(BytesView data) override;

    /// In the order of the file.
    const std::vector<VireoLoopTransient>& transients() const { return _transients; }
    void setTransients(std::vector<VireoLoopTransient> transients) { _transients = std::move(transients); }
    /// The version of the chunk. This and the next two are unset until they are read or set, and then written as 0.
    std::optional<std::int32_t> version() const { return _version; }
    void setVersion(std::optional<std::int32_t> version) { _version = version; }
    /// A setting of the program that found the transients.
    std::optional<std::int32_t> transientDetectionPercentage() const { return _transientDetectionPercentage; }
    void setTransientDetectionPercentage(std::optional<std::int32_t> value) { _transientDetectionPercentage = value; }
    /// A setting of the program that found the transients.
    std::optional<std::int32_t> forceDivisionValue() const { return _forceDivisionValue; }
    void setForceDivisionValue(std::optional<std::int32_t> value) { _forceDivisionValue = value; }

private:
    std::vector<VireoLoopTransient> _transients;
    std::optional<std::int32_t> _version;
    std::optional<std::int32_t> _transientDetectionPercentage;
    std::optional<std::int32_t> _forceDivisionValue;
};
