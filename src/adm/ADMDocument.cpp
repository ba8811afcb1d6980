#include "adm/ADMDocument.h"

#include "adm/ADMIdentifier.h"
#include "platform/Log.h"

#include <algorithm>

std::unique_ptr<ADMDocument> ADMDocument::initWithADMData(std::optional<Bytes> data)
{
    if (!data) {
        platform::logLine("ImportADM: nil data pointer passed to ADMDocument");
        return nullptr;
    }
    return std::make_unique<ADMDocument>(std::make_unique<platform::MemoryInputStream>(*std::move(data)));
}

ADMDocument::ADMDocument(std::unique_ptr<platform::InputStream> stream) : inputStream_(std::move(stream))
{
}

ADMDocument::~ADMDocument() = default;

void ADMDocument::addAudioProgramme(std::unique_ptr<ADMAudioProgramme> element)
{
    const std::string& id = element->audioProgrammeID();
    audioProgrammes_.insert(id, std::move(element));
}

void ADMDocument::addAudioContent(std::unique_ptr<ADMAudioContent> element)
{
    const std::string& id = element->audioContentID();
    audioContents_.insert(id, std::move(element));
}

void ADMDocument::addAudioObject(std::unique_ptr<ADMAudioObject> element)
{
    const std::string& id = element->audioObjectID();
    audioObjects_.insert(id, std::move(element));
}

void ADMDocument::addAudioChannelFormat(std::unique_ptr<ADMAudioChannelFormat> element)
{
    const std::string& id = element->audioChannelFormatID();
    audioChannelFormats_.insert(id, std::move(element));
}

void ADMDocument::addAudioTrackFormat(std::unique_ptr<ADMAudioTrackFormat> element)
{
    const std::string& id = element->audioTrackFormatID();
    audioTrackFormats_.insert(id, std::move(element));
}

void ADMDocument::addAudioPackFormat(std::unique_ptr<ADMAudioPackFormat> element)
{
    const std::string& id = element->audioPackFormatID();
    audioPackFormats_.insert(id, std::move(element));
}

void ADMDocument::addAudioStreamFormat(std::unique_ptr<ADMAudioStreamFormat> element)
{
    const std::string& id = element->audioStreamFormatID();
    audioStreamFormats_.insert(id, std::move(element));
}

void ADMDocument::addAudioTrackUID(std::unique_ptr<ADMAudioTrackUID> element)
{
    const std::string& id = element->audioTrackUIDID();
    audioTrackUIDs_.insert(id, std::move(element));
}

ADMElement* ADMDocument::findADMElementRef(std::optional<std::string_view> identifier,
                                           std::optional<std::string_view> typePrefix)
{
    if (!identifier)
        return nullptr;
    if (!typePrefix)
        typePrefix = adm::parseIdentifier(*identifier, nullptr, nullptr, nullptr);
    if (typePrefix->empty())
        return nullptr;
    if (ADMElement* found = find(*identifier, *typePrefix))
        return found;
    throw ADMException(kADMExceptionMissingDefinition,
                       "'" + std::string(*identifier) + "' referenced, but not defined");
}

/// The result of `work` on the table of the kind with this prefix; null, or nothing, when no kind has it.
template <class Document, class Work>
auto ADMDocument::withTableOf(Document& document, std::string_view prefix, Work work)
{
    using Result = decltype(work(document.audioObjects_));
    switch (adm::packedPrefix(prefix)) {
    case adm::packedPrefix(kADMAudioTrackUIDPrefix):
        return work(document.audioTrackUIDs_);
    case adm::packedPrefix(kADMAudioTrackFormatPrefix):
        return work(document.audioTrackFormats_);
    case adm::packedPrefix(kADMAudioStreamFormatPrefix):
        return work(document.audioStreamFormats_);
    case adm::packedPrefix(kADMAudioChannelFormatPrefix):
        return work(document.audioChannelFormats_);
    case adm::packedPrefix(kADMAudioPackFormatPrefix):
        return work(document.audioPackFormats_);
    case adm::packedPrefix(kADMAudioObjectPrefix):
        return work(document.audioObjects_);
    case adm::packedPrefix(kADMAudioContentPrefix):
        return work(document.audioContents_);
    case adm::packedPrefix(kADMAudioProgrammePrefix):
        return work(document.audioProgrammes_);
    default:
        return Result();
    }
}

ADMElement* ADMDocument::find(std::string_view identifier, std::string_view prefix) const
{
    return withTableOf(*this, prefix, [&](const auto& table) -> ADMElement* { return table.find(identifier); });
}

void ADMDocument::expectADMElementRef(std::string_view identifier, std::string_view typePrefix)
{
    withTableOf(*this, typePrefix, [&](const auto& table) { table.prefetch(identifier); });
}

/// Resolves references for one element at a time and remembers which, so that a problem is reported with its place.
class ADMDocument::LinkFinder : public ADMElementResolver {
public:
    explicit LinkFinder(ADMDocument& document) : document_(document), findsClasses_(document.findsClassesOfPrefixes())
    {
    }
    void setElement(const ADMElement& element) { element_ = &element; }

    ADMElement* findADMElementRef(std::optional<std::string_view> identifier,
                                  std::optional<std::string_view> typePrefix) override
    {
        if (document_.options_.silentTrack && typePrefix == kADMAudioTrackUIDPrefix && identifier == "ATU_00000000")
            return nullptr;
        try {
            return document_.findADMElementRef(identifier, typePrefix);
        } catch (const ADMException& problem) {
            document_.report(problem, element_->elementID(), element_->documentPosition());
            if (!document_.options_.continuePastUnresolvedReferences)
                throw;
            return nullptr;
        }
    }

    void expectADMElementRef(std::string_view identifier, std::string_view typePrefix) override
    {
        document_.expectADMElementRef(identifier, typePrefix);
    }

    bool findsClassesOfPrefixes() const override { return findsClasses_; }

private:
    ADMDocument& document_;
    bool findsClasses_;
    const ADMElement* element_ = nullptr;
};

template <class Table>
void ADMDocument::resolve(const Table& table, LinkFinder& finder)
{
    auto ahead = table.begin();
    for (std::size_t i = 0; i < std::min(adm::kAnnounced, table.size()); ++i)
        (ahead++)->announceIDRefsToResolver(finder);
    for (ADMElement& element : table) {
        if (ahead != table.end())
            (ahead++)->announceIDRefsToResolver(finder);
        finder.setElement(element);
        element.resolveIDRefsWithResolver(finder);
    }
}

void ADMDocument::resolveIDRefs()
{
    LinkFinder finder(*this);
    resolve(audioProgrammes_, finder);
    resolve(audioContents_, finder);
    resolve(audioObjects_, finder);
    resolve(audioTrackUIDs_, finder);
    resolve(audioPackFormats_, finder);
    resolve(audioStreamFormats_, finder);
    resolve(audioTrackFormats_, finder);
}
