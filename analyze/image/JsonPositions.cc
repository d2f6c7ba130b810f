#include "image/JsonPositions.h"

#include <algorithm>
#include <istream>
#include <limits>
#include <streambuf>

#include "json/JsonReader.h"

namespace vantor::analyze {

namespace {

constexpr std::size_t deepest = 1000;   // levels that the reader reads
constexpr std::size_t knownLevels = 3;  // the root's members, theirs, and the elements of those

}  // namespace

// One look through a text. Texts, numbers and words are the reader's own to read; only what stands
// between them is read here.
class JsonPositionsScan {
public:
    using End = JsonPositions::End;
    using Value = JsonPositions::Value;

    JsonPositionsScan(const std::string& documentText, JsonPositions& result)
        : text(documentText), positions(result), buffer(text), stream(&buffer) {}

    void Run();

private:
    // A text as a stream's buffer, from any of its bytes on. Nothing is written to it.
    class TextBuffer : public std::streambuf {
    public:
        explicit TextBuffer(const std::string& text)
            : begin(const_cast<char*>(text.data())), end(begin + text.size()) {}

        void StartAt(std::size_t place) { setg(begin, begin + place, end); }
        std::size_t Offset() const { return static_cast<std::size_t>(gptr() - begin); }

    private:
        char* begin;
        char* end;
    };

    // An object or array that is being read.
    struct Open {
        bool isObject;
        Value* value;     // null: deeper than places are kept
        bool behindItem;  // else before one
    };

    bool Good() const { return !ended; }
    void EndAt(std::size_t where, End end) {
        ended = true;
        positions.stop = where;
        positions.ending = end;
    }
    void Break(std::size_t where) { EndAt(where, End::Broken); }

    bool Is(char byte) const { return offset < text.size() && text[offset] == byte; }
    bool Accept(char byte) {
        const bool accepted = Is(byte);
        offset += accepted ? 1 : 0;
        return accepted;
    }
    void Expect(char byte) {
        if (!Accept(byte)) {
            Break(offset);
        }
    }

    void Blanks();
    void Comment(std::size_t end, std::size_t endSize);
    void StartValue(Value* value);
    void StartList(Value* value, bool isObject);
    void StartItem();
    void Close();
    // Lets the reader read something; breaks off where it fails.
    template <typename Operation>
    void Read(Operation operation);

    const std::string& text;
    JsonPositions& positions;
    TextBuffer buffer;
    std::istream stream;
    std::size_t offset = 0;
    bool ended = false;
    std::vector<Open> open;
};

void JsonPositionsScan::Run() {
    StartValue(&positions.root);
    while (Good() && !open.empty()) {
        Open& innermost = open.back();
        if (innermost.behindItem) {
            Blanks();
            innermost.behindItem = false;
            if (Good() && !Accept(',')) {
                Close();
            }
            continue;
        }
        Accept(',');
        Blanks();
        if (Good() && Is(innermost.isObject ? '}' : ']')) {
            Close();
        } else if (Good()) {
            StartItem();
        }
    }
    if (Good()) {
        positions.stop = offset;
    }
}

void JsonPositionsScan::Blanks() {
    while (Good()) {
        offset = std::min(text.find_first_not_of(" \t\n\v\f\r", offset), text.size());
        if (!Is('/')) {
            return;
        }
        const char next = offset + 1 < text.size() ? text[offset + 1] : '\0';
        if (next == '*') {
            Comment(text.find("*/", offset + 1), 2);
        } else if (next == '/') {
            Comment(text.find('\n', offset + 2), 1);
        } else {
            EndAt(offset, End::LoneSlash);
        }
    }
}

void JsonPositionsScan::Comment(std::size_t end, std::size_t endSize) {
    if (end == std::string::npos) {
        Break(offset);
    } else {
        offset = end + endSize;
    }
}

template <typename Operation>
void JsonPositionsScan::Read(Operation operation) {
    buffer.StartAt(offset);
    stream.clear();
    operation();
    if (stream.fail()) {
        Break(offset);
    }
    offset = buffer.Offset();
}

void JsonPositionsScan::StartValue(Value* value) {
    Blanks();
    if (!Good()) {
        return;
    }
    if (value != nullptr) {
        value->offset = offset;
    }
    const char first = offset < text.size() ? text[offset] : '\0';
    if (offset == text.size()) {
        Break(offset);
    } else if (first == '"') {
        std::string ignored;
        Read([this, &ignored] { ReadString(stream, ignored); });
    } else if (first == '-' || (first >= '0' && first <= '9')) {
        double ignored = 0;
        Read([this, &ignored] { ReadNumber(stream, ignored); });
    } else if (first == '{' || first == '[') {
        StartList(value, first == '{');
    } else if (first == 't' || first == 'f') {
        bool ignored = false;
        Read([this, &ignored] { ReadBool(stream, ignored); });
    } else if (first == 'n') {
        Read([this] { ReadNull(stream); });
    } else {
        ++offset;  // a value without a kind
    }
}

void JsonPositionsScan::StartList(Value* value, bool isObject) {
    if (open.size() == deepest) {
        EndAt(offset, End::TooDeep);
        return;
    }
    ++offset;
    open.push_back({isObject, open.size() < knownLevels ? value : nullptr, false});
}

// An element, or a member with its key. Of equal keys the last one holds.
void JsonPositionsScan::StartItem() {
    Open& list = open.back();
    list.behindItem = true;
    Value* item = nullptr;
    if (list.isObject) {
        std::string key;
        if (!Is('"')) {
            Break(offset);
            return;
        }
        Read([this, &key] { ReadString(stream, key); });
        Blanks();
        if (Good()) {
            Expect(':');
        }
        if (!Good()) {
            return;
        }
        if (list.value != nullptr) {
            item = &(list.value->members[key] = Value());
        }
    } else if (list.value != nullptr) {
        item = &list.value->elements.emplace_back();
    }
    StartValue(item);
}

void JsonPositionsScan::Close() {
    Expect(open.back().isObject ? '}' : ']');
    open.pop_back();
}

JsonPositions::JsonPositions(const std::string& documentText) {
    JsonPositionsScan(documentText, *this).Run();
    lines.push_back(0);
    for (std::size_t end = documentText.find('\n'); end != std::string::npos;
         end = documentText.find('\n', end + 1)) {
        lines.push_back(end + 1);
    }
    for (std::size_t offset = 0; offset < documentText.size(); ++offset) {
        if ((static_cast<unsigned char>(documentText[offset]) & 0xc0U) == 0x80U) {
            within.push_back(offset);
        }
    }
}

JsonPositions::Position JsonPositions::Of(const DocumentPlace& place) const {
    const Value* value = &root;
    for (const std::string& key : place.keys) {
        const auto member = value->members.find(key);
        if (member == value->members.end()) {
            return At(value->offset);
        }
        value = &member->second;
    }
    if (place.element && *place.element < value->elements.size()) {
        value = &value->elements[*place.element];
    }
    return At(value->offset);
}

JsonPositions::Position JsonPositions::At(std::size_t offset) const {
    const auto next = std::upper_bound(lines.begin(), lines.end(), offset);
    const auto narrow = [](std::size_t number) {
        constexpr std::size_t largest = std::numeric_limits<int>::max();
        return static_cast<int>(std::min(number, largest));
    };
    const std::size_t start = *std::prev(next);
    const auto continued = std::lower_bound(within.begin(), within.end(), offset) -
                           std::lower_bound(within.begin(), within.end(), start);
    return {narrow(static_cast<std::size_t>(next - lines.begin())),
            narrow(offset - start - static_cast<std::size_t>(continued) + 1)};
}

}  // namespace vantor::analyze
