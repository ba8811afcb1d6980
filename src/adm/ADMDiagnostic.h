// What a host may hear of a document's problems, and what it may let pass.
#pragma once

#include "platform/XMLParser.h"

#include <functional>
#include <string>

/// One problem. It is told before it is raised, or in its place where an option lets it pass.
struct ADMDiagnostic {
    /// The kind of what is not well-formed, or could not be read.
    static constexpr const char* kParseError = "ParseError";

    platform::XMLPosition position; // of the element, or where the parser met it; zeros when unknown
    std::string kind;               // the name of the exception, or `kParseError`
    std::string elementID;          // of the element that has the problem; empty when it has none yet
    std::string text;               // the exception's reason, or the parser's message
};

using ADMDiagnosticsHandler = std::function<void(const ADMDiagnostic&)>;

/// Everything is off unless a host turns it on; what is not named here stays strict.
struct ADMDocumentOptions {
    /// A reference to what is not there leaves a null link.
    bool continuePastUnresolvedReferences = false;
    /// A block of another type than DirectSpeakers and Objects is left out.
    bool skipUnsupportedBlocks = false;
    /// "ATU_00000000" means no track, and leaves a null link without a problem.
    bool silentTrack = false;
    /// The accessors that begin with "exact" read a fraction of a second as decimals; else they give what the others
    /// do.
    bool exactFractions = false;
};
