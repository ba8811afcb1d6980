#include "media/containers/ChunkRules.h"

#include <algorithm>
#include <array>
#include <span>

namespace platform {

namespace {

struct Rule {
    FourCC id;
    std::uint32_t leastSize = 0;
};

constexpr std::array kInWAVE{Rule{fourCC("fmt ")},     Rule{fourCC("data")},      Rule{fourCC("ds64")},
                             Rule{fourCC("fact"), 4},  Rule{fourCC("bext"), 602}, Rule{fourCC("axml")},
                             Rule{fourCC("chna"), 4},  Rule{fourCC("iXML")},      Rule{fourCC("cue "), 4},
                             Rule{fourCC("smpl"), 36}, Rule{fourCC("inst"), 7},   Rule{fourCC("acid"), 24},
                             Rule{fourCC("levl")},     Rule{fourCC("MD5 ")}};
constexpr std::array kInAIFF{Rule{fourCC("COMM")},    Rule{fourCC("SSND"), 8},  Rule{fourCC("FVER"), 4},
                             Rule{fourCC("MARK"), 2}, Rule{fourCC("INST"), 20}, Rule{fourCC("COMT"), 2},
                             Rule{fourCC("NAME")},    Rule{fourCC("AUTH")},     Rule{fourCC("(c) ")},
                             Rule{fourCC("AESD"), 24}};
constexpr std::array kInCAF{Rule{fourCC("desc")},    Rule{fourCC("data"), 4},  Rule{fourCC("pakt"), 24},
                            Rule{fourCC("kuki")},    Rule{fourCC("chan"), 12}, Rule{fourCC("strg"), 4},
                            Rule{fourCC("mark"), 8}, Rule{fourCC("regn"), 8},  Rule{fourCC("inst")},
                            Rule{fourCC("info"), 4}, Rule{fourCC("umid"), 64}, Rule{fourCC("midi")}};

std::span<const Rule> rulesOf(ContainerKind kind)
{
    switch (kind) {
    case ContainerKind::riff:
    case ContainerKind::rifx:
    case ContainerKind::wave64:
        return kInWAVE;
    case ContainerKind::iff:
        return kInAIFF;
    case ContainerKind::caf:
        return kInCAF;
    default:
        return {};
    }
}

const Rule* ruleOf(ContainerKind kind, FourCC id)
{
    const auto rules = rulesOf(kind);
    const auto found = std::ranges::find(rules, id, &Rule::id);
    return found != rules.end() ? &*found : nullptr;
}

} // namespace

bool isSingleChunk(ContainerKind kind, FourCC id)
{
    return ruleOf(kind, id) != nullptr;
}

std::uint32_t leastSizeOfChunk(ContainerKind kind, FourCC id)
{
    const Rule* const rule = ruleOf(kind, id);
    return rule != nullptr ? rule->leastSize : 0;
}

} // namespace platform
