#include "tool/adm/AdmTreeWriter.h"

#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/Terminal.h"

#include <algorithm>

namespace {

constexpr const char* kBold = "\x1b[1m";
constexpr const char* kDim = "\x1b[2m";
constexpr const char* kRed = "\x1b[31m";
constexpr const char* kNoColor = "\x1b[0m";

constexpr int kLeastColumns = 24; // for text at any depth

} // namespace

void AdmTreeWriter::beginRoot()
{
    if (!section_.empty() && look_.isDrawn)
        output_.print("\n{}{}{}\n", look_.hasColor ? kBold : "", section_, look_.hasColor ? kNoColor : "");
    section_ = {};
}

void AdmTreeWriter::enter()
{
    ++depth_;
}

void AdmTreeWriter::leave()
{
    --depth_;
}

void AdmTreeWriter::add(const AdmNode& node, bool isLast, bool hasChildren)
{
    if (!look_.isDrawn) {
        addPlain(node);
        return;
    }
    isLast_.resize(depth_);
    if (depth_ > 0)
        isLast_.back() = isLast;
    std::string above;
    for (std::size_t level = 0; level + 1 < depth_; ++level)
        above += isLast_[level] ? "   " : "│  ";
    const bool isRoot = depth_ == 0;
    draw(piecesOf(node), isRoot ? "" : above + (isLast ? "└─ " : "├─ "),
         (isRoot ? "" : above + (isLast ? "   " : "│  ")) + (hasChildren ? "│    " : "     "));
}

void AdmTreeWriter::addPlain(const AdmNode& node)
{
    std::string details;
    for (const std::string& detail : node.details)
        details += (details.empty() ? "" : ", ") + printable(detail);
    output_.print("{}{}\t{}\t{}\t{}\t{}\n", look_.linePrefix, depth_, node.kind, printable(node.id),
                  printable(node.name), details);
}

std::vector<AdmTreeWriter::Piece> AdmTreeWriter::piecesOf(const AdmNode& node) const
{
    std::vector<Piece> pieces;
    if (node.kind == "more") {
        pieces.push_back({"… " + node.details.front(), kDim});
        return pieces;
    }
    const bool isMissing = node.kind == "missing";
    const bool isBlock = node.kind == "block";
    if (!node.name.empty())
        pieces.push_back({printable(node.name), depth_ == 0 ? kBold : "", "  "});
    if (!node.id.empty() && (!isBlock || look_.hasBlockIDs))
        pieces.push_back({printable(node.id), kDim, "  "});
    if (!isBlock)
        pieces.push_back({std::string(node.kind), isMissing ? kRed : "", ", "});
    for (std::size_t i = 0; i < node.details.size(); ++i)
        pieces.push_back({printable(node.details[i]), "", isBlock && i == 0 ? "  " : ", "});
    pieces.back().separator = "";
    return pieces;
}

void AdmTreeWriter::draw(const std::vector<Piece>& pieces, const std::string& first, const std::string& next)
{
    drawBranch(first);
    const int indent = displayWidth(first), nextIndent = displayWidth(next);
    int used = 0, room = std::max(look_.columns - indent, kLeastColumns);
    std::string_view separator;
    for (const Piece& piece : pieces) {
        const bool isComma = separator.starts_with(',');
        const int width = displayWidth(piece.text) + (*piece.separator == ',' ? 1 : 0);
        if (used > 0 && used + static_cast<int>(separator.size()) + width > room) {
            output_.print("{}\n", isComma ? "," : "");
            drawBranch(next);
            used = 0;
            room = std::max(look_.columns - nextIndent, kLeastColumns);
            separator = {};
        }
        const bool isColored = look_.hasColor && *piece.color != '\0';
        output_.print("{}{}{}{}", separator, isColored ? piece.color : "", piece.text, isColored ? kNoColor : "");
        used += static_cast<int>(separator.size()) + displayWidth(piece.text);
        separator = piece.separator;
    }
    output_.write("\n");
}

void AdmTreeWriter::drawBranch(const std::string& branch)
{
    if (!branch.empty())
        output_.print("{}{}{}", look_.hasColor ? kDim : "", branch, look_.hasColor ? kNoColor : "");
}
