// The lines of an ADM tree: drawn with branches for people, or plain for programs.
#pragma once

#include "tool/adm/AdmWords.h"
#include "tool/shared/output/Output.h"

#include <string>
#include <string_view>
#include <vector>

class AdmTreeWriter {
public:
    struct Look {
        bool isDrawn = true; // otherwise a line is depth, kind, ID, name and details, separated by tabs
        bool hasColor = false;
        bool hasBlockIDs = false;
        int columns = 80;       // lines are broken to fit if possible
        std::string linePrefix; // precedes every plain line
    };

    AdmTreeWriter(Output& output, Look look) : output_(output), look_(std::move(look)) {}

    /// Sets a title, which is written before the next root, if there is one.
    void beginSection(std::string_view title) { section_ = title; }
    /// The next node is a root.
    void beginRoot();
    /// Nodes added until `leave` are below the last one.
    void enter();
    void leave();
    /// `isLast` among its siblings; `hasChildren` if other nodes will follow below it.
    void add(const AdmNode& node, bool isLast, bool hasChildren);

    /// Whether the output is gone.
    bool isUseless() const { return output_.failed(); }

private:
    struct Piece {
        std::string text;
        const char* color = "";
        const char* separator = ""; // follows it, unless a line ends there
    };
    void addPlain(const AdmNode& node);
    std::vector<Piece> piecesOf(const AdmNode& node) const;
    void draw(const std::vector<Piece>& pieces, const std::string& first, const std::string& next);
    void drawBranch(const std::string& branch);

    Output& output_;
    Look look_;
    std::string_view section_;
    std::vector<bool> isLast_; // for the nodes above, from the root on
    std::size_t depth_ = 0;
};
