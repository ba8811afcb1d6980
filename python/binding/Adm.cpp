// ADM documents as plain Python values, which ktfiles.adm makes objects of: elements by kind, each with its attributes
// and the ids of what its references lead to; the blocks of a channel as arrays.
#include "binding/AdmBlocks.h"
#include "binding/Bindings.h"
#include "binding/Interpreter.h"
#include "binding/Location.h"
#include "binding/Problem.h"
#include "binding/Values.h"

#include "adm/ADMDocument.h"
#include "adm/files/ADMSource.h"

#include <pybind11/stl.h>

namespace py = pybind11;

namespace {

/// The attributes of one element; what is not given is None.
class Attributes {
public:
    void text(const char* name, const std::string& value)
    {
        values_[name] = value.empty() ? py::object(py::none()) : textFrom(value);
    }
    void text(const char* name, const std::optional<std::string>& value) { text(name, value.value_or("")); }
    /// Microseconds; seconds for Python.
    void time(const char* name, std::int64_t value)
    {
        values_[name] =
            value == kADMInvalidTime ? py::object(py::none()) : py::float_(static_cast<double>(value) / 1e6);
    }
    template <class T>
    void number(const char* name, T value)
    {
        values_[name] = value;
    }
    void positive(const char* name, std::int64_t value)
    {
        values_[name] = value > 0 ? py::object(py::int_(value)) : py::none();
    }
    void labels(const ADMLabels& labels)
    {
        py::dict made;
        for (const auto& [language, label] : labels)
            made[textFrom(language)] = textFrom(label);
        values_["labels"] = made;
    }
    /// References that lead nowhere, as a lenient reading lets pass, are left out.
    template <class Element>
    void links(const char* name, const std::vector<Element*>& elements)
    {
        py::list ids;
        for (const Element* const element : elements)
            if (element != nullptr)
                ids.append(textFrom(element->elementID()));
        values_[name] = ids;
    }
    template <class Element>
    void link(const char* name, const Element* element)
    {
        values_[name] = element != nullptr ? py::object(textFrom(element->elementID())) : py::none();
    }
    py::dict take() { return std::move(values_); }

private:
    py::dict values_;
};

void describe(Attributes& to, const ADMAudioProgramme& programme)
{
    to.number("index", programme.index());
    to.text("name", programme.audioProgrammeName());
    to.text("language", programme.audioProgrammeLanguage());
    to.time("start", programme.exactStart());
    to.time("end", programme.exactEnd());
    to.number("max_ducking_depth", programme.maxDuckingDepth());
    to.links("contents", programme.audioContents());
    to.labels(programme.audioProgrammeLabels());
}

void describe(Attributes& to, const ADMAudioContent& content)
{
    to.number("index", content.index());
    to.text("name", content.audioContentName());
    to.text("language", content.audioContentLanguage());
    to.links("objects", content.audioObjects());
    to.labels(content.audioContentLabels());
    to.number("dialogue_mode", content.dialogueMode());
    to.number("non_dialogue_content_kind", content.nonDialogueContentKind());
    to.number("dialogue_content_kind", content.dialogueContentKind());
    to.number("mixed_content_kind", content.mixedContentKind());
}

void describe(Attributes& to, const ADMAudioObject& object)
{
    to.text("name", object.audioObjectName());
    to.time("start", object.exactStart());
    to.time("duration", object.exactDuration());
    to.number("dialogue_mode", object.dialogueMode());
    to.number("importance", object.importance());
    to.number("interact", object.interact());
    to.number("disallow_ducking", object.disallowDucking());
    to.links("pack_formats", object.audioPackFormats());
    to.links("objects", object.audioObjects());
    to.links("track_uids", object.audioTrackUIDs());
    to.labels(object.audioObjectLabels());
    to.number("gain", linearGain(object.gain(), object.gainUnit()));
    to.number("head_locked", object.headLocked());
    to.number("mute", object.mute());
    const ADMPolarOffset polar = object.polarOffset();
    to.number("polar_offset", py::make_tuple(polar.azimuth, polar.elevation, polar.distance));
    const ADMCartesianOffset cartesian = object.cartesianOffset();
    to.number("cartesian_offset", py::make_tuple(cartesian.X, cartesian.Y, cartesian.Z));
}

void describe(Attributes& to, const ADMAudioPackFormat& pack)
{
    to.text("name", pack.audioPackFormatName());
    to.text("type", ADMGetNameForType(pack.type()));
    to.number("importance", static_cast<std::int64_t>(pack.importance()));
    to.number("absolute_distance", pack.absoluteDistance());
    to.links("channel_formats", pack.audioChannelFormats());
    to.links("pack_formats", pack.audioPackFormats());
}

void describe(Attributes& to, const ADMAudioChannelFormat& channel)
{
    to.text("name", channel.audioChannelFormatName());
    to.text("type", ADMGetNameForType(channel.type()));
    to.number("blocks", blockArrays(channel));
}

void describe(Attributes& to, const ADMAudioStreamFormat& stream)
{
    to.text("name", stream.audioStreamFormatName());
    to.text("format", ADMGetNameForFormat(stream.format()));
    to.link("channel_format", stream.audioChannelFormat());
    to.link("pack_format", stream.audioPackFormat());
    to.links("track_formats", stream.audioTrackFormats());
}

void describe(Attributes& to, const ADMAudioTrackFormat& track)
{
    to.text("name", track.audioTrackFormatName());
    to.text("format_label", track.formatLabel());
    to.text("format_definition", track.formatDefinition());
    to.link("stream_format", track.audioStreamFormat());
}

void describe(Attributes& to, const ADMAudioTrackUID& track)
{
    to.number("index", track.index());
    to.positive("sample_rate", track.sampleRate());
    to.positive("bit_depth", track.bitDepth());
    to.link("track_format", track.audioTrackFormat());
    to.link("channel_format", track.audioChannelFormat());
    to.link("pack_format", track.audioPackFormat());
}

template <class Element>
py::list listOf(const ADMElementTable<Element>& elements)
{
    py::list made;
    for (const Element& element : elements) {
        Attributes attributes;
        attributes.text("id", element.elementID());
        describe(attributes, element);
        made.append(attributes.take());
    }
    return made;
}

std::string textOf(const ADMDiagnostic& diagnostic)
{
    const std::string text = diagnostic.kind + ": " + diagnostic.text;
    return diagnostic.position.line == 0 ? text : "line " + std::to_string(diagnostic.position.line) + ": " + text;
}

std::unique_ptr<ADMDocument> parse(const std::string& path, bool isLenient)
{
    platform::Error error;
    const auto source = ADMSource::open(referenceTo(path), ADMSource::Document::isThere, &error);
    if (!source)
        throwProblem(path, error);
    auto document = std::make_unique<ADMDocument>(nullptr);
    document->setOptions({isLenient, isLenient, isLenient, isLenient});
    std::optional<ADMDiagnostic> last;
    document->setDiagnosticsHandler([&](const ADMDiagnostic& told) { last = told; });
    std::exception_ptr interruption; // the parser is no place for exceptions of others
    document->setProgressHandler([&](std::uint64_t) {
        try {
            heedSignals();
            return true;
        } catch (...) {
            interruption = std::current_exception();
            return false;
        }
    });
    const auto stream = source->stream();
    bool isComplete = false;
    try {
        isComplete = document->parseStream(*stream);
    } catch (const ADMException&) {
        // The handler has heard of it, and with its place.
    }
    if (interruption)
        std::rethrow_exception(interruption);
    if (!isComplete)
        throw Problem(path, kStatusParameterError, last ? textOf(*last) : "no ADM document");
    document->setDiagnosticsHandler(nullptr);
    document->setProgressHandler(nullptr);
    return document;
}

py::dict readDocument(const std::string& path, bool isLenient)
{
    std::unique_ptr<ADMDocument> document;
    {
        const Unlocked unlocked;
        document = parse(path, isLenient);
    }
    py::dict made;
    made["programmes"] = listOf(document->audioProgrammes());
    made["contents"] = listOf(document->audioContents());
    made["objects"] = listOf(document->audioObjects());
    made["pack_formats"] = listOf(document->audioPackFormats());
    made["channel_formats"] = listOf(document->audioChannelFormats());
    made["stream_formats"] = listOf(document->audioStreamFormats());
    made["track_formats"] = listOf(document->audioTrackFormats());
    made["track_uids"] = listOf(document->audioTrackUIDs());
    return made;
}

} // namespace

void bindAdm(py::module_& module)
{
    module.def("adm", &readDocument, py::arg("path"), py::arg("lenient"));
}
