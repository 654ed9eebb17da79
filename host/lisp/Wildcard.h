#pragma once
// The wildcard patterns of wcmatch: # digit, @ letter, . neither, * any run, ? any one,
// ~ at the start negates, [..] any of, [~..] none of, a-z ranges inside brackets, ` quotes
// the next character, and "," separates alternatives. Case counts.
#include <QString>

#include <vector>

namespace zvlisp {

class Wildcard {
public:
    explicit Wildcard(const QString& pattern);
    bool matches(const QString& text) const;

private:
    enum class Kind { Literal, Digit, Letter, Other, AnyOne, AnyRun, Set };
    struct Token {
        Kind kind = Kind::Literal;
        QChar c;
        bool negated = false;
        std::vector<std::pair<QChar, QChar>> ranges;
        bool accepts(QChar ch) const;
    };
    struct Alternative {
        bool negated = false;
        std::vector<Token> tokens;
    };
    static bool matchTokens(const std::vector<Token>& tokens, const QString& text);
    int parseSet(const QString& pattern, int i, Token& token);

    std::vector<Alternative> alternatives_;
};

}  // namespace zvlisp
