#include "tool/overview/SoundLanes.h"

#include "tool/shared/input/CodingWords.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <charconv>

std::optional<ChannelChoice> channelChoiceFromText(const std::string& text)
{
    using Kind = ChannelChoice::Kind;
    if (text == "split" || text == "sum")
        return ChannelChoice{text == "sum" ? Kind::sum : Kind::split, 0};
    ChannelChoice one{Kind::one, 0};
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), one.number);
    return error == std::errc() && end == text.data() + text.size() && one.number > 0 ? std::optional(one)
                                                                                      : std::nullopt;
}

std::vector<SoundLane> lanesOf(ChannelChoice choice, const AudioFileInfo& info)
{
    using Kind = SoundLane::Kind;
    const std::vector<std::string> names = channelWords(info);
    const auto lane = [&names](int channel) {
        return SoundLane{Kind::channel, channel, names[static_cast<std::size_t>(channel)], {}};
    };
    if (choice.kind == ChannelChoice::Kind::one && choice.number > info.channels)
        throw Failure(fmt::format("has no channel {}, but {}", choice.number, info.channels));
    if (choice.kind == ChannelChoice::Kind::one)
        return {lane(choice.number - 1)};
    if (info.channels == 1)
        return {{Kind::channel, 0, {}, {}}};
    if (choice.kind == ChannelChoice::Kind::sum)
        return {{Kind::sum, 0, "Sum", {}}};
    if (choice.kind == ChannelChoice::Kind::overview)
        return {info.channels == 2 ? SoundLane{Kind::halves, 0, names[0], names[1]}
                                   : SoundLane{Kind::folded, 0, "All", {}}};
    std::vector<SoundLane> lanes;
    for (int channel = 0; channel < info.channels; ++channel)
        lanes.push_back(lane(channel));
    return lanes;
}
