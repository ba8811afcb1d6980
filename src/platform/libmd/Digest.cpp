#include "platform/Digest.h"

#include <md5.h>
#include <sha2.h>

#include <cstdint>
#include <variant>

namespace platform {

namespace {

const std::uint8_t* bytesAt(BytesView bytes)
{
    return reinterpret_cast<const std::uint8_t*>(bytes.data());
}

} // namespace

struct Digest::State {
    std::variant<MD5_CTX, SHA2_CTX> context;
};

Digest::Digest(Kind kind) : state_(std::make_unique<State>())
{
    if (kind == Kind::md5)
        MD5Init(&state_->context.emplace<MD5_CTX>());
    else
        SHA256Init(&state_->context.emplace<SHA2_CTX>());
}

Digest::~Digest() = default;

void Digest::add(BytesView bytes)
{
    if (auto* const md5 = std::get_if<MD5_CTX>(&state_->context); md5 != nullptr)
        MD5Update(md5, bytesAt(bytes), bytes.size());
    else
        SHA256Update(&std::get<SHA2_CTX>(state_->context), bytesAt(bytes), bytes.size());
}

Bytes Digest::finish()
{
    auto* const md5 = std::get_if<MD5_CTX>(&state_->context);
    Bytes digest(md5 != nullptr ? MD5_DIGEST_LENGTH : SHA256_DIGEST_LENGTH);
    auto* const to = reinterpret_cast<std::uint8_t*>(digest.data());
    if (md5 != nullptr)
        MD5Final(to, md5);
    else
        SHA256Final(to, &std::get<SHA2_CTX>(state_->context));
    return digest;
}

} // namespace platform
