// JSON text for scripts: what Python's reader takes back, whatever a file's
// text or a number holds.
#include "Json.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

using namespace veltmarquist::json;

TEST(Json, NestsEscapesAndNeverWritesANumberJsonCannotHold)
{
    Writer out;
    out.beginObject()
        .field("schema_version", 1)
        .field("text", "quote \" backslash \\ tab \t bell \x07 del \x7f \xC3\xA9 \xE2\x80\xAE")
        .field("bad", std::string("a\xFF" "b\xC3"))
        .key("numbers").numbers({0.1, -0.0, 1e300, std::numeric_limits<double>::quiet_NaN(), HUGE_VAL})
        .key("empty").beginArray().endArray()
        .key("nested").beginArray().beginObject().field("ok", true).endObject().null().value(3ll).endArray()
        .endObject();
    EXPECT_EQ(out.text(),
              "{\"schema_version\":1,"
              "\"text\":\"quote \\\" backslash \\\\ tab \\u0009 bell \\u0007 del \\u007f \xC3\xA9 \xE2\x80\xAE\","
              "\"bad\":\"a\xEF\xBF\xBD" "b\xEF\xBF\xBD\","
              "\"numbers\":[0.1,0,1e+300,null,null],"
              "\"empty\":[],"
              "\"nested\":[{\"ok\":true},null,3]}");
}
