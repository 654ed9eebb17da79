// User input from LISP: initget and the get functions, entsel and nentsel. Every prompt is
// a question to the host's user interface named "prompt:TEXT" (TEXT the prompt without its
// line breaks and final colon), so the command-line host takes scripted answers
// (--answer "prompt:Number of copies=3") and a desktop host asks in a window. Points are
// written "x,y[,z]", or "@dx,dy[,dz]" from the base point. A prompt left unanswered is a
// cancelling user: "Function cancelled".
#include "Application.h"
#include "CadFunctions.h"

#include "drawing/BlockReference.h"
#include "drawing/Entity.h"
#include "drawing/Extents.h"
#include "lisp/NumberFormat.h"
#include "sdk/UserInterface.h"

#include <QStringList>

#include <cmath>

namespace zvhost::cadlisp {

namespace {

// What a script names a prompt by: its text on one line, without the final colon.
QString promptName(const QString& prompt) {
    QString name = prompt.simplified();
    while (name.endsWith(':') || name.endsWith(' '))
        name.chop(1);
    return "prompt:" + name;
}

// Keywords of initget: "Yes No" local names, "_Yes No" after them the global ones, and
// "LType,LT" a name with its shortest form.
struct KeywordRule {
    QString name;      // as written, without the ",abbreviation"
    QString shortest;  // what must be typed at least
};

KeywordRule ruleOf(const QString& word) {
    KeywordRule rule;
    const int comma = word.indexOf(',');
    if (comma > 0) {
        rule.name = word.left(comma);
        rule.shortest = word.mid(comma + 1);
        return rule;
    }
    rule.name = word;
    // The leading capitals are the shortest form; a word all of one case is typed whole.
    int capitals = 0;
    while (capitals < word.size() && !word[capitals].isLower())
        ++capitals;
    const bool mixed = capitals > 0 && capitals < word.size();
    rule.shortest = mixed ? word.left(capitals) : word;
    return rule;
}

bool matches(const KeywordRule& rule, const QString& answer) {
    if (answer.size() < rule.shortest.size() || answer.size() > rule.name.size()) return false;
    return rule.name.startsWith(answer, Qt::CaseInsensitive);
}

Value point3(const zvdb::Point3& p) {
    ListBuilder list;
    list.add(Value::real(p.x));
    list.add(Value::real(p.y));
    list.add(Value::real(p.z));
    return list.take();
}

// A "pt" argument: two or three numbers.
std::optional<zvdb::Point3> pointArgument(Interpreter& in, const Value& v) {
    if (!v.isCons()) return std::nullopt;
    const std::vector<Value> xyz = in.toVector(v);
    if (xyz.size() < 2 || xyz.size() > 3) in.badType("2D/3D point:", v);
    return zvdb::Point3{in.toNumber(xyz[0]), in.toNumber(xyz[1]),
                        xyz.size() > 2 ? in.toNumber(xyz[2]) : 0.0};
}

// The prompt argument at `index`, a string or nil.
QString promptArgument(Interpreter& in, Args a, int index) {
    if (!a.has(index) || a[index].isNil()) return QString();
    return in.toStr(a[index]);
}

// Optional base point then optional prompt: (getpoint [pt] [msg]) and its kin; a prompt
// alone may come first.
void baseAndPrompt(Interpreter& in, Args a, std::optional<zvdb::Point3>* base, QString* prompt) {
    if (a.has(0) && a[0].isString()) {
        *prompt = a[0].asString();
        return;
    }
    if (a.has(0) && !a[0].isNil()) {
        *base = pointArgument(in, a[0]);
        if (!*base) in.badType("2D/3D point:", a[0]);
    }
    *prompt = promptArgument(in, a, 1);
}

bool signAllowed(double value, int bits, QString* complaint) {
    if ((bits & 2) && value == 0.0) {
        *complaint = QStringLiteral("Value must not be zero.");
        return false;
    }
    if ((bits & 4) && value < 0.0) {
        *complaint = QStringLiteral("Value must be positive.");
        return false;
    }
    return true;
}

double normalizedAngle(double radians) {
    double a = std::fmod(radians, 2 * M_PI);
    if (a < 0) a += 2 * M_PI;
    return a;
}

}  // namespace

QString CadFunctions::ask(const QString& prompt) {
    lisp_.write(prompt);
    Application* app = Application::instance();
    zvsdk::UserInterface* ui = app ? app->userInterface() : nullptr;
    const std::optional<QString> answer =
        ui ? ui->answer(promptName(prompt), prompt.trimmed()) : std::nullopt;
    if (!answer) {
        lisp_.write("*Cancel*\n");
        lisp_.fail("Function cancelled");
    }
    lisp_.write(*answer + "\n");
    return *answer;
}

Value CadFunctions::input(const QString& prompt, const Accept& accept, bool keywordsAllowed) {
    // initget speaks for the next input function only.
    const int bits = initBits_;
    const std::vector<Keyword> keywords = std::move(keywords_);
    initBits_ = 0;
    keywords_.clear();
    QString rejected;
    bool hasRejected = false;
    for (;;) {
        const QString answer = ask(prompt).trimmed();
        QString complaint;
        if (answer.isEmpty()) {
            if (!(bits & 1)) return {};
            complaint = QStringLiteral("A value is required.");
        } else {
            if (keywordsAllowed) {
                const bool global = answer.startsWith('_');
                const QString typed = global ? answer.mid(1) : answer;
                for (const Keyword& k : keywords)
                    if (matches(ruleOf(global ? k.global : k.local), typed))
                        return Value::string(ruleOf(k.global).name);
            }
            if (std::optional<Value> value = accept(answer, bits, &complaint)) return *value;
            if (bits & 128) return Value::string(answer);
        }
        lisp_.write(complaint + "\n");
        if (hasRejected && answer == rejected) lisp_.fail("Function cancelled");
        rejected = answer;
        hasRejected = true;
    }
}

std::optional<zvdb::Point3> CadFunctions::parsePoint(const QString& answer,
                                                     const zvdb::Point3* base) const {
    QString text = answer.trimmed();
    const bool relative = text.startsWith('@');
    if (relative) text = text.mid(1);
    const QStringList parts = text.split(',');
    if (parts.size() < 2 || parts.size() > 3) return std::nullopt;
    double xyz[3] = {0, 0, 0};
    for (int i = 0; i < parts.size(); ++i) {
        bool ok = false;
        xyz[i] = parts[i].trimmed().toDouble(&ok);
        if (!ok) return std::nullopt;
    }
    zvdb::Point3 p{xyz[0], xyz[1], xyz[2]};
    if (relative) p = (base ? *base : zvdb::Point3{}) + p;
    return p;
}

Value CadFunctions::getNumber(Args a, bool integer) {
    const QString prompt = promptArgument(lisp_, a, 0);
    return input(
        prompt,
        [integer](const QString& answer, int bits, QString* complaint) -> std::optional<Value> {
            bool ok = false;
            if (integer) {
                const long long value = answer.toLongLong(&ok);
                if (!ok) {
                    *complaint = QStringLiteral("Requires an integer value.");
                    return std::nullopt;
                }
                if (value < -32768 || value > 32767) {
                    *complaint = QStringLiteral("Requires an integer between -32768 and 32767.");
                    return std::nullopt;
                }
                if (!signAllowed(double(value), bits, complaint)) return std::nullopt;
                return Value::integer(std::int32_t(value));
            }
            const double value = answer.toDouble(&ok);
            if (!ok || !std::isfinite(value)) {
                *complaint = QStringLiteral("Requires a numeric value.");
                return std::nullopt;
            }
            if (!signAllowed(value, bits, complaint)) return std::nullopt;
            return Value::real(value);
        });
}

// (getstring [cr] [msg]): without cr the text ends at its first space, as typing a space
// ends the input. initget has no say here.
Value CadFunctions::getString(Args a) {
    bool spaces = false;
    QString prompt;
    if (a.has(0) && a[0].isString()) {
        prompt = a[0].asString();
    } else {
        spaces = a.has(0) && !a[0].isNil();
        prompt = promptArgument(lisp_, a, 1);
    }
    initBits_ = 0;
    keywords_.clear();
    QString answer = ask(prompt);
    if (!spaces) answer = answer.section(' ', 0, 0);
    return Value::string(answer);
}

Value CadFunctions::getKeyword(Args a) {
    const QString prompt = promptArgument(lisp_, a, 0);
    if (keywords_.empty()) lisp_.fail("getkword: no keywords: call initget first");
    return input(prompt, [](const QString&, int, QString* complaint) -> std::optional<Value> {
        *complaint = QStringLiteral("Invalid option keyword.");
        return std::nullopt;
    });
}

Value CadFunctions::getPoint(Args a, bool corner) {
    std::optional<zvdb::Point3> base;
    QString prompt;
    if (corner) {
        base = pointArgument(lisp_, a[0]);
        if (!base) lisp_.badType("2D/3D point:", a[0]);
        prompt = promptArgument(lisp_, a, 1);
    } else {
        baseAndPrompt(lisp_, a, &base, &prompt);
    }
    return input(
        prompt,
        [this, base](const QString& answer, int, QString* complaint) -> std::optional<Value> {
            const std::optional<zvdb::Point3> p = parsePoint(answer, base ? &*base : nullptr);
            if (!p) {
                *complaint = QStringLiteral("Requires a point (x,y or x,y,z).");
                return std::nullopt;
            }
            return point3(*p);
        });
}

// A distance typed in any linear format, or a point: the distance from the base point,
// or to a second point asked for then.
Value CadFunctions::getDistance(Args a) {
    std::optional<zvdb::Point3> base;
    QString prompt;
    baseAndPrompt(lisp_, a, &base, &prompt);
    return input(
        prompt,
        [this, base](const QString& answer, int bits, QString* complaint) -> std::optional<Value> {
            double distance = 0.0;
            if (const std::optional<double> typed = zvlisp::NumberFormat::parseLinear(answer)) {
                distance = *typed;
            } else if (parsePoint(answer, base ? &*base : nullptr)) {
                auto ends = pointPair(answer, base, complaint);
                if (!ends) return std::nullopt;
                auto [from, to] = *ends;
                if (bits & 64) from.z = to.z = 0.0;
                distance = zvdb::length(to - from);
            } else {
                *complaint = QStringLiteral("Requires a distance or a point.");
                return std::nullopt;
            }
            if (!signAllowed(distance, bits, complaint)) return std::nullopt;
            return Value::real(distance);
        });
}

std::optional<std::pair<zvdb::Point3, zvdb::Point3>> CadFunctions::pointPair(
    const QString& answer, const std::optional<zvdb::Point3>& base, QString* complaint) {
    const auto first = parsePoint(answer, base ? &*base : nullptr);
    if (!first) return std::nullopt;
    if (base) return std::pair(*base, *first);
    const auto second = parsePoint(ask(QStringLiteral("\nSpecify second point: ")), &*first);
    if (!second) {
        *complaint = QStringLiteral("Requires a point (x,y or x,y,z).");
        return std::nullopt;
    }
    return std::pair(*first, *second);
}

// An angle typed in the drawing's angle units, or the direction from the base point to a
// point. getorient answers the same here: angles start east and run counter-clockwise.
Value CadFunctions::getAngle(Args a) {
    std::optional<zvdb::Point3> base;
    QString prompt;
    baseAndPrompt(lisp_, a, &base, &prompt);
    const int mode = lisp_.units.aunits;
    return input(prompt,
                 [this, base, mode](const QString& answer, int bits,
                                    QString* complaint) -> std::optional<Value> {
                     double angle = 0.0;
                     if (const auto typed = zvlisp::NumberFormat::parseAngle(answer, mode)) {
                         angle = *typed;
                     } else if (parsePoint(answer, base ? &*base : nullptr)) {
                         const auto ends = pointPair(answer, base, complaint);
                         if (!ends) return std::nullopt;
                         const auto& [from, to] = *ends;
                         angle = std::atan2(to.y - from.y, to.x - from.x);
                     } else {
                         *complaint = QStringLiteral("Requires an angle or a point.");
                         return std::nullopt;
                     }
                     angle = normalizedAngle(angle);
                     if (!signAllowed(angle, bits, complaint)) return std::nullopt;
                     return Value::real(angle);
                 });
}

// A pick by point: (ENAME (x y z)), nil when nothing is there or on Enter. nentsel gives the
// attribute of a block reference when the point falls on one.
Value CadFunctions::entsel(Args a, bool nested) {
    QString prompt = promptArgument(lisp_, a, 0);
    if (prompt.isEmpty()) prompt = QStringLiteral("\nSelect object: ");
    return input(
        prompt,
        [this, nested](const QString& answer, int, QString* complaint) -> std::optional<Value> {
            const auto p = parsePoint(answer, nullptr);
            if (!p) {
                *complaint = QStringLiteral("Requires a point (x,y or x,y,z).");
                return std::nullopt;
            }
            const HostDocument::View& view = document_.view();
            const double tolerance = std::max(1e-6, (view.maxY - view.minY) / 100.0);
            zvdb::Entity* picked = entityAt(*p, tolerance);
            if (!picked) return Value();
            if (nested) {
                if (auto* reference = dynamic_cast<zvdb::BlockReference*>(picked)) {
                    for (zvdb::Entity* sub : reference->liveSubEntities()) {
                        const zvdb::BoundingBox box = zvdb::Extents::ofEntity(*sub, false);
                        if (!box.isEmpty() && p->x >= box.min.x && p->x <= box.max.x &&
                            p->y >= box.min.y && p->y <= box.max.y) {
                            picked = sub;
                            break;
                        }
                    }
                }
            }
            ListBuilder result;
            result.add(ename(picked));
            result.add(point3(*p));
            return result.take();
        });
}

void CadFunctions::installInput() {
    const std::shared_ptr<CadFunctions> self = shared_from_this();
    lisp_.define(
        "initget",
        [self](Interpreter& in, Args a) {
            int bits = 0;
            QString words;
            for (const Value& v : a) {
                if (v.isNil()) continue;
                if (v.isInt())
                    bits = v.asInt();
                else
                    words = in.toStr(v);
            }
            self->initBits_ = bits;
            self->keywords_.clear();
            // Local names, then after a name starting with "_" the global ones in order.
            const QStringList all = words.simplified().split(' ', Qt::SkipEmptyParts);
            int firstGlobal = -1;
            for (int i = 0; i < all.size(); ++i)
                if (all[i].startsWith('_')) {
                    firstGlobal = i;
                    break;
                }
            const int locals = firstGlobal < 0 ? int(all.size()) : firstGlobal;
            for (int i = 0; i < locals; ++i) {
                QString global = all[i];
                if (firstGlobal >= 0 && firstGlobal + i < all.size()) {
                    global = all[firstGlobal + i];
                    if (global.startsWith('_')) global = global.mid(1);
                }
                self->keywords_.push_back({all[i], global});
            }
            return Value();
        },
        0, 2);
    lisp_.define(
        "getint", [self](Interpreter&, Args a) { return self->getNumber(a, true); }, 0, 1);
    lisp_.define(
        "getreal", [self](Interpreter&, Args a) { return self->getNumber(a, false); }, 0, 1);
    lisp_.define(
        "getstring", [self](Interpreter&, Args a) { return self->getString(a); }, 0, 2);
    lisp_.define(
        "getkword", [self](Interpreter&, Args a) { return self->getKeyword(a); }, 0, 1);
    lisp_.define(
        "getpoint", [self](Interpreter&, Args a) { return self->getPoint(a, false); }, 0, 2);
    lisp_.define(
        "getcorner", [self](Interpreter&, Args a) { return self->getPoint(a, true); }, 1, 2);
    lisp_.define(
        "getdist", [self](Interpreter&, Args a) { return self->getDistance(a); }, 0, 2);
    lisp_.define(
        "getangle", [self](Interpreter&, Args a) { return self->getAngle(a); }, 0, 2);
    lisp_.define(
        "getorient", [self](Interpreter&, Args a) { return self->getAngle(a); }, 0, 2);
    lisp_.define(
        "entsel", [self](Interpreter&, Args a) { return self->entsel(a, false); }, 0, 1);
    lisp_.define(
        "nentsel", [self](Interpreter&, Args a) { return self->entsel(a, true); }, 0, 1);
}

}  // namespace zvhost::cadlisp
