// The transients of a loop: where its events begin.
#pragma once

#include "loops/VireoLoopChunkData.h"

#include <cstdint>
#include <utility>
#include <vector>

class VireoLoopTransient {
public:
    VireoLoopTransient() = default;
    VireoLoopTransient(std::int32_t transientType, std::uint64_t frame) : _transientType(transientType), _frame(frame)
    {
    }

    std::int32_t transientType() const { return _transientType; }
    void setTransientType(std::int32_t transientType) { _transientType = transientType; }
    /// A sample-frame position.
    std::uint64_t frame() const { return _frame; }
    void setFrame(std::uint64_t frame) { _frame = frame; }
    friend bool operator==(const VireoLoopTransient&, const VireoLoopTransient&) = default;

private:
    std::int32_t _transientType = 0;
    std::uint64_t _frame = 0;
};

/// AIFF keeps 32 bits of a frame and the time of writing; CAF keeps 64 bits and no time. Counts beyond the data are
/// cut to what is there.
class KT_EXPORT VireoLoopTransientChunkData : public VireoLoopChunkData {
public:
    bool isEmpty() const override { return _transients.empty(); }
    std::optional<Bytes> aifDataRepresentation() const override;
    std::optional<Bytes> cafDataRepresentation() const override;
    void readFromAIFData(BytesView data) override;
    void readFromCafData(BytesView data) override;

    const std::vector<VireoLoopTransient>& transients() const { return _transients; }
    void setTransients(std::vector<VireoLoopTransient> transients) { _transients = std::move(transients); }
    /// These three are unset until they are read or set; an unset one is written as 0.
    std::optional<std::int32_t> version() const { return _version; }
    void setVersion(std::optional<std::int32_t> version) { _version = version; }
    std::optional<std::int32_t> transientDetectionPercentage() const { return _transientDetectionPercentage; }
    void setTransientDetectionPercentage(std::optional<std::int32_t> value) { _transientDetectionPercentage = value; }
    std::optional<std::int32_t> forceDivisionValue() const { return _forceDivisionValue; }
    void setForceDivisionValue(std::optional<std::int32_t> value) { _forceDivisionValue = value; }

private:
    std::vector<VireoLoopTransient> _transients;
    std::optional<std::int32_t> _version;
    std::optional<std::int32_t> _transientDetectionPercentage;
    std::optional<std::int32_t> _forceDivisionValue;
};
