#pragma once
// A small JSON text builder: objects, arrays, strings escaped, numbers in their shortest
// round-trip form. Top-level members go one per line so that the text reads well in a terminal.

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace zp {

class JsonWriter {
  public:
    void beginObject();
    void endObject();
    void beginArray();
    void endArray();
    // The next value belongs to this member of the enclosing object.
    void key(std::string_view name);

    void value(double v);  // non-finite numbers have no JSON form: written as null
    void value(std::int64_t v);
    void value(int v) { value(static_cast<std::int64_t>(v)); }
    void value(bool v);
    void value(std::string_view v);
    void value(const char* v) { value(std::string_view(v)); }
    void null();
    // One "name": value member of the enclosing object.
    template <typename T>
    void member(std::string_view name, const T& v) {
        key(name);
        value(v);
    }

    const std::string& text() const { return out_; }

  private:
    void beforeValue();
    void separate();
    void open(char bracket, char closing);
    void close(char closing);

    std::string out_;
    struct Open {
        char closing;  // '}' or ']'
        bool hasMembers;
    };
    std::vector<Open> open_;
    bool afterKey_ = false;
};

// The string as a quoted JSON literal.
std::string jsonQuoted(std::string_view v);

}  // namespace zp
