#include "platform/core/JsonWriter.h"

#include <gtest/gtest.h>

#include <limits>

TEST(JsonWriter, KeepsDigitsAndEscapes)
{
    JsonWriter json;
    json.beginArray().write(0.1).write(120.0).write(1e300).write(5e-324).write(-0.0).write(0.1F);
    json.write(std::numeric_limits<std::int64_t>::min()).write(true).write("\x1F\x7F\xE2\x80\xAE\xFF\xF3\xA0\x80\x81");
    json.write(platform::Value(platform::Date{0})).write("").endArray();
    EXPECT_EQ(json.text(), "[0.1,120.0,1e+300,5e-324,-0.0,0.1,-9223372036854775808,true,"
                           "\"\\u001f\\u007f\\u202e\xEF\xBF\xBD\\udb40\\udc01\",\"2001-01-01T00:00:00Z\",\"\"]");
}
