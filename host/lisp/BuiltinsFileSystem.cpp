// File names and the file system: vl-filename-*, vl-file-* and vl-directory-files. Names
// may use "\" as folder separator; answers keep the separators they were given.
#include "Builtins.h"
#include "Interpreter.h"
#include "LispFile.h"

#include "sdk/AtomicFile.h"

#include <QDateTime>
#include <QDir>
#include <QFile>
#include <QFileInfo>

namespace zvlisp {

namespace {

// Where the folder part of a name ends: after its last separator, -1 when it has none.
int lastSeparator(const QString& name) {
    return std::max(name.lastIndexOf('/'), name.lastIndexOf('\\'));
}

QString baseWithExtension(const QString& name) {
    return name.mid(lastSeparator(name) + 1);
}

// The extension's dot in the file part, -1 when there is none (".profile" has none).
int extensionDot(const QString& name) {
    const QString file = baseWithExtension(name);
    const int dot = file.lastIndexOf('.');
    if (dot <= 0) return -1;
    return lastSeparator(name) + 1 + dot;
}

Value filenameDirectory(Interpreter& in, Args a) {
    const QString& name = in.toStr(a[0]);
    const int at = lastSeparator(name);
    if (at < 0) return Value::string(QString());
    // A root keeps its separator: "/" and "c:\".
    if (at == 0 || (at == 2 && name[1] == ':')) return Value::string(name.left(at + 1));
    return Value::string(name.left(at));
}

Value filenameBase(Interpreter& in, Args a) {
    const QString& name = in.toStr(a[0]);
    const int dot = extensionDot(name);
    const int start = lastSeparator(name) + 1;
    return Value::string(dot < 0 ? name.mid(start) : name.mid(start, dot - start));
}

Value filenameExtension(Interpreter& in, Args a) {
    const QString& name = in.toStr(a[0]);
    const int dot = extensionDot(name);
    return dot < 0 ? Value() : Value::string(name.mid(dot));
}

QString temporaryFolder() {
    for (const char* variable : {"TMP", "TEMP", "TMPDIR"}) {
        const QString folder = qEnvironmentVariable(variable);
        if (!folder.isEmpty() && QFileInfo(folder).isDir()) return folder;
    }
    return QDir::tempPath();
}

// A name for a new temporary file: pattern + a number not yet taken + extension, in the
// pattern's folder, else the given one, else the system's temporary folder.
Value filenameMktemp(Interpreter& in, Args a) {
    QString pattern = a.has(0) && !a[0].isNil() ? in.toStr(a[0]) : QStringLiteral("$VL~~");
    QString folder = a.has(1) && !a[1].isNil() ? in.toStr(a[1]) : QString();
    QString extension = a.has(2) && !a[2].isNil() ? in.toStr(a[2]) : QString();
    if (const int at = lastSeparator(pattern); at >= 0) {
        folder = pattern.left(at);
        pattern = pattern.mid(at + 1);
    }
    if (const int dot = pattern.lastIndexOf('.'); dot > 0) {
        if (extension.isEmpty()) extension = pattern.mid(dot);
        pattern = pattern.left(dot);
    }
    if (!extension.isEmpty() && !extension.startsWith('.')) extension.prepend('.');
    if (folder.isEmpty()) folder = temporaryFolder();
    const QString separator = folder.endsWith('/') || folder.endsWith('\\') ? "" : "/";
    for (int n = 0; n < 1000000; ++n) {
        const QString name = folder + separator + pattern +
                             QString::number(n, 16).rightJustified(3, '0') + extension;
        if (!QFileInfo::exists(LispFile::nativePath(name))) return Value::string(name);
    }
    return Value();
}

// The source's bytes onto a new file, or after the end of an existing one with `append`;
// the target is written whole or not at all. Never over an existing file otherwise.
Value fileCopy(Interpreter& in, Args a) {
    const QString source = LispFile::nativePath(in.toStr(a[0]));
    const QString target = LispFile::nativePath(in.toStr(a[1]));
    const bool append = a.has(2) && !a[2].isNil();
    const QFileInfo from(source), to(target);
    if (!from.isFile() || to.isDir()) return Value();
    if (to.exists() && (!append || from.canonicalFilePath() == to.canonicalFilePath()))
        return Value();
    QFile input(source);
    if (!input.open(QIODevice::ReadOnly)) return Value();
    const QByteArray bytes = input.readAll();
    if (input.error() != QFile::NoError) return Value();
    QByteArray content;
    if (to.exists()) {
        QFile old(target);
        if (!old.open(QIODevice::ReadOnly)) return Value();
        content = old.readAll();
    }
    content += bytes;
    QString error;
    if (!zvsdk::saveFileAtomically(target, std::string_view(content.data(), size_t(content.size())),
                                   &error))
        return Value();
    return Value::integer(std::int32_t(std::min<qint64>(bytes.size(), INT32_MAX)));
}

Value fileRename(Interpreter& in, Args a) {
    const QString from = LispFile::nativePath(in.toStr(a[0]));
    const QString to = LispFile::nativePath(in.toStr(a[1]));
    if (!QFileInfo::exists(from) || QFileInfo::exists(to)) return Value();
    return in.boolean(QDir().rename(from, to));
}

Value fileSize(Interpreter& in, Args a) {
    const QFileInfo info(LispFile::nativePath(in.toStr(a[0])));
    if (!info.exists()) return Value();
    if (info.isDir()) return Value::integer(0);
    return Value::integer(std::int32_t(std::min<qint64>(info.size(), INT32_MAX)));
}

// (year month day-of-week day hour minute second), Sunday the day 0, in local time.
Value fileSystime(Interpreter& in, Args a) {
    const QFileInfo info(LispFile::nativePath(in.toStr(a[0])));
    if (!info.exists()) return Value();
    const QDateTime time = info.lastModified();
    const QDate date = time.date();
    ListBuilder list;
    for (int part : {date.year(), date.month(), date.dayOfWeek() % 7, date.day(),
                     time.time().hour(), time.time().minute(), time.time().second()})
        list.add(Value::integer(part));
    return list.take();
}

// Names in a folder matching a pattern ("*.*" everything): -1 folders only, 1 files only,
// 0 or nil both. Folders include "." and "..". Nil when nothing matches.
Value directoryFiles(Interpreter& in, Args a) {
    const QString folder =
        a.has(0) && !a[0].isNil() ? LispFile::nativePath(in.toStr(a[0])) : QDir::currentPath();
    QString pattern = a.has(1) && !a[1].isNil() ? in.toStr(a[1]) : QStringLiteral("*.*");
    const int which = a.has(2) && !a[2].isNil() ? in.toInt(a[2]) : 0;
    if (pattern == QLatin1String("*.*")) pattern = QStringLiteral("*");
    const QDir dir(folder);
    if (!dir.exists()) return Value();
    QDir::Filters filters = QDir::Hidden | QDir::System;
    if (which <= 0) filters |= QDir::Dirs;
    if (which >= 0) filters |= QDir::Files;
    ListBuilder names;
    for (const QString& name :
         dir.entryList({pattern}, filters, QDir::Name | QDir::IgnoreCase | QDir::DirsFirst))
        names.add(Value::string(name));
    return names.take();
}

}  // namespace

void registerFileSystemBuiltins(Interpreter& in) {
    in.define("vl-filename-directory", filenameDirectory, 1, 1);
    in.define("vl-filename-base", filenameBase, 1, 1);
    in.define("vl-filename-extension", filenameExtension, 1, 1);
    in.define("vl-filename-mktemp", filenameMktemp, 0, 3);
    in.define("vl-file-copy", fileCopy, 2, 3);
    in.define(
        "vl-file-delete",
        [](Interpreter& in, Args a) {
            const QString path = LispFile::nativePath(in.toStr(a[0]));
            return in.boolean(QFileInfo(path).isFile() && QFile::remove(path));
        },
        1, 1);
    in.define("vl-file-rename", fileRename, 2, 2);
    in.define("vl-file-size", fileSize, 1, 1);
    in.define("vl-file-systime", fileSystime, 1, 1);
    in.define(
        "vl-file-directory-p",
        [](Interpreter& in, Args a) {
            return in.boolean(QFileInfo(LispFile::nativePath(in.toStr(a[0]))).isDir());
        },
        1, 1);
    in.define("vl-directory-files", directoryFiles, 0, 3);
}

}  // namespace zvlisp
