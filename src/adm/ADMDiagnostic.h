// Problems of a document, as a host hears of them, and which of them it may let pass.
#pragma once

#include "platform/XMLParser.h"

#include <functional>
#include <string>

/// One problem. The handler hears of it before the exception is raised, or instead where an option lets it pass.
struct ADMDiagnostic {
    /// The kind of a document that is not well-formed, or whose bytes could not be read.
    static constexpr const char* kParseError = "ParseError";

    platform::XMLPosition position; // of the element, or where the parser met it; zeros when unknown
    std::string kind;               // the name of the exception, or `kParseError`
    std::string elementID;          // of the element that has the problem; empty when it has none yet
    std::string text;               // the exception's reason, or the parser's message
};

/// Called on the parsing thread for each problem. What it throws leaves the parse.
using ADMDiagnosticsHandler = std::function<void(const ADMDiagnostic&)>;

/// All are off unless a host turns them on; what is not named here stays strict.
struct ADMDocumentOptions {
    /// A reference to an element that does not exist leaves a null link.
    bool continuePastUnresolvedReferences = false;
    /// A block of a type other than DirectSpeakers and Objects is left out.
    bool skipUnsupportedBlocks = false;
    /// "ATU_00000000" means no track: it leaves a null link and is no problem.
    bool silentTrack = false;
    /// The accessors that begin with "exact" read the fraction of a second as decimals; otherwise they give what the
    /// accessors without "exact" do.
    bool exactFractions = false;
};
