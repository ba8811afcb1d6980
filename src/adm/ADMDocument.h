// An ADM document (ITU-R BS.2076; the XML in the "axml" chunk of a broadcast wave file) as a graph of elements. The
// document owns every element; the links between them are filled in at the end of the parse. It is made, parsed once,
// then read.
#pragma once

#include "adm/ADMAudioChannelFormat.h"
#include "adm/ADMAudioContent.h"
#include "adm/ADMAudioObject.h"
#include "adm/ADMAudioPackFormat.h"
#include "adm/ADMAudioProgramme.h"
#include "adm/ADMAudioStreamFormat.h"
#include "adm/ADMAudioTrackFormat.h"
#include "adm/ADMAudioTrackUID.h"
#include "adm/ADMDiagnostic.h"
#include "adm/ADMElementTable.h"
#include "adm/ADMException.h"
#include "adm/ADMGenericElement.h"

#include <cstddef>
#include <memory>
#include <optional>
#include <span>
#include <string_view>
#include <typeinfo>
#include <vector>

class KT_EXPORT ADMDocument : private platform::XMLHandler, public ADMElementResolver {
public:
    /// Null, with a line in the log, without data.
    static std::unique_ptr<ADMDocument> initWithADMData(std::optional<Bytes> data);
    /// `initWithADMStream:`. Does not parse.
    explicit ADMDocument(std::unique_ptr<platform::InputStream> stream);
    ~ADMDocument() override;

    void setDiagnosticsHandler(ADMDiagnosticsHandler handler) { diagnosticsHandler_ = std::move(handler); }
    /// Called for every 64 KiB or less with the bytes read so far; false cancels, and the parse gives false with
    /// kStatusUserCancelled.
    void setProgressHandler(platform::XMLParser::ProgressHandler handler) { progressHandler_ = std::move(handler); }
    const ADMDocumentOptions& options() const { return options_; }
    void setOptions(const ADMDocumentOptions& options) { options_ = options; }

    /// Parses the stream that the document was made with.
    bool parse();
    /// `parseStream:`. False, with `parseError`, for what is not well-formed; the elements that were complete stay,
    /// their links are not filled. Raises ADMException for what is well-formed but not ADM.
    bool parseStream(platform::InputStream& stream);
    /// There is no library of common definitions: true.
    bool parseCommonDefinitions() { return true; }

    /// Each in document order; an element whose ID comes again takes the place of the one before.
    const ADMElementTable<ADMAudioProgramme>& audioProgrammes() const { return audioProgrammes_; }
    const ADMElementTable<ADMAudioContent>& audioContents() const { return audioContents_; }
    const ADMElementTable<ADMAudioObject>& audioObjects() const { return audioObjects_; }
    const ADMElementTable<ADMAudioTrackFormat>& audioTrackFormats() const { return audioTrackFormats_; }
    const ADMElementTable<ADMAudioChannelFormat>& audioChannelFormats() const { return audioChannelFormats_; }
    const ADMElementTable<ADMAudioPackFormat>& audioPackFormats() const { return audioPackFormats_; }
    const ADMElementTable<ADMAudioStreamFormat>& audioStreamFormats() const { return audioStreamFormats_; }
    const ADMElementTable<ADMAudioTrackUID>& audioTrackUIDs() const { return audioTrackUIDs_; }

    /// Each stores the element under its own ID and replaces the one that is there.
    void addAudioProgramme(std::unique_ptr<ADMAudioProgramme> element);
    void addAudioContent(std::unique_ptr<ADMAudioContent> element);
    void addAudioObject(std::unique_ptr<ADMAudioObject> element);
    void addAudioChannelFormat(std::unique_ptr<ADMAudioChannelFormat> element);
    void addAudioTrackFormat(std::unique_ptr<ADMAudioTrackFormat> element);
    void addAudioPackFormat(std::unique_ptr<ADMAudioPackFormat> element);
    void addAudioStreamFormat(std::unique_ptr<ADMAudioStreamFormat> element);
    void addAudioTrackUID(std::unique_ptr<ADMAudioTrackUID> element);

    /// Fills the links of all elements; runs at the end of a well-formed document.
    void resolveIDRefs();
    /// Raises MissingDefinition for an ID that is not there, MalformedIDString for one whose prefix cannot be told.
    /// Null for no ID and for an empty prefix.
    ADMElement* findADMElementRef(std::optional<std::string_view> identifier,
                                  std::optional<std::string_view> typePrefix = {}) override;
    void expectADMElementRef(std::string_view identifier, std::string_view typePrefix) override;
    /// Of this class itself; what the look-up of a derived one gives is not known.
    bool findsClassesOfPrefixes() const override { return typeid(*this) == typeid(ADMDocument); }

    platform::InputStream* inputStream() const { return inputStream_.get(); }
    /// Null unless a parse runs.
    platform::XMLParser* parser() const { return parser_.get(); }
    /// Null when there was none.
    const platform::Error* parseError() const { return parseError_ ? &*parseError_ : nullptr; }

    /// The elements that are open in the parse, innermost last. A document that failed in mid-parse keeps them until
    /// the next.
    const std::vector<std::unique_ptr<ADMElement>>& currentElements() const { return currentElements_; }
    std::span<const std::unique_ptr<ADMGenericElement>> currentGenericElements() const;
    /// The element that the innermost one stands in; null when there is none.
    ADMElement* parentElement() const;
    /// Takes the innermost element off; null when there is none.
    std::unique_ptr<ADMElement> popLastElement();

private:
    class LinkFinder;

    void startElement(std::string_view name, const platform::XMLAttributes& attributes) override;
    void endElement(std::string_view name) override;
    void characters(std::string_view text) override;
    void endDocument() override;

    struct Kind;
    static const Kind* kindOf(std::string_view name);
    void beginBlock(const platform::XMLAttributes& attributes);
    void endBlock();
    void beginGenericElement(std::string_view name, const platform::XMLAttributes& attributes);
    void endGenericElement();
    void push(std::unique_ptr<ADMElement> element, const platform::XMLAttributes& attributes);
    void forgetOpenElements();

    ADMElement* find(std::string_view identifier, std::string_view prefix) const;
    template <class Document, class Work>
    static auto withTableOf(Document& document, std::string_view prefix, Work work);
    template <class Table>
    void resolve(const Table& table, LinkFinder& finder);
    void report(const ADMException& problem, std::string elementID, platform::XMLPosition position) const;
    void reportParseError() const;

    std::unique_ptr<platform::InputStream> inputStream_;
    std::unique_ptr<platform::XMLParser> parser_;
    std::optional<platform::Error> parseError_;
    ADMDocumentOptions options_;
    ADMDiagnosticsHandler diagnosticsHandler_;
    platform::XMLParser::ProgressHandler progressHandler_;

    std::vector<std::unique_ptr<ADMElement>> currentElements_;
    // Those in use come first; the others wait to be used again, with their memory.
    std::vector<std::unique_ptr<ADMGenericElement>> genericElements_;
    std::size_t openGenericElements_ = 0;
    std::size_t skippedDepth_ = 0; // elements open within a block that is left out, itself included
    platform::XMLPosition blockPosition_;

    ADMElementTable<ADMAudioProgramme> audioProgrammes_;
    ADMElementTable<ADMAudioContent> audioContents_;
    ADMElementTable<ADMAudioObject> audioObjects_;
    ADMElementTable<ADMAudioTrackFormat> audioTrackFormats_;
    ADMElementTable<ADMAudioChannelFormat> audioChannelFormats_;
    ADMElementTable<ADMAudioPackFormat> audioPackFormats_;
    ADMElementTable<ADMAudioStreamFormat> audioStreamFormats_;
    ADMElementTable<ADMAudioTrackUID> audioTrackUIDs_;
};
