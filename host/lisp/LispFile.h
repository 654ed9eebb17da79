#pragma once
// A file opened by LISP (open, read-line, write-line, close) and the path rules of load and
// findfile. Paths may use "\" as separator, as LISP code written for Windows does; a name
// that does not match exactly is matched without regard to case, folder by folder.
#include "Value.h"

#include "sdk/AtomicFile.h"

#include <QStringList>

#include <memory>

namespace zvlisp {

class LispFile : public Object {
public:
    ~LispFile() override;
    // Mode "r", "w" or "a"; null when the file can't be opened. Reading takes UTF-8 (or
    // UTF-16 with its mark, or Windows-1252 when the bytes are no UTF-8); writing gives
    // UTF-8. A written file replaces the old one only when closed, and only when every
    // write reached the disk.
    static LispFile* open(const QString& path, const QString& mode);
    bool isOpen() const { return open_; }
    bool reading() const { return !writer_; }
    // A line without its end; false at the end of the file.
    bool readLine(QString* line);
    // A character code; -1 at the end.
    int readChar();
    bool write(const QString& text);
    // False when the file was already closed or could not be saved.
    bool close();
    // Why the last save failed: "could not save FILE: REASON".
    QString errorString() const { return error_; }

    // The whole text of a file, decoded as open() does.
    static bool readText(const QString& path, QString* text);
    // "\" as "/".
    static QString nativePath(const QString& path);
    // The name with ".lsp" added when it has no extension.
    static QString withLspExtension(const QString& name);
    // An absolute path as is, a relative one in the current folder and then in `folders`;
    // empty when not found.
    static QString find(const QString& name, const QStringList& folders);

private:
    LispFile() = default;
    static QString resolve(const QString& path);

    bool open_ = false;
    QString text_;  // what is read
    int position_ = 0;
    std::unique_ptr<zvsdk::AtomicFile> writer_;
    QString error_;
};

}  // namespace zvlisp
