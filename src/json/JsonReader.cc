#include "json/JsonReader.h"

#include <atomic>
#include <cstring>
#include <iterator>
#include <utility>

#include "json/InputBytes.h"

namespace vantor {

namespace {

// Far above any real document, far below what any stack holds.
constexpr int deepest = 1000;

std::atomic<bool> readerOption{false};

// Reads one value and all that it is made of.
class Reader {
public:
    explicit Reader(std::istream& stream) : input(stream) {}

    void Value(JsonValue& value);
    void Object(std::map<std::string, JsonValue>& members);
    void Array(std::vector<JsonValue>& elements);
    void String(std::string& text);
    void Number(double& number) { input.Number(number); }
    void Bool(bool& flag);
    void Null();
    void Blanks();

private:
    void BlockComment();
    void LineComment();
    void Escape(std::string& text);
    void Member(std::map<std::string, JsonValue>& members);
    // Reads what stands between two brackets: `item` reads one item of the list.
    template <typename Item>
    void List(char open, char close, Item item);

    InputBytes input;
    int depth = 0;  // objects and arrays that are being read, one within the other
    // The elements so far of the arrays that are being read, those of the innermost last. An array
    // that others stand before gets what it needs; growing by itself it would get up to twice that.
    std::vector<JsonValue> pending;
};

void Reader::Blanks() {
    while (input.Good()) {
        input.SkipWhiteSpace();
        if (!input.Accept('/')) {
            return;
        }
        if (input.Peek() == '*') {
            BlockComment();
        } else if (input.Accept('/')) {
            LineComment();
        } else {
            input.PutBack();
        }
    }
}

// Stands before the star behind the opening slash, which may end the comment too.
void Reader::BlockComment() {
    while (input.Good()) {
        if (input.Take() == '*' && input.Accept('/')) {
            return;
        }
    }
}

void Reader::LineComment() {
    while (input.Good() && input.Take() != '\n') {
    }
}

void Reader::Value(JsonValue& value) {
    Blanks();
    JsonKind kind = JsonKind::None;
    const int first = input.Good() ? input.Peek() : InputBytes::end;
    if (first == '"') {
        String(value.text);
        kind = JsonKind::String;
    } else if (first == '-' || (first >= '0' && first <= '9')) {
        Number(value.number);
        kind = JsonKind::Number;
    } else if (first == '{') {
        Object(value.members);
        kind = JsonKind::Object;
    } else if (first == '[') {
        Array(value.elements);
        kind = JsonKind::Array;
    } else if (first == 't' || first == 'f') {
        Bool(value.flag);
        kind = JsonKind::Boolean;
    } else if (first == 'n') {
        Null();
        kind = JsonKind::Null;
    } else if (input.Good()) {
        input.Take();
    }
    if (kind != JsonKind::None && input.Good()) {
        value.kind = kind;
    }
}

void Reader::String(std::string& text) {
    input.Expect('"');
    if (!input.Good()) {
        return;
    }
    std::string collected(input.TakePlainText());
    while (input.Good()) {
        const int byte = input.Take();
        if (byte == InputBytes::end) {
            return;
        }
        if (byte == '"') {
            text = std::move(collected);
            return;
        }
        if (byte == '\\') {
            Escape(collected);
        } else {
            collected += std::char_traits<char>::to_char_type(byte);
        }
        collected += input.TakePlainText();
    }
}

void Reader::Escape(std::string& text) {
    static constexpr char letters[] = {'b', 'f', 'n', 'r', 't'};
    static constexpr char controls[] = {'\b', '\f', '\n', '\r', '\t'};
    const int byte = input.Take();
    if (byte == InputBytes::end || byte == 'u') {
        return;
    }
    const char escaped = std::char_traits<char>::to_char_type(byte);
    if (escaped == '"' || escaped == '/' || escaped == '\\') {
        text += escaped;
        return;
    }
    const void* const letter = std::memchr(letters, escaped, sizeof letters);
    if (letter != nullptr) {
        text += controls[static_cast<const char*>(letter) - letters];
        return;
    }
    text += '\\';
    text += escaped;
}

void Reader::Bool(bool& flag) {
    char bytes[5];
    if (!input.Take(bytes, sizeof bytes)) {
        return;
    }
    if (std::memcmp(bytes, "true", 4) == 0) {
        input.PutBack();
        flag = true;
    } else if (std::memcmp(bytes, "false", 5) == 0) {
        flag = false;
    } else {
        input.Fail();
    }
}

void Reader::Null() {
    char bytes[4];
    if (input.Take(bytes, sizeof bytes) && std::memcmp(bytes, "null", sizeof bytes) != 0) {
        input.Fail();
    }
}

template <typename Item>
void Reader::List(char open, char close, Item item) {
    input.Expect(open);
    ++depth;
    if (depth > deepest) {
        input.Fail();
    }
    while (input.Good()) {
        input.Accept(',');
        Blanks();
        if (!input.Good() || input.Peek() == close) {
            break;
        }
        item();
        if (!input.Good()) {
            break;
        }
        Blanks();
        if (!input.Good() || !input.Accept(',')) {
            break;
        }
    }
    --depth;
    if (input.Good()) {
        input.Expect(close);
    }
}

void Reader::Object(std::map<std::string, JsonValue>& members) {
    std::map<std::string, JsonValue> collected;
    try {
        List('{', '}', [this, &collected] { Member(collected); });
    } catch (...) {
        members = std::move(collected);
        throw;
    }
    members = std::move(collected);
}

void Reader::Member(std::map<std::string, JsonValue>& members) {
    std::string key;
    String(key);
    if (!input.Good()) {
        return;
    }
    Blanks();
    if (input.Good()) {
        input.Expect(':');
    }
    if (input.Good()) {
        const auto [member, isNew] = members.try_emplace(std::move(key));
        if (!isNew) {
            member->second = JsonValue();
        }
        Value(member->second);
    }
}

void Reader::Array(std::vector<JsonValue>& elements) {
    const std::size_t first = pending.size();
    List('[', ']', [this] {
        JsonValue value;
        Value(value);
        pending.push_back(std::move(value));
    });
    if (!input.Good()) {
        return;
    }
    if (first == 0) {
        elements = std::move(pending);
        pending.clear();
    } else {
        const auto begin = pending.begin() + static_cast<std::ptrdiff_t>(first);
        elements = std::vector<JsonValue>(std::make_move_iterator(begin),
                                          std::make_move_iterator(pending.end()));
        pending.erase(begin, pending.end());
    }
}

// Runs one reading operation on a stream that is ready for it. What the stream's buffer or an
// allocation throws becomes the stream's bad state.
template <typename Operation>
void Read(std::istream& stream, Operation operation) {
    if (!stream.good()) {
        stream.setstate(std::ios_base::failbit);
        return;
    }
    try {
        Reader reader(stream);
        operation(reader);
    } catch (...) {
        stream.setstate(std::ios_base::badbit);
    }
}

}  // namespace

void ReadValue(std::istream& stream, JsonValue& value) {
    Read(stream, [&value](Reader& reader) { reader.Value(value); });
}

void ReadObject(std::istream& stream, std::map<std::string, JsonValue>& members) {
    Read(stream, [&members](Reader& reader) { reader.Object(members); });
}

void ReadArray(std::istream& stream, std::vector<JsonValue>& elements) {
    Read(stream, [&elements](Reader& reader) { reader.Array(elements); });
}

void ReadString(std::istream& stream, std::string& text) {
    Read(stream, [&text](Reader& reader) { reader.String(text); });
}

void ReadNumber(std::istream& stream, double& number) {
    Read(stream, [&number](Reader& reader) { reader.Number(number); });
}

void ReadBool(std::istream& stream, bool& flag) {
    Read(stream, [&flag](Reader& reader) { reader.Bool(flag); });
}

void ReadNull(std::istream& stream) {
    Read(stream, [](Reader& reader) { reader.Null(); });
}

void SkipBlanks(std::istream& stream) {
    Read(stream, [](Reader& reader) { reader.Blanks(); });
}

void SetReaderOption(bool option) { readerOption = option; }

bool ReaderOption() { return readerOption; }

}  // namespace vantor
