#include "platform/PropertyList.h"
#include "platform/String.h"
#include "platform/core/ByteWriter.h"
#include "platform/core/HashSlots.h"
#include "platform/plist/PropertyListBinary.h"

#include <algorithm>
#include <cstring>
#include <functional>
#include <limits>

namespace platform::plist {

namespace {

/// The fewest of 1, 2, 4 or 8 bytes that hold `number`, as a power of two.
unsigned widthExponent(std::uint64_t number)
{
    if (number <= std::numeric_limits<std::uint8_t>::max())
        return 0;
    if (number <= std::numeric_limits<std::uint16_t>::max())
        return 1;
    return number <= std::numeric_limits<std::uint32_t>::max() ? 2 : 3;
}

void writeNumber(ByteWriter& out, std::uint64_t number, unsigned exponent)
{
    switch (exponent) {
    case 0:
        return out.write(static_cast<std::uint8_t>(number));
    case 1:
        return out.write(static_cast<std::uint16_t>(number));
    case 2:
        return out.write(static_cast<std::uint32_t>(number));
    default:
        return out.write(number);
    }
}

/// Numbers the objects first (a container before its content, a text once for all its uses), then writes them in that
/// order. A dictionary is ordered by its keys, so equal values give equal bytes.
class Writer {
public:
    explicit Writer(std::string& problem) : problem_(problem) {}
    bool write(const Value& value, Bytes& bytes);

private:
    /// A text or any other value; a container's references begin at firstReference in references_.
    struct Object {
        const Value* value = nullptr;
        const std::string* text = nullptr;
        std::size_t firstReference = 0;
    };

    /// An entry of the table that finds a text's object without an allocation per text.
    struct Slot {
        std::uint64_t hash = 0;
        std::uint64_t number = 0; // of the object, from 1; 0 if the slot is free
    };

    bool number(const Value& value, int depth, std::uint64_t& index);
    bool numberContainer(const Value& value, int depth, std::uint64_t object);
    bool numberText(const std::string& text, std::uint64_t& index);
    Slot& slotOf(const std::string& text);
    bool mayShare(const std::string& text);

    bool writeObject(const Object& object);
    void writeHead(BinaryKind kind, std::uint64_t count);
    void writeInteger(std::int64_t integer);
    bool writeText(const std::string& text);
    void writeReferences(std::size_t first, std::size_t count);
    void writeTable();

    bool fail(const char* problem)
    {
        problem_ = problem;
        return false;
    }

    ByteWriter out_;
    std::vector<Object> objects_;
    std::vector<std::uint64_t> references_;
    std::vector<std::uint64_t> offsets_;
    std::vector<Slot> slots_;       // a power of two, at most half of them used
    std::size_t textCount_ = 0;     // different ones
    std::uint64_t leastSize_ = 0;   // the file is at least this long
    std::uint64_t sharedBytes_ = 0; // of texts, beyond their first use
    unsigned referenceExponent_ = 0;
    std::string& problem_;
};

bool Writer::write(const Value& value, Bytes& bytes)
{
    std::uint64_t top = 0;
    if (!number(value, 0, top))
        return false;
    referenceExponent_ = widthExponent(objects_.size() - 1);
    out_.reserve(2 * leastSize_ + references_.size() * 4 + objects_.size() * 4);
    offsets_.reserve(objects_.size());
    out_.write(bytesOf(kBinaryHeader));
    for (const Object& object : objects_) {
        offsets_.push_back(out_.size());
        if (!writeObject(object))
            return false;
    }
    writeTable();
    bytes = out_.take();
    return true;
}

bool Writer::number(const Value& value, int depth, std::uint64_t& index)
{
    if (const auto* text = value.get<std::string>())
        return numberText(*text, index);
    index = objects_.size();
    objects_.push_back({&value, nullptr, references_.size()});
    ++leastSize_;
    if (const auto* data = value.get<Bytes>())
        leastSize_ += data->size();
    if (value.get<Array>() == nullptr && value.get<Dictionary>() == nullptr)
        return true;
    if (depth == kPropertyListMaximumDepth)
        return fail("it is nested too deeply");
    return numberContainer(value, depth, index);
}

bool Writer::numberContainer(const Value& value, int depth, std::uint64_t object)
{
    std::size_t next = objects_[object].firstReference;
    if (const auto* array = value.get<Array>()) {
        references_.resize(next + array->size());
        leastSize_ += array->size();
        for (const Value& element : *array) {
            std::uint64_t index = 0;
            if (!number(element, depth + 1, index))
                return false;
            references_[next++] = index;
        }
        return true;
    }
    const auto& dictionary = *value.get<Dictionary>();
    references_.resize(next + dictionary.size() * 2);
    leastSize_ += dictionary.size() * 2;
    for (const auto& entry : dictionary) {
        std::uint64_t index = 0;
        if (!numberText(entry.first, index))
            return false;
        references_[next++] = index;
    }
    for (const auto& entry : dictionary) {
        std::uint64_t index = 0;
        if (!number(entry.second, depth + 1, index))
            return false;
        references_[next++] = index;
    }
    return true;
}

bool Writer::numberText(const std::string& text, std::uint64_t& index)
{
    Slot& slot = slotOf(text);
    const bool isNew = slot.number == 0;
    if (!isNew && mayShare(text)) {
        index = slot.number - 1;
        return true;
    }
    textCount_ += isNew ? 1 : 0;
    index = objects_.size();
    slot.number = index + 1;
    objects_.push_back({nullptr, &text, 0});
    leastSize_ += 1 + text.size() / 2; // UTF-16 takes at least half as many bytes as UTF-8
    return true;
}

/// The slot of the text, or a free slot that has its hash.
Writer::Slot& Writer::slotOf(const std::string& text)
{
    if (2 * (textCount_ + 1) > slots_.size())
        growHashSlots(slots_);
    const std::uint64_t hash = std::hash<std::string>()(text);
    for (std::size_t i = hash;; ++i) {
        Slot& slot = slots_[i & (slots_.size() - 1)];
        if (slot.number == 0)
            slot.hash = hash;
        if (slot.number == 0 || (slot.hash == hash && *objects_[slot.number - 1].text == text))
            return slot;
    }
}

/// Readers refuse a list whose values unfold to far more than its size, so a long text that is used very often is
/// written again from time to time. Half of the budget is left to the values themselves.
bool Writer::mayShare(const std::string& text)
{
    if (sharedBytes_ + text.size() > unfoldingBudget(leastSize_) / 2)
        return false;
    sharedBytes_ += text.size();
    return true;
}

bool Writer::writeObject(const Object& object)
{
    if (object.text != nullptr)
        return writeText(*object.text);
    const Value& value = *object.value;
    if (const auto* flag = value.get<bool>()) {
        out_.write(std::uint8_t{*flag ? std::uint8_t{9} : std::uint8_t{8}});
    } else if (const auto* integer = value.get<std::int64_t>()) {
        writeInteger(*integer);
    } else if (const auto* real = value.get<double>()) {
        writeHead(BinaryKind::real, 3);
        out_.write(*real);
    } else if (const auto* date = value.get<Date>()) {
        writeHead(BinaryKind::date, 3);
        out_.write(date->secondsSince2001);
    } else if (const auto* data = value.get<Bytes>()) {
        writeHead(BinaryKind::data, data->size());
        out_.write(BytesView(*data));
    } else if (const auto* array = value.get<Array>()) {
        writeHead(BinaryKind::array, array->size());
        writeReferences(object.firstReference, array->size());
    } else if (const auto* dictionary = value.get<Dictionary>()) {
        writeHead(BinaryKind::dictionary, dictionary->size());
        writeReferences(object.firstReference, dictionary->size() * 2);
    } else {
        return fail("a property list cannot hold null");
    }
    return true;
}

void Writer::writeHead(BinaryKind kind, std::uint64_t count)
{
    const auto high = static_cast<unsigned>(kind) << 4;
    out_.write(static_cast<std::uint8_t>(high | std::min<std::uint64_t>(count, 15)));
    if (count < 15)
        return;
    const unsigned exponent = widthExponent(count);
    out_.write(static_cast<std::uint8_t>(0x10 | exponent));
    writeNumber(out_, count, exponent);
}

void Writer::writeInteger(std::int64_t integer)
{
    // Integers of less than 8 bytes are unsigned.
    const auto number = static_cast<std::uint64_t>(integer);
    const unsigned exponent = widthExponent(number);
    writeHead(BinaryKind::integer, exponent);
    writeNumber(out_, number, exponent);
}

bool Writer::writeText(const std::string& text)
{
    if (isASCII(text)) {
        writeHead(BinaryKind::ascii, text.size());
        out_.write(bytesOf(text));
        return true;
    }
    const String decoded = String::fromUTF8(text);
    if (decoded.isNull())
        return fail("a text is not UTF-8");
    const std::u16string units = decoded.utf16();
    writeHead(BinaryKind::utf16, units.size());
    for (const char16_t unit : units)
        out_.write(unit);
    return true;
}

void Writer::writeReferences(std::size_t first, std::size_t count)
{
    for (std::size_t i = 0; i < count; ++i)
        writeNumber(out_, references_[first + i], referenceExponent_);
}

void Writer::writeTable()
{
    const unsigned offsetExponent = widthExponent(offsets_.back());
    BinaryTrailer trailer;
    trailer.offsetSize = static_cast<std::uint8_t>(1U << offsetExponent);
    trailer.referenceSize = static_cast<std::uint8_t>(1U << referenceExponent_);
    trailer.objectCount = objects_.size();
    trailer.topObject = 0;
    trailer.offsetTableOffset = out_.size();
    trailer.byteOrder();
    for (const std::uint64_t offset : offsets_)
        writeNumber(out_, offset, offsetExponent);
    out_.write(std::as_bytes(std::span(&trailer, 1)));
}

} // namespace

bool writeBinary(const Value& value, Bytes& bytes, std::string& problem)
{
    return Writer(problem).write(value, bytes);
}

} // namespace platform::plist
