#include "binding/AdmBlocks.h"

#include "binding/Values.h"

#include "adm/ADMAudioBlockFormat_DirectSpeaker.h"
#include "adm/ADMAudioBlockFormat_Object.h"

#include <pybind11/numpy.h>

#include <cmath>
#include <limits>

namespace py = pybind11;

namespace {

double secondsOf(std::int64_t microseconds)
{
    return microseconds == kADMInvalidTime ? std::numeric_limits<double>::quiet_NaN()
                                           : static_cast<double>(microseconds) / 1e6;
}

/// The arrays while they are filled.
class Arrays {
public:
    explicit Arrays(py::ssize_t count)
        : times_(count),
          durations_(count),
          gains_(count),
          positions_({count, py::ssize_t{3}}),
          sizes_({count, py::ssize_t{3}}),
          diffuse_(count),
          importances_(count),
          cartesian_(count),
          jumps_(count)
    {
    }

    void set(py::ssize_t i, const ADMAudioBlockFormat& block)
    {
        times_.mutable_at(i) = secondsOf(block.exactRtime());
        durations_.mutable_at(i) = secondsOf(block.exactDuration());
        gains_.mutable_at(i) = block.hasGain() ? linearGain(block.gain(), block.gainUnit()) : 1;
        importances_.mutable_at(i) = block.importance();
        ids_.append(textFrom(block.audioBlockFormatID()));
        const auto* const object = dynamic_cast<const ADMAudioBlockFormat_Object*>(&block);
        const auto* const speaker = dynamic_cast<const ADMAudioBlockFormat_DirectSpeaker*>(&block);
        setPosition(i, object != nullptr    ? object->position()
                       : speaker != nullptr ? speaker->position()
                                            : ADMPosition());
        sizes_.mutable_at(i, 0) = object != nullptr ? object->width() : 0;
        sizes_.mutable_at(i, 1) = object != nullptr ? object->height() : 0;
        sizes_.mutable_at(i, 2) = object != nullptr ? object->depth() : 0;
        diffuse_.mutable_at(i) = object != nullptr ? object->diffuse() : 0;
        jumps_.mutable_at(i) = object != nullptr && object->jumpPosition();
        const bool hasLabel = speaker != nullptr && speaker->speakerLabel();
        speakerLabels_.append(hasLabel ? py::object(textFrom(*speaker->speakerLabel())) : py::none());
    }

    py::dict take()
    {
        py::dict made;
        made["times"] = times_;
        made["durations"] = durations_;
        made["gains"] = gains_;
        made["positions"] = positions_;
        made["cartesian"] = cartesian_;
        made["sizes"] = sizes_;
        made["diffuse"] = diffuse_;
        made["jumps"] = jumps_;
        made["importances"] = importances_;
        made["speaker_labels"] = speakerLabels_;
        made["ids"] = ids_;
        return made;
    }

private:
    void setPosition(py::ssize_t i, const ADMPosition& position)
    {
        cartesian_.mutable_at(i) = position.cartesian;
        positions_.mutable_at(i, 0) = position.cartesian ? position.X : position.azimuth;
        positions_.mutable_at(i, 1) = position.cartesian ? position.Y : position.elevation;
        positions_.mutable_at(i, 2) = position.cartesian ? position.Z : position.distance;
    }

    py::array_t<double> times_, durations_, gains_;
    py::array_t<float> positions_, sizes_, diffuse_, importances_;
    py::array_t<bool> cartesian_, jumps_;
    py::list ids_, speakerLabels_;
};

} // namespace

double linearGain(double gain, int unit)
{
    return unit == 1 ? std::pow(10.0, gain / 20) : gain;
}

py::dict blockArrays(const ADMAudioChannelFormat& channel)
{
    const auto& blocks = channel.audioBlockFormat();
    Arrays arrays(static_cast<py::ssize_t>(blocks.size()));
    py::ssize_t i = 0;
    for (const auto& block : blocks)
        arrays.set(i++, *block);
    return arrays.take();
}
