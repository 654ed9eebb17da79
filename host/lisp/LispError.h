#pragma once
// A LISP error on its way to the top level, vl-catch-all-apply or *error*.
#include <QString>

#include <exception>

namespace zvlisp {

class LispError : public std::exception {
public:
    explicit LispError(const QString& message) : message_(message) {}
    const char* what() const noexcept override { return "LISP error"; }
    const QString& message() const { return message_; }

    // *error* was already called with the message (before the stack unwound).
    bool handled = false;
    // Cancellation goes through vl-catch-all-apply to the top level.
    bool uncatchable = false;
    // The text ended inside a list, string or comment: more text could complete it.
    bool incompleteInput = false;
    // Where the top-level form that failed was read, when it came from a file.
    QString file;
    int line = 0;

private:
    QString message_;
};

}  // namespace zvlisp
