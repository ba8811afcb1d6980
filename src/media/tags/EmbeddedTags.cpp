#include "media/tags/EmbeddedTags.h"

#include "media/containers/AudioHandle.h"
#include "platform/LoadedModule.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <cstring>

namespace platform {

namespace {

class MemorySource final : public ByteSource {
public:
    explicit MemorySource(BytesView bytes) : bytes_(bytes) {}

    std::int32_t readSome(std::uint64_t position, void* to, std::size_t count, std::size_t& got) const override
    {
        const std::size_t start = static_cast<std::size_t>(std::min<std::uint64_t>(position, bytes_.size()));
        got = std::min(count, bytes_.size() - start);
        if (got > 0)
            std::memcpy(to, bytes_.data() + start, got);
        return kStatusOK;
    }

private:
    BytesView bytes_;
};

const TagModule* tagModule()
{
    static const auto* const loaded =
        static_cast<const TagModule*>(loadModule("libktfiles-tags.so", "ktfiles_tagModule"));
    return loaded != nullptr && loaded->version == TagModule::currentVersion ? loaded : nullptr;
}

} // namespace

std::int32_t readEmbeddedTags(const ByteSource& bytes, std::uint64_t length, std::vector<EmbeddedTag>& tags,
                              Error* error)
{
    tags.clear();
    const TagModule* module = tagModule();
    std::int32_t status = AudioHandle::kFormatNotSupported;
    if (module == nullptr)
        fail(error, ErrorDomain::status, status,
             "its tags need ktfiles/libktfiles-tags.so (install libktfiles-taglib)");
    else if (status = module->read(bytes, length, tags); status != kStatusOK)
        fail(error, ErrorDomain::status, status,
             status == kStatusParameterError ? "its tags are nested too deep" : StatusText(status));
    return status;
}

std::int32_t readID3Chunk(BytesView chunk, std::vector<EmbeddedTag>& tags, Error* error)
{
    return readEmbeddedTags(MemorySource(chunk), chunk.size(), tags, error);
}

} // namespace platform
