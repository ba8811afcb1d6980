#include "platform/SecureHash.h"

#include <sha2.h>

#include <cstdint>

namespace platform {

SHA256Digest sha256(BytesView bytes)
{
    SHA2_CTX context;
    SHA256Init(&context);
    SHA256Update(&context, reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size());
    SHA256Digest digest;
    static_assert(sizeof digest == SHA256_DIGEST_LENGTH);
    SHA256Final(reinterpret_cast<std::uint8_t*>(digest.data()), &context);
    return digest;
}

std::optional<SHA256Digest> fileSystemRepresentationSHA256(const String& path)
{
    if (path.isNull() || path.utf8().find('\0') != std::string::npos)
        return std::nullopt;
    // Names are not decomposed here: the text as it stands is the representation.
    return sha256(bytesOf(path.utf8()));
}

} // namespace platform
