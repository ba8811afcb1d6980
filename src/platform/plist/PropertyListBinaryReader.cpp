#include "platform/PropertyList.h"
#include "platform/String.h"
#include "platform/core/ByteOrder.h"
#include "platform/core/ByteReader.h"
#include "platform/plist/PropertyListBinary.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <limits>

namespace platform::plist {

namespace {

/// A big-endian unsigned number that fills the field, which has at most 8 bytes.
std::uint64_t unsignedNumber(BytesView field)
{
    std::uint64_t number = 0;
    for (const std::byte byte : field)
        number = number << 8 | std::to_integer<std::uint64_t>(byte);
    return number;
}

class Reader {
public:
    Reader(BytesView bytes, std::string& problem, PropertyListReading reading)
        : bytes_(bytes),
          isLenient_(reading == PropertyListReading::lenient),
          budget_(unfoldingBudget(bytes.size())),
          problem_(problem)
    {
    }
    bool read(Value& value);

private:
    bool readTrailer();
    bool readObject(std::uint64_t index, int depth, Value& value);
    bool readScalar(BinaryKind kind, unsigned low, ByteReader& in, Value& value);
    bool readInteger(unsigned low, ByteReader& in, Value& value);
    bool readCounted(BinaryKind kind, std::uint64_t count, ByteReader& in, Value& value);
    bool readContainer(BinaryKind kind, std::uint64_t count, ByteReader& in, int depth, Value& value);
    bool readArray(BytesView references, int depth, Value& value);
    bool readDictionary(BytesView references, int depth, Value& value);

    std::uint64_t reference(BytesView references, std::size_t index) const
    {
        return unsignedNumber(references.subspan(index * trailer_.referenceSize, trailer_.referenceSize));
    }
    bool charge(std::uint64_t cost)
    {
        if (cost > budget_)
            return fail("its values unfold to far more than its size");
        budget_ -= cost;
        return true;
    }
    bool fail(const char* problem)
    {
        problem_ = problem;
        return false;
    }
    /// Leaves a null in place of an object that cannot be read, if that is allowed.
    bool leaveOut(Value& value, const char* problem)
    {
        value = Value();
        return isLenient_ || fail(problem);
    }

    BytesView bytes_;
    const bool isLenient_;
    BinaryTrailer trailer_;
    BytesView objects_; // from the start of the file, so that offsets index it
    BytesView offsets_; // exactly objectCount entries
    std::uint64_t budget_;
    std::string& problem_;
};

bool Reader::read(Value& value)
{
    if (!readTrailer())
        return false;
    return readObject(trailer_.topObject, 0, value);
}

bool Reader::readTrailer()
{
    if (bytes_.size() < kBinaryHeader.size() + sizeof trailer_)
        return fail("the file is cut short");
    if (!textOf(bytes_).starts_with(kBinaryHeader))
        return fail("unknown version of the binary format");
    const std::uint64_t end = bytes_.size() - sizeof trailer_;
    std::memcpy(&trailer_, bytes_.data() + end, sizeof trailer_);
    trailer_.byteOrder();

    const auto isWidth = [](std::uint8_t width) { return width >= 1 && width <= 8; };
    if (!isWidth(trailer_.offsetSize) || !isWidth(trailer_.referenceSize))
        return fail("the trailer has impossible integer sizes");
    if (trailer_.offsetTableOffset < kBinaryHeader.size() || trailer_.offsetTableOffset > end)
        return fail("the offset table lies outside of the file");
    if (trailer_.objectCount > (end - trailer_.offsetTableOffset) / trailer_.offsetSize)
        return fail("the offset table is cut short");
    objects_ = bytes_.first(trailer_.offsetTableOffset);
    offsets_ = bytes_.subspan(trailer_.offsetTableOffset, trailer_.objectCount * trailer_.offsetSize);
    return true;
}

bool Reader::readObject(std::uint64_t index, int depth, Value& value)
{
    if (index >= trailer_.objectCount)
        return fail("a reference to an object that is not there");
    const std::uint64_t offset = unsignedNumber(offsets_.subspan(index * trailer_.offsetSize, trailer_.offsetSize));
    if (offset < kBinaryHeader.size() || offset >= objects_.size())
        return fail("an object lies outside of the file");

    ByteReader in(objects_.subspan(offset));
    const auto marker = in.read<std::uint8_t>();
    const auto kind = BinaryKind(marker >> 4);
    const unsigned low = marker & 15U;
    if (kind <= BinaryKind::date)
        return readScalar(kind, low, in, value);

    std::uint64_t count = low;
    if (low == 15) {
        const auto size = in.read<std::uint8_t>();
        if (size < 0x10 || size > 0x13)
            return fail("a count is not an integer");
        count = unsignedNumber(in.take(std::size_t{1} << (size & 15U)));
    }
    if (count > in.remaining() || !in.ok())
        return fail("an object is cut short");
    if (kind != BinaryKind::array && kind != BinaryKind::dictionary)
        return readCounted(kind, count, in, value);

    return readContainer(kind, count, in, depth, value);
}

bool Reader::readScalar(BinaryKind kind, unsigned low, ByteReader& in, Value& value)
{
    if (kind == BinaryKind::integer)
        return readInteger(low, in, value);
    if (kind == BinaryKind::simple && (low == 8 || low == 9))
        value = low == 9;
    else if (kind == BinaryKind::real && low == 2)
        value = double{in.read<float>()};
    else if (kind == BinaryKind::real && low == 3)
        value = in.read<double>();
    else if (kind == BinaryKind::date && low == 3)
        value = Date{in.read<double>()};
    else
        return leaveOut(value, "an object of unknown type");
    return in.ok() || fail("an object is cut short");
}

bool Reader::readInteger(unsigned low, ByteReader& in, Value& value)
{
    if (low > 4)
        return leaveOut(value, "an object of unknown type");
    std::uint64_t high = 0;
    if (low == 4)
        high = in.read<std::uint64_t>();
    const std::uint64_t number = unsignedNumber(in.take(std::size_t{1} << std::min(low, 3U)));
    if (!in.ok())
        return fail("an object is cut short");
    const auto result = static_cast<std::int64_t>(number);
    value = result;
    if (low == 4 && high != (result < 0 ? std::numeric_limits<std::uint64_t>::max() : 0)) {
        if (!isLenient_)
            return fail("an integer needs more than 64 bits");
        value = std::ldexp(static_cast<double>(static_cast<std::int64_t>(high)), 64) + static_cast<double>(number);
    }
    return true;
}

bool Reader::readCounted(BinaryKind kind, std::uint64_t count, ByteReader& in, Value& value)
{
    if (kind == BinaryKind::utf16) {
        const BytesView units = in.take(count * 2);
        if (!in.ok())
            return fail("an object is cut short");
        std::u16string text(count, u'\0');
        for (std::size_t i = 0; i < count; ++i)
            text[i] = loadBE<char16_t>(units.data() + i * 2);
        const String decoded = String::fromUTF16(text);
        if (decoded.isNull())
            return leaveOut(value, "a text is not UTF-16");
        value = decoded.utf8();
        return charge(decoded.utf8().size());
    }
    if (kind != BinaryKind::data && kind != BinaryKind::ascii)
        return leaveOut(value, "an object of unknown type");
    if (!charge(count))
        return false;
    const BytesView content = in.take(count);
    if (kind == BinaryKind::data) {
        value = Bytes(content.begin(), content.end());
        return true;
    }
    if (!isASCII(textOf(content)))
        return leaveOut(value, "a text is not ASCII");
    value = std::string(textOf(content));
    return true;
}

bool Reader::readContainer(BinaryKind kind, std::uint64_t count, ByteReader& in, int depth, Value& value)
{
    if (depth == kPropertyListMaximumDepth) // also ends an object that contains itself
        return fail("it is nested too deeply");
    const bool isArray = kind == BinaryKind::array;
    const std::uint64_t referenceCount = isArray ? count : count * 2;
    if (referenceCount > in.remaining() / trailer_.referenceSize)
        return fail("an object is cut short");
    if (!charge(count * (isArray ? kElementCost : kEntryCost)))
        return false;
    const BytesView references = in.take(referenceCount * trailer_.referenceSize);
    return isArray ? readArray(references, depth, value) : readDictionary(references, depth, value);
}

bool Reader::readArray(BytesView references, int depth, Value& value)
{
    Array array(references.size() / trailer_.referenceSize);
    for (std::size_t i = 0; i < array.size(); ++i)
        if (!readObject(reference(references, i), depth + 1, array[i]))
            return false;
    value = std::move(array);
    return true;
}

bool Reader::readDictionary(BytesView references, int depth, Value& value)
{
    const std::size_t count = references.size() / trailer_.referenceSize / 2;
    Dictionary dictionary;
    for (std::size_t i = 0; i < count; ++i) {
        Value key;
        if (!readObject(reference(references, i), depth + 1, key))
            return false;
        auto* text = key.get<std::string>();
        if (text == nullptr) {
            if (!isLenient_)
                return fail("a key is not a text");
            continue;
        }
        // Most writers sort the keys, so each belongs at the end. Of two equal keys the last one wins.
        const auto entry = dictionary.try_emplace(dictionary.end(), std::move(*text));
        if (!readObject(reference(references, count + i), depth + 1, entry->second))
            return false;
        if (entry->second.isNull())
            dictionary.erase(entry);
    }
    value = std::move(dictionary);
    return true;
}

} // namespace

void BinaryTrailer::byteOrder()
{
    turnFields(std::endian::big, objectCount, topObject, offsetTableOffset);
}

bool readBinary(BytesView bytes, Value& value, std::string& problem, PropertyListReading reading)
{
    return Reader(bytes, problem, reading).read(value);
}

} // namespace platform::plist
