// Small documents for the tests.
#pragma once

#include "adm/ADMDocument.h"
#include "support/Media.h"
#include "support/TemporaryFolder.h"

#include <memory>
#include <string>
#include <string_view>

/// Wraps the elements in a document's envelopes.
inline std::string enveloped(std::string_view elements)
{
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<ebuCoreMain><coreMetadata><format><audioFormatExtended>" +
           std::string(elements) + "</audioFormatExtended></format></coreMetadata></ebuCoreMain>";
}

/// An element with an ID and a name.
inline std::string named(const std::string& kind, const std::string& id, const std::string& more = "",
                         const std::string& inner = "")
{
    return "<" + kind + " " + kind + "ID='" + id + "' " + kind + "Name='N' " + more + ">" + inner + "</" + kind + ">";
}

inline std::string block(const std::string& id, const std::string& inner = "")
{
    return "<audioBlockFormat audioBlockFormatID='" + id + "'>" + inner + "</audioBlockFormat>";
}

inline std::string channel(const std::string& inner)
{
    return named("audioChannelFormat", "AC_00031001", "typeLabel='0003'", inner);
}

inline std::unique_ptr<ADMDocument> documentOf(std::string_view text)
{
    const BytesView bytes = bytesOf(text);
    return ADMDocument::initWithADMData(Bytes(bytes.begin(), bytes.end()));
}

/// "Name: reason" of the exception that `work` raises; empty if it raises none.
template <class Work>
std::string raised(Work work)
{
    try {
        work();
    } catch (const ADMException& problem) {
        return problem.name() + ": " + problem.reason();
    }
    return {};
}

/// A small but whole document with every kind of element and nearly every reference.
inline std::string wholeDocument()
{
    return std::string(textOf(readFile(mediaPath("harbour.xml"))));
}
