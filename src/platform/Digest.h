// A digest of bytes that come in pieces: MD5 (RFC 1321), which archives and FLAC use, or SHA-256 (FIPS 180-4).
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"

#include <memory>

namespace platform {

/// One running digest.
class KT_EXPORT Digest {
public:
    /// The algorithm.
    enum class Kind { md5, sha256 }; // the algorithm

    /// A digest of no bytes yet.
    explicit Digest(Kind kind);
    ~Digest();
    Digest(const Digest&) = delete;
    Digest& operator=(const Digest&) = delete;

    /// Takes the next bytes.
    void add(BytesView bytes);
    /// The digest: 16 bytes of MD5, 32 of SHA-256. Call it once, and add nothing afterwards.
    Bytes finish();

private:
    struct State;
    std::unique_ptr<State> state_;
};

} // namespace platform
