// A digest of bytes that come piece by piece: MD5 (RFC 1321), which archives and FLAC keep, or SHA-256 (FIPS 180-4).
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"

#include <memory>

namespace platform {

class KT_EXPORT Digest {
public:
    enum class Kind { md5, sha256 };

    explicit Digest(Kind kind);
    ~Digest();
    Digest(const Digest&) = delete;
    Digest& operator=(const Digest&) = delete;

    void add(BytesView bytes);
    /// 16 or 32 bytes. Nothing is added afterwards.
    Bytes finish();

private:
    struct State;
    std::unique_ptr<State> state_;
};

} // namespace platform
