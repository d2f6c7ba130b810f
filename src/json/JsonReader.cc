#include "json/JsonReader.h"

#include <atomic>
#include <cstring>
#include <streambuf>
#include <utility>

namespace vantor {

namespace {

// Far above any real document, far below what any stack holds.
constexpr int deepest = 1000;

std::atomic<bool> readerOption{false};

bool IsBlank(int byte) { return byte == ' ' || (byte >= '\t' && byte <= '\r'); }

// Reads from the stream's buffer, past the stream's own functions, which check and change the
// stream's state for every byte; the state is set here as they would set it.
class Reader {
public:
    explicit Reader(std::istream& source) : stream(source), buffer(*source.rdbuf()) {}

    void Value(JsonValue& value);
    void Object(std::map<std::string, JsonValue>& members);
    void Array(std::vector<JsonValue>& elements);
    void String(std::string& text);
    void Number(double& number) { stream >> number; }
    void Bool(bool& flag);
    void Null();
    void Blanks();

private:
    static constexpr int end = std::char_traits<char>::eof();

    bool Good() const { return !stream.fail(); }  // neither bad nor failed
    void Fail() { stream.setstate(std::ios_base::failbit); }

    // The next byte, left in the stream; `end` at the end of the input.
    int Peek();
    // The next byte, consumed. At the end of the input the stream fails.
    int Take();
    void PutBack();
    // Consumes the byte, or fails if the next one is another.
    void Expect(char byte);
    // Consumes the byte if it is the next one.
    bool Accept(char byte);

    void BlockComment();
    void LineComment();
    void Escape(std::string& text);
    void Member(std::map<std::string, JsonValue>& members);
    // Reads what stands between two brackets: `item` reads one item of the list.
    template <typename Item>
    void List(char open, char close, Item item);

    std::istream& stream;
    std::streambuf& buffer;
    int depth = 0;  // objects and arrays that are being read, one within the other
};

int Reader::Peek() {
    const int byte = buffer.sgetc();
    if (byte == end) {
        stream.setstate(std::ios_base::eofbit);
    }
    return byte;
}

int Reader::Take() {
    const int byte = buffer.sbumpc();
    if (byte == end) {
        stream.setstate(std::ios_base::eofbit | std::ios_base::failbit);
    }
    return byte;
}

void Reader::PutBack() {
    if (buffer.sungetc() == end) {
        stream.setstate(std::ios_base::badbit);
    }
}

void Reader::Expect(char byte) {
    const int taken = Take();
    if (taken != end && taken != std::char_traits<char>::to_int_type(byte)) {
        Fail();
    }
}

bool Reader::Accept(char byte) {
    if (Peek() != std::char_traits<char>::to_int_type(byte)) {
        return false;
    }
    Take();
    return true;
}

void Reader::Blanks() {
    while (Good()) {
        while (IsBlank(Peek())) {
            Take();
        }
        if (!Accept('/')) {
            return;
        }
        if (Peek() == '*') {
            BlockComment();
        } else if (Accept('/')) {
            LineComment();
        } else {
            PutBack();
        }
    }
}

// Stands before the star behind the opening slash, which may end the comment too.
void Reader::BlockComment() {
    while (Good()) {
        if (Take() == '*' && Accept('/')) {
            return;
        }
    }
}

void Reader::LineComment() {
    while (Good() && Take() != '\n') {
    }
}

void Reader::Value(JsonValue& value) {
    Blanks();
    JsonKind kind = JsonKind::None;
    const int first = Good() ? Peek() : end;
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
    } else if (Good()) {
        Take();
    }
    if (kind != JsonKind::None && Good()) {
        value.kind = kind;
    }
}

void Reader::String(std::string& text) {
    Expect('"');
    std::string collected;
    while (Good()) {
        const int byte = Take();
        if (byte == end) {
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
    }
}

void Reader::Escape(std::string& text) {
    static constexpr char letters[] = {'b', 'f', 'n', 'r', 't'};
    static constexpr char controls[] = {'\b', '\f', '\n', '\r', '\t'};
    const int byte = Take();
    if (byte == end || byte == 'u') {
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
    if (buffer.sgetn(bytes, sizeof bytes) != sizeof bytes) {
        stream.setstate(std::ios_base::eofbit | std::ios_base::failbit);
    } else if (std::memcmp(bytes, "true", 4) == 0) {
        PutBack();
        flag = true;
    } else if (std::memcmp(bytes, "false", 5) == 0) {
        flag = false;
    } else {
        Fail();
    }
}

void Reader::Null() {
    char bytes[4];
    if (buffer.sgetn(bytes, sizeof bytes) != sizeof bytes) {
        stream.setstate(std::ios_base::eofbit | std::ios_base::failbit);
    } else if (std::memcmp(bytes, "null", sizeof bytes) != 0) {
        Fail();
    }
}

template <typename Item>
void Reader::List(char open, char close, Item item) {
    Expect(open);
    ++depth;
    if (depth > deepest) {
        Fail();
    }
    while (Good()) {
        Accept(',');
        Blanks();
        if (!Good() || Peek() == close) {
            break;
        }
        item();
        if (!Good()) {
            break;
        }
        Blanks();
        if (!Good() || !Accept(',')) {
            break;
        }
    }
    --depth;
    if (Good()) {
        Expect(close);
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
    if (!Good()) {
        return;
    }
    Blanks();
    if (Good()) {
        Expect(':');
    }
    if (Good()) {
        JsonValue value;
        Value(value);
        members[key] = std::move(value);
    }
}

void Reader::Array(std::vector<JsonValue>& elements) {
    std::vector<JsonValue> collected;
    List('[', ']', [this, &collected] {
        collected.emplace_back();
        Value(collected.back());
    });
    if (Good()) {
        elements = std::move(collected);
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
