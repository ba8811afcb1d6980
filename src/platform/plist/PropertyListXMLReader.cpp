#include "platform/InputStream.h"
#include "platform/PropertyList.h"
#include "platform/XMLParser.h"
#include "platform/plist/PropertyListBuilder.h"
#include "platform/plist/PropertyListXML.h"

namespace platform::plist {

namespace {

/// Passes the events of a document to a Builder and ends the parse if it fails.
class XMLReader final : public XMLHandler {
public:
    XMLReader(InputStream& stream, PropertyListReading reading) : builder_(reading), parser_(stream, *this)
    {
        parser_.setMaximumDepth(kPropertyListMaximumDepth + 2); // "plist" around the value, a leaf in it
    }

    bool read(Value& value, std::string& problem)
    {
        Error error;
        if (parser_.parse(&error)) {
            value = builder_.takeValue();
            return true;
        }
        const auto* line = find<std::int64_t>(error.userInfo, "line");
        problem = failedLine_ != 0  ? "line " + std::to_string(failedLine_) + ": " + builder_.problem()
                  : line != nullptr ? "line " + std::to_string(*line) + ": " + error.description
                                    : error.description;
        return false;
    }

private:
    void startElement(std::string_view name, const XMLAttributes&) override { check(builder_.startElement(name)); }
    void endElement(std::string_view) override { check(builder_.endElement()); }
    void characters(std::string_view text) override { check(builder_.characters(text)); }

    void check(bool good)
    {
        if (good)
            return;
        failedLine_ = parser_.position().line;
        parser_.abort();
    }

    Builder builder_;
    XMLParser parser_;
    std::uint32_t failedLine_ = 0;
};

} // namespace

bool readXML(BytesView bytes, Value& value, std::string& problem, PropertyListReading reading)
{
    BorrowedInputStream stream(bytes);
    return XMLReader(stream, reading).read(value, problem);
}

} // namespace platform::plist
