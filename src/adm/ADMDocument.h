// An ADM document (ITU-R BS.2076; the XML in the "axml" chunk of a broadcast wave file) as a graph of elements. The
// document owns every element and fills in the links between them at the end of the parse. It is made, parsed once,
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

/// A graph of ADM elements, which it owns. Errors of the XML end the parse with false; errors of ADM raise
/// ADMException.
class KT_EXPORT ADMDocument : private platform::XMLHandler, public ADMElementResolver {
public:
    /// A document over bytes that it takes over, not parsed yet. Null, with a line in the log, when there are no
    /// data.
    static std::unique_ptr<ADMDocument> initWithADMData(std::optional<Bytes> data);
    /// `initWithADMStream:`. Takes the stream over; does not parse.
    explicit ADMDocument(std::unique_ptr<platform::InputStream> stream);
    ~ADMDocument() override;

    /// Called for each problem; empty means none. Set it before the parse.
    void setDiagnosticsHandler(ADMDiagnosticsHandler handler) { diagnosticsHandler_ = std::move(handler); }
    /// Called with the number of bytes read so far, after every piece of 64 KiB or less. Its false cancels: the parse
    /// returns false with kStatusUserCancelled.
    void setProgressHandler(platform::XMLParser::ProgressHandler handler) { progressHandler_ = std::move(handler); }
    /// What is let pass; all off at first.
    const ADMDocumentOptions& options() const { return options_; }
    /// Sets options(), for the next parse.
    void setOptions(const ADMDocumentOptions& options) { options_ = options; }

    /// Parses the stream that the document was made with, as parseStream() does.
    bool parse();
    /// `parseStream:`. False, with parseError(), when the stream is not well-formed: complete elements stay, their
    /// links are not filled. Raises ADMException when it is well-formed but not ADM.
    bool parseStream(platform::InputStream& stream);
    /// Always true: the library has no common definitions.
    bool parseCommonDefinitions() { return true; }

    /// The programmes in document order. An element whose ID comes again takes the place of the earlier one, in this
    /// table and the others.
    const ADMElementTable<ADMAudioProgramme>& audioProgrammes() const { return audioProgrammes_; }
    /// The contents in document order.
    const ADMElementTable<ADMAudioContent>& audioContents() const { return audioContents_; }
    /// The objects in document order.
    const ADMElementTable<ADMAudioObject>& audioObjects() const { return audioObjects_; }
    /// The track formats in document order.
    const ADMElementTable<ADMAudioTrackFormat>& audioTrackFormats() const { return audioTrackFormats_; }
    /// The channel formats in document order.
    const ADMElementTable<ADMAudioChannelFormat>& audioChannelFormats() const { return audioChannelFormats_; }
    /// The pack formats in document order.
    const ADMElementTable<ADMAudioPackFormat>& audioPackFormats() const { return audioPackFormats_; }
    /// The stream formats in document order.
    const ADMElementTable<ADMAudioStreamFormat>& audioStreamFormats() const { return audioStreamFormats_; }
    /// The track UIDs in document order.
    const ADMElementTable<ADMAudioTrackUID>& audioTrackUIDs() const { return audioTrackUIDs_; }

    /// Each stores the element under its own ID, in the place of one that is there.
    void addAudioProgramme(std::unique_ptr<ADMAudioProgramme> element);
    void addAudioContent(std::unique_ptr<ADMAudioContent> element);
    void addAudioObject(std::unique_ptr<ADMAudioObject> element);
    void addAudioChannelFormat(std::unique_ptr<ADMAudioChannelFormat> element);
    void addAudioTrackFormat(std::unique_ptr<ADMAudioTrackFormat> element);
    void addAudioPackFormat(std::unique_ptr<ADMAudioPackFormat> element);
    void addAudioStreamFormat(std::unique_ptr<ADMAudioStreamFormat> element);
    void addAudioTrackUID(std::unique_ptr<ADMAudioTrackUID> element);

    /// Fills the links of all elements. Runs at the end of a well-formed document.
    void resolveIDRefs();
    /// The element of an ID; null for no ID and for an empty prefix. Raises MissingDefinition for an ID that the
    /// document does not have, MalformedIDString for one without a prefix.
    ADMElement* findADMElementRef(std::optional<std::string_view> identifier,
                                  std::optional<std::string_view> typePrefix = {}) override;
    void expectADMElementRef(std::string_view identifier, std::string_view typePrefix) override;
    /// True for this very class; a derived class may look elements up elsewhere.
    bool findsClassesOfPrefixes() const override { return typeid(*this) == typeid(ADMDocument); }

    /// The stream that the document was made with; it stays the document's.
    platform::InputStream* inputStream() const { return inputStream_.get(); }
    /// The running parser; null unless a parse runs.
    platform::XMLParser* parser() const { return parser_.get(); }
    /// Why the last parse returned false; null when it did not.
    const platform::Error* parseError() const { return parseError_ ? &*parseError_ : nullptr; }

    /// The elements that are open in the parse, innermost last. A document whose parse failed keeps them until the
    /// next parse.
    const std::vector<std::unique_ptr<ADMElement>>& currentElements() const { return currentElements_; }
    /// The sub-elements that are open in the parse, innermost last; valid until the parse goes on.
    std::span<const std::unique_ptr<ADMGenericElement>> currentGenericElements() const;
    /// The element around the innermost open one; null when there is none.
    ADMElement* parentElement() const;
    /// Removes the innermost open element and hands it over; null when there is none.
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
