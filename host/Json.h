// JSON text for scripts: objects, arrays, strings and numbers written as a
// reader takes them back. Numbers are the shortest text of the double;
// one that is not finite becomes null. Text that is not UTF-8 has each bad
// byte replaced by U+FFFD; control characters are escaped.
#ifndef VELTMARQUIST_HOST_JSON_H
#define VELTMARQUIST_HOST_JSON_H

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace veltmarquist::json {

class Writer {
public:
    // Objects and arrays; inside an object, key() comes before each value.
    Writer& beginObject();
    Writer& endObject();
    Writer& beginArray();
    Writer& endArray();
    Writer& key(std::string_view name);
    Writer& value(std::string_view text);
    Writer& value(const char* text) { return value(std::string_view(text)); }
    Writer& value(double number);
    Writer& value(int number) { return value(static_cast<long long>(number)); }
    Writer& value(std::size_t number) { return value(static_cast<long long>(number)); }
    Writer& value(long long number);
    Writer& value(bool flag);
    Writer& null();
    Writer& numbers(const std::vector<double>& values);
    // key(name) then value(v); an empty optional or text is left out.
    template <typename T>
    Writer& field(std::string_view name, const T& v)
    {
        return key(name).value(v);
    }
    Writer& field(std::string_view name, const std::string& text)
    {
        return key(name).value(std::string_view(text));
    }

    const std::string& text() const { return text_; }

private:
    void separate();
    std::string text_;
    std::vector<bool> first_; // per open container: no member written yet
    bool afterKey_ = false;
};

// `text` as a JSON string, quotes included.
std::string quoted(std::string_view text);

} // namespace veltmarquist::json

#endif // VELTMARQUIST_HOST_JSON_H
