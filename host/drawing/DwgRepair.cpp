#include "DwgRepair.h"

#include "Database.h"
#include "DbObject.h"
#include "DxfError.h"
#include "LayerRecord.h"
#include "TagValues.h"
#include "XRecord.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonParseError>

#include <charconv>
#include <numbers>
#include <unordered_map>
#include <unordered_set>
#include <vector>

namespace zvdb {

namespace {

// One group of an ASCII DXF text: its code, its value and where its two lines lie.
struct Group {
    int code = 0;
    std::string_view value;
    std::size_t begin = 0;  // first character of the code line
    std::size_t end = 0;    // first character after the value line's end
};

// Walks the groups of an ASCII DXF text. Anything it can't read ends the walk: the loader
// reports such text with its line afterwards.
class GroupReader {
public:
    explicit GroupReader(std::string_view text) : text_(text) {}

    bool next(Group& group) {
        std::string_view codeLine, valueLine;
        const std::size_t begin = at_;
        if (!line(codeLine) || !line(valueLine)) return false;
        while (!codeLine.empty() && codeLine.front() == ' ')
            codeLine.remove_prefix(1);
        while (!codeLine.empty() && codeLine.back() == ' ')
            codeLine.remove_suffix(1);
        int code = 0;
        const auto result =
            std::from_chars(codeLine.data(), codeLine.data() + codeLine.size(), code);
        if (result.ec != std::errc() || result.ptr != codeLine.data() + codeLine.size())
            return false;
        group = Group{code, valueLine, begin, at_};
        return true;
    }

    std::size_t position() const { return at_; }
    void seek(std::size_t position) { at_ = position; }

private:
    bool line(std::string_view& out) {
        if (at_ >= text_.size()) return false;
        std::size_t end = text_.find('\n', at_);
        if (end == std::string_view::npos) end = text_.size();
        out = text_.substr(at_, end - at_);
        if (!out.empty() && out.back() == '\r') out.remove_suffix(1);
        at_ = end < text_.size() ? end + 1 : end;
        return true;
    }

    std::string_view text_;
    std::size_t at_ = 0;
};

std::uint64_t handleOf(const QJsonValue& value) {
    return TagValues::toHandle(value.toString().toStdString());
}

double number(const QJsonObject& object, const char* key, double fallback) {
    const QJsonValue value = object.value(key);
    return value.isDouble() ? value.toDouble() : fallback;
}

Point3 pointOf(const QJsonObject& object, const char* key) {
    const QJsonArray xyz = object.value(key).toArray();
    return Point3{xyz.at(0).toDouble(), xyz.at(1).toDouble(), xyz.at(2).toDouble()};
}

double degrees(double radians) {
    return radians * 180.0 / std::numbers::pi;
}

// Writes DXF groups in the text's own line ending.
class GroupWriter {
public:
    GroupWriter(std::string& out, std::string_view newline) : out_(out), newline_(newline) {}
    void put(int code, std::string_view value) {
        std::string codeText = std::to_string(code);
        if (codeText.size() < 3) codeText.insert(0, 3 - codeText.size(), ' ');
        out_ += codeText;
        out_ += newline_;
        out_ += value;
        out_ += newline_;
    }
    void real(int code, double value) { put(code, TagValues::fromReal(value)); }
    void integer(int code, long long value) { put(code, TagValues::fromInteger(value)); }
    void point(int code, const Point3& p) {
        real(code, p.x);
        real(code + 10, p.y);
        real(code + 20, p.z);
    }

private:
    std::string& out_;
    std::string_view newline_;
};

// An ATTRIB entity from the model's facts, owned by the block reference `owner`.
void writeAttribute(GroupWriter& out, const QJsonObject& attribute, std::uint64_t handle,
                    std::uint64_t owner, bool paperSpace) {
    out.put(0, "ATTRIB");
    out.put(5, TagValues::fromHandle(handle));
    out.put(330, TagValues::fromHandle(owner));
    out.put(100, "AcDbEntity");
    if (paperSpace) out.integer(67, 1);
    const QString layer = attribute.value("layer").toString();
    out.put(8, layer.isEmpty() ? std::string("0") : layer.toStdString());
    const int color = static_cast<int>(number(attribute, "color", 256));
    if (color != 256) out.integer(62, color);
    out.put(100, "AcDbText");
    out.point(10, pointOf(attribute, "position"));
    out.real(40, number(attribute, "height", 1.0));
    out.put(1, attribute.value("value").toString().toStdString());
    if (const double rotation = number(attribute, "rotation", 0.0); rotation != 0.0)
        out.real(50, degrees(rotation));
    if (const double width = number(attribute, "widthFactor", 1.0); width != 1.0)
        out.real(41, width);
    if (const double oblique = number(attribute, "oblique", 0.0); oblique != 0.0)
        out.real(51, degrees(oblique));
    const QString style = attribute.value("style").toString();
    if (!style.isEmpty() && style != "Standard") out.put(7, style.toStdString());
    const int halign = static_cast<int>(number(attribute, "halign", 0));
    const int valign = static_cast<int>(number(attribute, "valign", 0));
    if (halign != 0) out.integer(72, halign);
    if (halign != 0 || valign != 0) out.point(11, pointOf(attribute, "alignment"));
    out.put(100, "AcDbAttribute");
    out.put(2, attribute.value("tag").toString().toStdString());
    out.integer(70, static_cast<int>(number(attribute, "flags", 0)));
    if (valign != 0) out.integer(74, valign);
}

// Where the converter's text groups (codes 3, then 1) that start at `begin` end. This build
// may write bytes from past the end of a long text there, a line that is no group code
// among them: the groups resume at the next code-1 line. npos when they can't be found.
std::size_t textGroupsEnd(std::string_view dxf, std::size_t begin) {
    std::size_t at = begin;
    auto nextLine = [&](std::string_view& line) {
        if (at >= dxf.size()) return false;
        std::size_t end = dxf.find('\n', at);
        if (end == std::string_view::npos) end = dxf.size();
        line = dxf.substr(at, end - at);
        if (!line.empty() && line.back() == '\r') line.remove_suffix(1);
        while (!line.empty() && line.front() == ' ')
            line.remove_prefix(1);
        at = end < dxf.size() ? end + 1 : end;
        return true;
    };
    std::string_view code, value;
    while (nextLine(code)) {
        if (code == "3" && nextLine(value)) continue;
        if (code == "1") return nextLine(value) ? at : std::string_view::npos;
        // Not a text group: look a few lines on for the closing one.
        constexpr int kLookAhead = 16;
        for (int i = 0; i < kLookAhead && nextLine(code); ++i)
            if (code == "1") return nextLine(value) ? at : std::string_view::npos;
        return std::string_view::npos;
    }
    return std::string_view::npos;
}

// A long text as the format holds it: pieces of at most 250 bytes (code 3), the last one
// with code 1, never parting a UTF-8 character.
void writeLongText(GroupWriter& out, std::string_view text) {
    constexpr std::size_t kPiece = 250;
    while (text.size() > kPiece) {
        std::size_t cut = kPiece;
        while (cut > 0 && (static_cast<unsigned char>(text[cut]) & 0xC0) == 0x80)
            --cut;
        out.put(3, text.substr(0, cut));
        text.remove_prefix(cut);
    }
    out.put(1, text);
}

// A text value as the format writes it: a control character (a line feed in a multi-line
// text) as ^ and a letter, a caret as "^ ", so that the value stays one line.
std::string caretEncoded(std::string_view text) {
    std::string out;
    out.reserve(text.size());
    for (const char c : text) {
        if (c == '^') {
            out += "^ ";
        } else if (static_cast<unsigned char>(c) < 0x20) {
            out += '^';
            out += static_cast<char>(c + 0x40);
        } else {
            out += c;
        }
    }
    return out;
}

bool allDigits(std::string_view text) {
    if (text.empty()) return false;
    for (const char c : text)
        if (c < '0' || c > '9') return false;
    return true;
}

}  // namespace

DwgRepair::DwgRepair(std::string_view factsJson) {
    QJsonParseError error;
    const QJsonDocument document = QJsonDocument::fromJson(
        QByteArray(factsJson.data(), static_cast<int>(factsJson.size())), &error);
    if (error.error != QJsonParseError::NoError || !document.isObject())
        throw DxfError("the DWG converter's facts are not readable: " +
                       error.errorString().toStdString());
    facts_ = document.object();
}

std::string DwgRepair::repairText(std::string_view dxf) {
    // The block references whose attributes the model knows, and every layer's name by
    // handle (a 1003 value that came out as a number is the layer's handle, bytes swapped).
    std::unordered_map<std::uint64_t, QJsonArray> attributesOf;
    for (const QJsonValue& entry : facts_.value("attributes").toArray()) {
        const QJsonObject reference = entry.toObject();
        attributesOf.emplace(handleOf(reference.value("handle")),
                             reference.value("attributes").toArray());
    }
    std::unordered_map<std::uint64_t, std::string> longTexts;
    for (const QJsonValue& entry : facts_.value("longTexts").toArray()) {
        const QJsonObject text = entry.toObject();
        longTexts.emplace(handleOf(text.value("handle")),
                          caretEncoded(text.value("text").toString().toStdString()));
    }
    std::unordered_map<std::uint64_t, std::string_view> layerNames;
    std::unordered_set<std::string_view> names;
    {
        GroupReader reader(dxf);
        Group group;
        bool inLayer = false;
        std::uint64_t handle = 0;
        while (reader.next(group)) {
            if (group.code == 0) {
                inLayer = group.value == "LAYER";
                handle = 0;
            } else if (inLayer && group.code == 5) {
                handle = TagValues::toHandle(group.value);
            } else if (inLayer && group.code == 2 && handle != 0) {
                layerNames.emplace(handle, group.value);
                names.insert(group.value);
            } else if (group.code == 2 && group.value == "BLOCKS") {
                break;  // the tables are behind
            }
        }
    }

    const std::string_view newline =
        dxf.find("\r\n") != std::string_view::npos ? std::string_view("\r\n") : "\n";
    std::string out;
    out.reserve(dxf.size() + dxf.size() / 64);
    GroupWriter writer(out, newline);
    std::size_t copied = 0;  // text up to here is in `out`
    auto copyTo = [&](std::size_t position) {
        out.append(dxf.substr(copied, position - copied));
        copied = position;
    };

    GroupReader reader(dxf);
    Group group;
    // The block reference being read, while its attributes follow it.
    const QJsonArray* wanted = nullptr;
    std::uint64_t reference = 0;
    bool referencePaper = false;
    bool inReference = false;
    std::unordered_set<std::uint64_t> present;
    std::string_view entityType;
    bool inXData = false;
    const std::string* longText = nullptr;  // the multi-line text being read, when long
    while (reader.next(group)) {
        if (group.code == 0) {
            inXData = false;
            if (wanted && group.value == "SEQEND") {
                // The attributes the writer left out go before the reference's SEQEND, in
                // the model's order after those that are there.
                copyTo(group.begin);
                for (const QJsonValue& value : *wanted) {
                    const QJsonObject attribute = value.toObject();
                    const std::uint64_t handle = handleOf(attribute.value("handle"));
                    if (handle == 0 || present.count(handle)) continue;
                    writeAttribute(writer, attribute, handle, reference, referencePaper);
                    ++counts_.attributes;
                }
                wanted = nullptr;
            } else if (wanted && group.value != "ATTRIB") {
                wanted = nullptr;  // no SEQEND to put them before: left as they are
            }
            entityType = group.value;
            longText = nullptr;
            inReference = entityType == "INSERT";
            if (inReference) {
                reference = 0;
                referencePaper = false;
            }
            continue;
        }
        if (inReference && group.code == 5) {
            reference = TagValues::toHandle(group.value);
            const auto it = attributesOf.find(reference);
            wanted = it == attributesOf.end() ? nullptr : &it->second;
            present.clear();
        } else if (inReference && group.code == 67) {
            referencePaper = TagValues::toInteger(group.value) == 1;
        } else if (wanted && entityType == "ATTRIB" && group.code == 5) {
            present.insert(TagValues::toHandle(group.value));
        }
        if (entityType == "MTEXT" && group.code == 5) {
            const auto it = longTexts.find(TagValues::toHandle(group.value));
            longText = it == longTexts.end() ? nullptr : &it->second;
        } else if (longText && (group.code == 3 || group.code == 1)) {
            // The text as the model holds it, in place of the converter's groups.
            const std::size_t end = textGroupsEnd(dxf, group.begin);
            if (end != std::string_view::npos) {
                copyTo(group.begin);
                writeLongText(writer, *longText);
                copied = end;
                reader.seek(end);
                ++counts_.longTexts;
            }
            longText = nullptr;
            continue;
        }
        if (group.code == 1001) inXData = true;
        if (!inXData && group.code >= 420 && group.code <= 427) {
            // A true colour is 24 bits of RGB; this build leaves its colour-method byte on.
            const long long value = TagValues::toInteger(group.value);
            if (value < 0 || value > 0xFFFFFF) {
                copyTo(group.begin);
                writer.integer(group.code, value & 0xFFFFFF);
                copied = group.end;
                ++counts_.trueColors;
            }
        }
        if (!inXData) continue;
        if (group.code == 1070) {
            // A 16-bit signed number that came out unsigned: 65535 is -1.
            const long long value = TagValues::toInteger(group.value);
            if (value > 32767 && value <= 65535) {
                copyTo(group.begin);
                writer.integer(1070, value - 65536);
                copied = group.end;
                ++counts_.xdataIntegers;
            }
        } else if (group.code == 1003 && allDigits(group.value) && !names.count(group.value)) {
            std::uint64_t raw = 0;
            const auto result =
                std::from_chars(group.value.data(), group.value.data() + group.value.size(), raw);
            if (result.ec != std::errc()) continue;
            const auto it = layerNames.find(__builtin_bswap64(raw));
            if (it == layerNames.end()) continue;
            copyTo(group.begin);
            writer.put(1003, it->second);
            copied = group.end;
            ++counts_.xdataLayers;
        }
    }
    copyTo(dxf.size());
    return out;
}

void DwgRepair::repairDrawing(Database& database) {
    // Every layer came out off: the model knows which ones are.
    for (const QJsonValue& entry : facts_.value("layers").toArray()) {
        const QJsonObject fact = entry.toObject();
        auto* layer =
            dynamic_cast<LayerRecord*>(database.objectByHandle(handleOf(fact.value("handle"))));
        if (!layer) continue;
        const bool off = fact.value("off").toBool();
        if (layer->isOff() == off) continue;
        layer->setOff(off);
        ++counts_.layersOff;
    }

    // Vertex widths of lightweight polylines were left out.
    for (const QJsonValue& entry : facts_.value("polylineWidths").toArray()) {
        const QJsonObject fact = entry.toObject();
        DbObject* polyline = database.objectByHandle(handleOf(fact.value("handle")));
        if (!polyline || !polyline->isType("LWPOLYLINE")) continue;
        const QJsonArray widths = fact.value("widths").toArray();
        const std::size_t end = polyline->xdataStart();
        const auto old = polyline->tags();
        std::vector<Tag> tags;
        tags.reserve(old.size() + 2 * static_cast<std::size_t>(widths.size()));
        std::vector<std::string> texts;  // kept alive until stored
        int vertex = -1;
        bool inPolyline = false;
        for (std::size_t i = 0; i < old.size(); ++i) {
            const Tag& tag = old[i];
            if (i < end && tag.code == 100) inPolyline = tag.value == "AcDbPolyline";
            const bool ours = i < end && inPolyline;
            if (ours && tag.code == 10) ++vertex;
            // A constant width of 0 beside vertex widths, and the old vertex widths, go.
            if (ours && ((tag.code == 43 && TagValues::toReal(tag.value) == 0.0) ||
                         (vertex >= 0 && (tag.code == 40 || tag.code == 41))))
                continue;
            tags.push_back(tag);
            if (ours && tag.code == 20 && vertex >= 0 && vertex < widths.size()) {
                const QJsonArray pair = widths.at(vertex).toArray();
                tags.push_back(Tag{40, database.store(TagValues::fromReal(pair.at(0).toDouble()))});
                tags.push_back(Tag{41, database.store(TagValues::fromReal(pair.at(1).toDouble()))});
            }
        }
        if (vertex + 1 != widths.size()) continue;  // not the polyline the model knows
        polyline->replaceTags(tags);
        ++counts_.polylineWidths;
    }

    // Angles in Xrecords came out converted to degrees; the model has them as stored.
    for (const QJsonValue& entry : facts_.value("xrecordAngles").toArray()) {
        const QJsonObject fact = entry.toObject();
        auto* xrecord =
            dynamic_cast<XRecord*>(database.objectByHandle(handleOf(fact.value("handle"))));
        if (!xrecord) continue;
        const QJsonArray angles = fact.value("angles").toArray();
        std::vector<Tag> data = xrecord->data();
        int next = 0;
        for (const Tag& tag : data)
            if (tag.code >= 50 && tag.code <= 58) ++next;
        if (next != angles.size()) continue;  // not the Xrecord the model knows
        next = 0;
        bool changed = false;
        for (Tag& tag : data) {
            if (tag.code < 50 || tag.code > 58) continue;
            const double radians = angles.at(next++).toDouble();
            if (TagValues::toReal(tag.value) == radians) continue;
            tag.value = database.store(TagValues::fromReal(radians));
            changed = true;
        }
        if (!changed) continue;
        xrecord->setData(data);
        ++counts_.xrecordAngles;
    }
}

}  // namespace zvdb
