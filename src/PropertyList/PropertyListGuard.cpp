// PropertyListGuard: walks binary plists object by object and scans XML tags for depth, before libplist parses either.
#include "PropertyList/PropertyListGuard.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <optional>
#include <string_view>
#include <vector>

namespace vantorel {

namespace {

// ---- Binary property lists ----
//
// "bplist00", the objects, the offset table (one file offset per object), then a
// 32-byte trailer, all integers big-endian:
//    0  u8[6]  unused
//    6  u8     width of one offset-table entry
//    7  u8     width of one object reference (an index into the offset table)
//    8  u64    number of objects
//   16  u64    index of the top object
//   24  u64    file offset of the offset table
// An object starts with a marker: high nibble the type, low nibble a size or, for
// counted types, the count (0xF: an integer object 0x1k of 2^k bytes follows with it).
//   0x08/0x09 false/true     0x1k integer, 2^k bytes (k <= 4)   0x2k real, 2^k bytes (k = 2, 3)
//   0x33 date, 8 bytes       0x4n data, n bytes    0x5n ASCII string, n bytes
//   0x6n UTF-16BE string, n units                  0x8n UID, n+1 bytes
//   0xAn array, n refs       0xDn dictionary, n key refs then n value refs
// Null (0x00), fill (0x0F), sets (0xC) and the reserved types are refused: libplist
// has no value, or the value model no place, for them.

constexpr size_t kMagicSize = 8;
constexpr size_t kTrailerSize = 32;

// Bounds-checked big-endian read of 1..8 bytes; nothing when any byte lies outside.
// (Platform's ByteReader is little-endian and sits in a layer above this one.)
std::optional<uint64_t> readBE(ByteView data, uint64_t offset, uint64_t width) {
    if (width < 1 || width > 8 || offset > data.size() || width > data.size() - offset) return std::nullopt;
    uint64_t v = 0;
    for (uint8_t byte : data.subspan(offset, width)) v = (v << 8) | byte;
    return v;
}

std::string unsupportedMarker(uint8_t marker) {
    static constexpr char kHex[] = "0123456789ABCDEF";
    return std::string("binary property list object has an unsupported marker 0x") + kHex[marker >> 4] +
           kHex[marker & 0x0F];
}

// One object as its marker describes it.
struct Object {
    enum class Kind { Scalar, String, Array, Dictionary } kind = Kind::Scalar;
    uint64_t refs = 0;   // offset of a container's references
    uint64_t count = 0;  // references a container holds (a dictionary's keys and values)
    uint64_t size = 0;   // encoded size, marker included
};

class BinaryPlist {
public:
    explicit BinaryPlist(ByteView data) : data_(data) {}
    std::string check();

private:
    std::string object(uint64_t index, Object& out) const;
    std::string walk(uint64_t top) const;

    ByteView data_;
    uint64_t offsetSize_ = 0, refSize_ = 0, objects_ = 0, tableAt_ = 0;
};

std::string BinaryPlist::check() {
    if (data_.size() < kMagicSize + kTrailerSize) return "binary property list too short for its trailer";
    const uint64_t trailer = data_.size() - kTrailerSize;
    offsetSize_ = *readBE(data_, trailer + 6, 1);
    refSize_ = *readBE(data_, trailer + 7, 1);
    objects_ = *readBE(data_, trailer + 8, 8);
    const uint64_t top = *readBE(data_, trailer + 16, 8);
    tableAt_ = *readBE(data_, trailer + 24, 8);
    if (offsetSize_ < 1 || offsetSize_ > 8 || refSize_ < 1 || refSize_ > 8 || objects_ == 0 || top >= objects_)
        return "binary property list trailer is invalid";
    if (tableAt_ < kMagicSize || tableAt_ > trailer || objects_ > (trailer - tableAt_) / offsetSize_)
        return "binary property list offset table out of range";
    if (objects_ > PropertyListGuard::kMaxValues)
        return "binary property list holds more than " + std::to_string(PropertyListGuard::kMaxValues) + " objects";
    return walk(top);
}

// Reads object `index`'s marker and checks that all of it lies between the magic and
// the offset table and that a string holds no U+0000 (libplist asserts on those).
std::string BinaryPlist::object(uint64_t index, Object& out) const {
    const auto at = readBE(data_, tableAt_ + index * offsetSize_, offsetSize_);
    if (!at || *at < kMagicSize || *at >= tableAt_) return "binary property list object offset out of range";
    const auto marker = static_cast<uint8_t>(*readBE(data_, *at, 1));
    const uint8_t low = marker & 0x0F;
    uint64_t length = 0;  // payload bytes of a fixed-size scalar
    uint64_t unit = 0;    // bytes per counted element; 0 for fixed-size scalars
    switch (marker >> 4) {
    case 0x0: if (low != 0x8 && low != 0x9) return unsupportedMarker(marker); break;
    case 0x1: if (low > 4) return unsupportedMarker(marker); length = uint64_t{1} << low; break;
    case 0x2: if (low != 2 && low != 3) return unsupportedMarker(marker); length = uint64_t{1} << low; break;
    case 0x3: if (low != 3) return unsupportedMarker(marker); length = 8; break;
    case 0x8: if (low > 7) return unsupportedMarker(marker); length = low + 1u; break;
    case 0x4: unit = 1; break;
    case 0x5: unit = 1; out.kind = Object::Kind::String; break;
    case 0x6: unit = 2; out.kind = Object::Kind::String; break;
    case 0xA: unit = refSize_; out.kind = Object::Kind::Array; break;
    case 0xD: unit = 2 * refSize_; out.kind = Object::Kind::Dictionary; break;
    default: return unsupportedMarker(marker);
    }
    uint64_t body = *at + 1;
    uint64_t count = length;
    if (unit == 0) {
        unit = 1;
    } else if (low != 0x0F) {
        count = low;
    } else {
        const auto sizeMarker = readBE(data_, body, 1);
        if (!sizeMarker || (*sizeMarker & 0xF0) != 0x10 || (*sizeMarker & 0x0F) > 3)
            return "binary property list object has a malformed count";
        const uint64_t width = uint64_t{1} << (*sizeMarker & 0x0F);
        const auto extended = readBE(data_, body + 1, width);
        if (!extended) return "binary property list object runs past its data";
        count = *extended;
        body += 1 + width;
    }
    if (body > tableAt_ || count > (tableAt_ - body) / unit) return "binary property list object runs past its data";
    out.refs = body;
    out.count = out.kind == Object::Kind::Dictionary ? 2 * count : count;
    out.size = body + count * unit - *at;

    const ByteView payload = data_.subspan(body, count * unit);
    bool nul = false;
    if ((marker >> 4) == 0x5) nul = std::find(payload.begin(), payload.end(), 0) != payload.end();
    for (size_t i = 0; (marker >> 4) == 0x6 && i + 1 < payload.size() && !nul; i += 2)
        nul = payload[i] == 0 && payload[i + 1] == 0;
    return nul ? "string holds a NUL character" : "";
}

uint64_t saturatingAdd(uint64_t a, uint64_t b) { return a > UINT64_MAX - b ? UINT64_MAX : a + b; }

// Visits every object reachable from the top one, depth first with an explicit path,
// each object once: what a settled object contributes (its height, and the values and
// bytes it expands to however often it is referenced) is remembered, so a shared
// object costs one visit however many references reach it, and an object referenced
// from its own path is a cycle.
std::string BinaryPlist::walk(uint64_t top) const {
    enum : uint8_t { kNew = 0, kOpen = 1, kDone = 2, kStateMask = 3, kIsString = 4 };
    struct Memo {
        uint8_t state = kNew;
        uint16_t height = 0;  // levels below the object
        uint64_t values = 0;  // values it expands to, itself included
        uint64_t bytes = 0;   // encoded bytes it expands to
    };
    struct Frame {
        uint64_t object, refs, count, next;
        bool dictionary;
        Memo sum;
    };
    std::vector<Memo> memo(objects_);
    std::vector<Frame> path;  // the containers from the top object down to the one being read
    // Expansion is bounded absolutely, but a large plist that shares nothing always passes.
    const uint64_t maxBytes = std::max<uint64_t>(PropertyListGuard::kMaxExpandedBytes, data_.size());

    // A scalar settles at once; a container joins the path and settles when its references are read.
    auto enter = [&](uint64_t index, size_t depth) -> std::string {
        if (depth > PropertyListGuard::kMaxDepth) return PropertyListGuard::tooDeep();
        Object o;
        if (std::string error = object(index, o); !error.empty()) return error;
        const Memo own{kOpen, 0, 1, o.size};
        if (o.kind == Object::Kind::Array || o.kind == Object::Kind::Dictionary) {
            memo[index] = own;
            path.push_back({index, o.refs, o.count, 0, o.kind == Object::Kind::Dictionary, own});
        } else {
            memo[index] = own;
            memo[index].state = kDone | (o.kind == Object::Kind::String ? kIsString : 0);
        }
        return {};
    };
    auto absorb = [&](Memo& sum, const Memo& child) -> std::string {
        sum.height = std::max<uint16_t>(sum.height, static_cast<uint16_t>(child.height + 1));
        sum.values = saturatingAdd(sum.values, child.values);
        sum.bytes = saturatingAdd(sum.bytes, child.bytes);
        if (sum.values > PropertyListGuard::kMaxValues)
            return "binary property list expands to more than " + std::to_string(PropertyListGuard::kMaxValues) +
                   " values";
        if (sum.bytes > maxBytes) return "binary property list expands to more than " + std::to_string(maxBytes) + " bytes";
        return {};
    };

    if (std::string error = enter(top, 0); !error.empty()) return error;
    while (!path.empty()) {
        Frame& frame = path.back();
        if (frame.next == frame.count) {
            Memo settled = frame.sum;
            settled.state = kDone;
            memo[frame.object] = settled;
            path.pop_back();
            if (path.empty()) break;
            if (std::string error = absorb(path.back().sum, settled); !error.empty()) return error;
            continue;
        }
        // A dictionary's first half of references are its keys.
        const bool isKey = frame.dictionary && frame.next < frame.count / 2;
        const auto child = readBE(data_, frame.refs + frame.next * refSize_, refSize_);
        ++frame.next;
        if (!child || *child >= objects_) return "binary property list object reference out of range";
        const size_t depth = path.size();
        if ((memo[*child].state & kStateMask) == kOpen) return "binary property list object contains itself";
        if (memo[*child].state == kNew) {
            if (std::string error = enter(*child, depth); !error.empty()) return error;
        }
        const Memo& seen = memo[*child];
        if (isKey && !(seen.state & kIsString)) return "binary property list dictionary key is not a string";
        if ((seen.state & kStateMask) == kOpen) continue;  // just entered: now on top of the path
        if (depth + seen.height > PropertyListGuard::kMaxDepth) return PropertyListGuard::tooDeep();
        if (std::string error = absorb(path.back().sum, seen); !error.empty()) return error;
    }
    return {};
}

// ---- XML property lists ----
//
// libplist's XML reader keeps its open containers in a list but frees what it built
// recursively, so depth must be bounded before it runs. This scan follows the
// reader's own tokenising (quoted attribute values, comments, processing
// instructions, DOCTYPE with an internal subset, CDATA and comments inside text) so
// that every container the reader opens is counted: a scan that skipped more than
// the reader could be led to undercount. Where the reader stops, at an error or
// after the top value, the scan stops too.
class XMLScan {
public:
    explicit XMLScan(std::string_view text) : s_(text) {}
    std::string depthProblem() const;

private:
    static constexpr size_t npos = std::string_view::npos;
    static bool isSpace(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; }
    // The character at i, or NUL past the end (the text itself holds none).
    char at(size_t i) const { return i < s_.size() ? s_[i] : '\0'; }
    bool startsWith(size_t i, std::string_view word) const { return i <= s_.size() && s_.substr(i).starts_with(word); }
    size_t skipSpace(size_t i) const {
        while (isSpace(at(i))) ++i;
        return i;
    }
    // Just past the quote closing the one at i.
    size_t pastQuote(size_t i) const {
        const size_t close = s_.find('"', i + 1);
        return close == npos ? npos : close + 1;
    }
    size_t findAny(size_t i, std::string_view stops, bool skipQuoted) const;
    size_t findWord(size_t i, std::string_view word, bool skipQuoted) const;
    size_t pastText(size_t i, std::string_view element) const;

    std::string_view s_;
};

// The first position from i holding one of `stops`; with skipQuoted, quoted runs are stepped over.
size_t XMLScan::findAny(size_t i, std::string_view stops, bool skipQuoted) const {
    while (i < s_.size()) {
        if (skipQuoted && s_[i] == '"') {
            i = pastQuote(i);
            continue;
        }
        if (stops.find(s_[i]) != npos) return i;
        ++i;
    }
    return npos;
}

size_t XMLScan::findWord(size_t i, std::string_view word, bool skipQuoted) const {
    while (i < s_.size()) {
        if (s_.compare(i, word.size(), word) == 0) return i;
        if (skipQuoted && s_[i] == '"') {
            i = pastQuote(i);
            continue;
        }
        ++i;
    }
    return npos;
}

// From just after a text element's opening tag to just after its closing tag.
size_t XMLScan::pastText(size_t i, std::string_view element) const {
    while (true) {
        i = s_.find('<', i);
        if (i == npos) return npos;
        if (at(++i) == '/') break;
        if (at(i) != '!') return npos;
        if (startsWith(++i, "--")) {
            i = findWord(i + 2, "-->", false);
        } else if (startsWith(i, "[CDATA[")) {
            i = findWord(i + 7, "]]>", false);
        } else {
            return npos;
        }
        if (i == npos) return npos;
        i += 3;
    }
    if (!startsWith(++i, element)) return npos;
    i = skipSpace(i + element.size());
    return at(i) == '>' ? i + 1 : npos;
}

std::string XMLScan::depthProblem() const {
    static constexpr std::array<std::string_view, 8> kTextElements = {"key",  "string", "integer", "real",
                                                                      "date", "data",   "true",    "false"};
    std::vector<std::string_view> open;  // the containers not yet closed
    bool seenTop = false;
    bool emptyTop = false;  // the reader adds what follows an empty top container to it
    size_t i = 0;
    while (true) {
        i = skipSpace(i);
        if (at(i) != '<') return {};
        ++i;
        if (at(i) == '?') {
            i = findWord(i, "?>", true);
            if (i == npos) return {};
            i += 2;
            continue;
        }
        if (at(i) == '!') {
            if (startsWith(i, "!--")) {
                i = findWord(i + 3, "-->", false);
                if (i != npos) i += 2;
            } else if (startsWith(i, "!DOCTYPE")) {
                i = findAny(i + 8, "[>", true);
                if (i != npos && s_[i] == '[') {
                    i = findWord(i, "]>", true);
                    if (i != npos) ++i;
                }
            } else {
                return {};
            }
            if (i == npos) return {};
            ++i;
            continue;
        }
        const size_t nameAt = i;
        i = findAny(i, " \t\r\n<>", false);
        if (i == npos) return {};
        std::string_view name = s_.substr(nameAt, i - nameAt);
        if (s_[i] != '>') i = findAny(i, "<>", true);
        if (i == npos || s_[i] != '>') return {};
        const bool empty = s_[i - 1] == '/';
        if (empty && i - nameAt - 1 < name.size()) name = name.substr(0, i - nameAt - 1);
        ++i;

        if (name == "plist" || name == "/plist") continue;
        if (name.starts_with('/')) {
            if (open.empty() || name.substr(1) != open.back()) return {};
            open.pop_back();
            if (open.empty() && !emptyTop) return {};
            continue;
        }
        if (name == "array" || name == "dict") {
            if (!seenTop) emptyTop = empty;
            seenTop = true;
            if (empty) continue;
            if (open.size() + (emptyTop ? 1 : 0) > PropertyListGuard::kMaxDepth) return PropertyListGuard::tooDeep();
            open.push_back(name);
            continue;
        }
        if (!seenTop || std::find(kTextElements.begin(), kTextElements.end(), name) == kTextElements.end())
            return {};
        if (!empty) i = pastText(i, name);
        if (i == npos) return {};
    }
}

}  // namespace

std::string PropertyListGuard::check(ByteView bytes) {
    if (bytes.empty()) return "empty property list";
    static constexpr std::string_view kMagic = "bplist00";
    if (bytes.size() >= kMagic.size() && std::equal(kMagic.begin(), kMagic.end(), bytes.begin()))
        return checkBinary(bytes);
    return checkXML(bytes);
}

std::string PropertyListGuard::tooDeep() { return "property list nested deeper than " + std::to_string(kMaxDepth) + " levels"; }

std::string PropertyListGuard::checkBinary(ByteView bytes) { return BinaryPlist(bytes).check(); }

std::string PropertyListGuard::checkXML(ByteView bytes) {
    if (bytes.size() > kMaxXMLBytes) return "XML property list larger than 16 MiB";
    if (std::find(bytes.begin(), bytes.end(), 0) != bytes.end()) return "XML property list holds a NUL byte";
    return XMLScan(std::string_view(reinterpret_cast<const char*>(bytes.data()), bytes.size())).depthProblem();
}

}  // namespace vantorel
