// The document as the receiver of its parser's events: elements are made, fed, and stored once they are complete.
#include "adm/ADMDocument.h"
#include "adm/ADMNames.h"
#include "platform/core/Status.h"

using platform::XMLAttributes;
using platform::XMLPosition;

/// How elements of one name are made and stored.
struct ADMDocument::Kind {
    std::string_view name;
    std::string_view idAttribute;
    void (*begin)(ADMDocument& document, const XMLAttributes& attributes);
    void (*end)(ADMDocument& document);

    template <class Element, std::unique_ptr<Element> (*make)(const XMLAttributes&),
              void (ADMDocument::*add)(std::unique_ptr<Element>)>
    static constexpr Kind of(std::string_view name, std::string_view idAttribute)
    {
        return {name, idAttribute,
                [](ADMDocument& document, const XMLAttributes& attributes) {
                    std::unique_ptr<Element> element = make(attributes);
                    element->setDocumentPosition(document.parser_->elementPosition());
                    document.push(std::move(element), attributes);
                },
                [](ADMDocument& document) {
                    // Elements end in the reverse order of their nesting, so the element on top is of the kind that
                    // ends.
                    (document.*
                     add)(std::unique_ptr<Element>(static_cast<Element*>(document.popLastElement().release())));
                }};
    }
};

const ADMDocument::Kind* ADMDocument::kindOf(std::string_view name)
{
    static constexpr Kind kinds[] = {
        {"audioBlockFormat", "audioBlockFormatID",
         [](ADMDocument& document, const XMLAttributes& attributes) { document.beginBlock(attributes); },
         [](ADMDocument& document) { document.endBlock(); }},
        Kind::of<ADMAudioProgramme, ADMAudioProgramme::audioProgrammeWithAttributes, &ADMDocument::addAudioProgramme>(
            "audioProgramme", "audioProgrammeID"),
        Kind::of<ADMAudioContent, ADMAudioContent::audioContentWithAttributes, &ADMDocument::addAudioContent>(
            "audioContent", "audioContentID"),
        Kind::of<ADMAudioObject, ADMAudioObject::audioObjectWithAttributes, &ADMDocument::addAudioObject>(
            "audioObject", "audioObjectID"),
        Kind::of<ADMAudioTrackUID, ADMAudioTrackUID::audioTrackUIDWithAttributes, &ADMDocument::addAudioTrackUID>(
            "audioTrackUID", "UID"),
        Kind::of<ADMAudioPackFormat, ADMAudioPackFormat::audioPackFormatWithAttributes,
                 &ADMDocument::addAudioPackFormat>("audioPackFormat", "audioPackFormatID"),
        Kind::of<ADMAudioChannelFormat, ADMAudioChannelFormat::audioChannelFormatWithAttributes,
                 &ADMDocument::addAudioChannelFormat>("audioChannelFormat", "audioChannelFormatID"),
        Kind::of<ADMAudioTrackFormat, ADMAudioTrackFormat::audioTrackFormatWithAttributes,
                 &ADMDocument::addAudioTrackFormat>("audioTrackFormat", "audioTrackFormatID"),
        Kind::of<ADMAudioStreamFormat, ADMAudioStreamFormat::audioStreamFormatWithAttributes,
                 &ADMDocument::addAudioStreamFormat>("audioStreamFormat", "audioStreamFormatID"),
    };
    static_assert(std::size(kinds) == 9);
    if (!adm::is(name.substr(0, 5), "audio")) // most elements of a document are sub-elements
        return nullptr;
    for (const Kind& kind : kinds)
        if (kind.name == name)
            return &kind;
    return nullptr;
}

bool ADMDocument::parse()
{
    if (inputStream_ != nullptr)
        return parseStream(*inputStream_);
    platform::fail(&parseError_.emplace(), platform::ErrorDomain::status, kStatusParameterError, "no stream to parse");
    return false;
}

bool ADMDocument::parseStream(platform::InputStream& stream)
{
    forgetOpenElements();
    parseError_.reset();
    struct ParserLife {
        std::unique_ptr<platform::XMLParser>& parser;
        ~ParserLife() { parser.reset(); }
    } const life{parser_};
    parser_ = std::make_unique<platform::XMLParser>(stream, static_cast<platform::XMLHandler&>(*this));
    parser_->setProgressHandler(progressHandler_);
    platform::Error error;
    if (parser_->parse(&error))
        return true;
    parseError_ = std::move(error);
    reportParseError();
    return false;
}

void ADMDocument::startElement(std::string_view name, const XMLAttributes& attributes)
{
    if (skippedDepth_ != 0) {
        ++skippedDepth_;
        return;
    }
    const Kind* kind = kindOf(name);
    if (kind == nullptr) {
        if (!currentElements_.empty())
            beginGenericElement(name, attributes);
        return;
    }
    try {
        kind->begin(*this, attributes);
    } catch (const ADMException& problem) {
        report(problem, std::string(attributes.find(kind->idAttribute).value_or("")), parser_->elementPosition());
        throw;
    }
}

void ADMDocument::characters(std::string_view text)
{
    if (openGenericElements_ != 0 && skippedDepth_ == 0)
        genericElements_[openGenericElements_ - 1]->appendValue(text);
}

void ADMDocument::endElement(std::string_view name)
{
    if (skippedDepth_ != 0)
        --skippedDepth_;
    else if (const Kind* kind = kindOf(name))
        kind->end(*this);
    else if (!currentElements_.empty())
        endGenericElement();
}

void ADMDocument::endDocument()
{
    resolveIDRefs();
}

void ADMDocument::push(std::unique_ptr<ADMElement> element, const XMLAttributes& attributes)
{
    if (options_.exactFractions)
        element->readExactTimes(attributes);
    currentElements_.push_back(std::move(element));
}

void ADMDocument::beginBlock(const XMLAttributes& attributes)
{
    try {
        push(ADMAudioBlockFormat::audioBlockFormatWithAttributes(attributes), attributes);
        if (diagnosticsHandler_)
            blockPosition_ = parser_->elementPosition();
    } catch (const ADMException& problem) {
        if (!options_.skipUnsupportedBlocks || problem.name() != kADMExceptionUnsupportedDefinition)
            throw;
        report(problem, std::string(attributes.find("audioBlockFormatID").value_or("")), parser_->elementPosition());
        skippedDepth_ = 1;
    }
}

void ADMDocument::endBlock()
{
    auto* channel = dynamic_cast<ADMAudioChannelFormat*>(parentElement());
    std::unique_ptr<ADMAudioBlockFormat> block(static_cast<ADMAudioBlockFormat*>(popLastElement().release()));
    try {
        block->validate();
        if (channel == nullptr)
            throw ADMException(kADMExceptionMalformedDefinition, "audioBlockFormat '" + block->audioBlockFormatID() +
                                                                     "' is not within an audioChannelFormat");
    } catch (const ADMException& problem) {
        report(problem, block->elementID(), blockPosition_);
        throw;
    }
    channel->addAudioBlockFormat(std::move(block));
}

void ADMDocument::beginGenericElement(std::string_view name, const XMLAttributes& attributes)
{
    if (openGenericElements_ == genericElements_.size())
        genericElements_.push_back(ADMGenericElement::elementWithName(name, attributes));
    else
        genericElements_[openGenericElements_]->reset(name, attributes);
    if (diagnosticsHandler_)
        genericElements_[openGenericElements_]->setDocumentPosition(parser_->elementPosition());
    ++openGenericElements_;
}

void ADMDocument::endGenericElement()
{
    const ADMGenericElement& ended = *genericElements_[--openGenericElements_];
    ADMElement& element = *currentElements_.back();
    try {
        element.setSubElement(ended.name(), ended.value(), ended.attributes());
    } catch (const ADMException& problem) {
        report(problem, element.elementID(), ended.documentPosition());
        throw;
    }
}

std::span<const std::unique_ptr<ADMGenericElement>> ADMDocument::currentGenericElements() const
{
    return std::span(genericElements_).first(openGenericElements_);
}

ADMElement* ADMDocument::parentElement() const
{
    return currentElements_.size() < 2 ? nullptr : currentElements_[currentElements_.size() - 2].get();
}

std::unique_ptr<ADMElement> ADMDocument::popLastElement()
{
    if (currentElements_.empty())
        return nullptr;
    std::unique_ptr<ADMElement> last = std::move(currentElements_.back());
    currentElements_.pop_back();
    return last;
}

void ADMDocument::forgetOpenElements()
{
    currentElements_.clear();
    openGenericElements_ = 0;
    skippedDepth_ = 0;
}

void ADMDocument::report(const ADMException& problem, std::string elementID, XMLPosition position) const
{
    if (diagnosticsHandler_)
        diagnosticsHandler_({position, problem.name(), std::move(elementID), problem.reason()});
}

void ADMDocument::reportParseError() const
{
    if (!diagnosticsHandler_)
        return;
    const auto number = [this](const char* key) {
        const auto* value = platform::find<std::int64_t>(parseError_->userInfo, key);
        return value == nullptr ? 0U : static_cast<std::uint32_t>(*value);
    };
    diagnosticsHandler_({{number("line"), number("column")}, ADMDiagnostic::kParseError, {}, parseError_->description});
}
