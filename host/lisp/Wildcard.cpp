#include "Wildcard.h"

namespace zvlisp {

Wildcard::Wildcard(const QString& pattern) {
    alternatives_.emplace_back();
    bool atStart = true;
    for (int i = 0; i < pattern.size(); ++i) {
        Alternative& alt = alternatives_.back();
        const QChar c = pattern[i];
        Token token;
        if (atStart && c == '~') {
            alt.negated = true;
            atStart = false;
            continue;
        }
        atStart = false;
        switch (c.unicode()) {
            case ',':
                alternatives_.emplace_back();
                atStart = true;
                continue;
            case '`':
                if (i + 1 < pattern.size())
                    token.c = pattern[++i];
                else
                    token.c = c;
                break;
            case '#':
                token.kind = Kind::Digit;
                break;
            case '@':
                token.kind = Kind::Letter;
                break;
            case '.':
                token.kind = Kind::Other;
                break;
            case '?':
                token.kind = Kind::AnyOne;
                break;
            case '*':
                token.kind = Kind::AnyRun;
                break;
            case '[':
                i = parseSet(pattern, i, token);
                break;
            default:
                token.c = c;
        }
        alt.tokens.push_back(std::move(token));
    }
}

// From "[" to its "]"; an unclosed bracket stands for itself.
int Wildcard::parseSet(const QString& pattern, int i, Token& token) {
    int j = i + 1;
    Token set;
    set.kind = Kind::Set;
    if (j < pattern.size() && pattern[j] == '~') {
        set.negated = true;
        ++j;
    }
    bool first = true;
    for (; j < pattern.size(); ++j) {
        QChar c = pattern[j];
        if (c == ']' && !first) {
            token = std::move(set);
            return j;
        }
        first = false;
        if (c == '`' && j + 1 < pattern.size()) c = pattern[++j];
        QChar hi = c;
        if (j + 2 < pattern.size() && pattern[j + 1] == '-' && pattern[j + 2] != ']') {
            hi = pattern[j + 2];
            j += 2;
        }
        set.ranges.emplace_back(c, hi);
    }
    token.kind = Kind::Literal;
    token.c = '[';
    return i;
}

bool Wildcard::Token::accepts(QChar ch) const {
    switch (kind) {
        case Kind::Literal:
            return ch == c;
        case Kind::Digit:
            return ch >= '0' && ch <= '9';
        case Kind::Letter:
            return ch.isLetter();
        case Kind::Other:
            return !ch.isLetterOrNumber();
        case Kind::AnyOne:
            return true;
        case Kind::AnyRun:
            return true;
        case Kind::Set: {
            bool in = false;
            for (const auto& [lo, hi] : ranges)
                in = in || (ch >= lo && ch <= hi);
            return in != negated;
        }
    }
    return false;
}

// Greedy with a return to the last "*": linear in practice, quadratic at worst.
bool Wildcard::matchTokens(const std::vector<Token>& tokens, const QString& text) {
    size_t t = 0;
    int s = 0;
    size_t starToken = size_t(-1);
    int starText = 0;
    while (s < text.size()) {
        if (t < tokens.size() && tokens[t].kind == Kind::AnyRun) {
            starToken = t++;
            starText = s;
        } else if (t < tokens.size() && tokens[t].accepts(text[s])) {
            ++t;
            ++s;
        } else if (starToken != size_t(-1)) {
            t = starToken + 1;
            s = ++starText;
        } else {
            return false;
        }
    }
    while (t < tokens.size() && tokens[t].kind == Kind::AnyRun)
        ++t;
    return t == tokens.size();
}

bool Wildcard::matches(const QString& text) const {
    for (const Alternative& alt : alternatives_)
        if (matchTokens(alt.tokens, text) != alt.negated) return true;
    return false;
}

}  // namespace zvlisp
