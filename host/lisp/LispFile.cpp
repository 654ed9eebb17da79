#include "LispFile.h"

#include <QDir>
#include <QFileInfo>
#include <QTextCodec>

namespace zvlisp {

LispFile::~LispFile() {
    close();
}

LispFile* LispFile::open(const QString& path, const QString& mode) {
    const QString lower = mode.toLower();
    const QString native = nativePath(path);
    std::unique_ptr<LispFile> file(new LispFile);
    if (lower == QLatin1String("r")) {
        const QString found = resolve(native);
        if (found.isEmpty() || !readText(found, &file->text_)) return nullptr;
    } else if (lower == QLatin1String("w") || lower == QLatin1String("a")) {
        const QString found = resolve(native);
        const QString target = found.isEmpty() ? native : found;
        file->writer_ = std::make_unique<zvsdk::AtomicFile>(target);
        if (!file->writer_->open()) return nullptr;
        if (lower == QLatin1String("a") && !found.isEmpty()) {
            QFile old(found);
            if (!old.open(QIODevice::ReadOnly) || !file->writer_->write(old.readAll()))
                return nullptr;
        }
    } else {
        return nullptr;
    }
    file->open_ = true;
    return file.release();
}

bool LispFile::readLine(QString* line) {
    if (!open_ || writer_ || position_ >= text_.size()) return false;
    int end = text_.indexOf('\n', position_);
    if (end < 0) end = text_.size();
    int stop = end;
    if (stop > position_ && text_[stop - 1] == '\r') --stop;
    *line = text_.mid(position_, stop - position_);
    position_ = end + 1;
    return true;
}

int LispFile::readChar() {
    if (!open_ || writer_ || position_ >= text_.size()) return -1;
    return text_[position_++].unicode();
}

bool LispFile::write(const QString& text) {
    if (!open_ || !writer_) return false;
    return writer_->write(text.toUtf8());
}

bool LispFile::close() {
    if (!open_) return false;
    open_ = false;
    if (!writer_) return true;
    const bool saved = writer_->commit();
    if (!saved) error_ = writer_->errorString();
    writer_.reset();
    return saved;
}

bool LispFile::readText(const QString& path, QString* text) {
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly)) return false;
    const QByteArray bytes = file.readAll();
    if (bytes.startsWith("\xEF\xBB\xBF")) {
        *text = QString::fromUtf8(bytes.mid(3));
    } else if (bytes.startsWith("\xFF\xFE") || bytes.startsWith("\xFE\xFF")) {
        *text = QTextCodec::codecForName("UTF-16")->toUnicode(bytes);
    } else {
        QTextCodec::ConverterState state;
        const QString utf8 =
            QTextCodec::codecForName("UTF-8")->toUnicode(bytes.constData(), bytes.size(), &state);
        *text = state.invalidChars == 0
                    ? utf8
                    : QTextCodec::codecForName("Windows-1252")->toUnicode(bytes);
    }
    return true;
}

QString LispFile::nativePath(const QString& path) {
    QString native = path;
    native.replace('\\', '/');
    return native;
}

QString LispFile::withLspExtension(const QString& name) {
    const QString native = nativePath(name);
    return QFileInfo(native).suffix().isEmpty() ? native + ".lsp" : native;
}

QString LispFile::resolve(const QString& path) {
    if (path.isEmpty()) return QString();
    if (QFileInfo::exists(path)) return path;
    // Folder by folder, a name that differs only in case.
    const QStringList parts = path.split('/');
    QString current = path.startsWith('/') ? QStringLiteral("/") : QStringLiteral(".");
    for (const QString& part : parts) {
        if (part.isEmpty() || part == QLatin1String(".")) continue;
        const QString exact = QDir(current).filePath(part);
        if (QFileInfo::exists(exact)) {
            current = exact;
            continue;
        }
        const QStringList entries =
            QDir(current).entryList(QDir::AllEntries | QDir::NoDotAndDotDot | QDir::Hidden);
        auto match = std::find_if(entries.begin(), entries.end(), [&](const QString& entry) {
            return entry.compare(part, Qt::CaseInsensitive) == 0;
        });
        if (match == entries.end()) return QString();
        current = QDir(current).filePath(*match);
    }
    return current;
}

QString LispFile::find(const QString& name, const QStringList& folders) {
    const QString native = nativePath(name);
    if (native.isEmpty()) return QString();
    if (QDir::isAbsolutePath(native)) {
        const QString found = resolve(native);
        return found.isEmpty() || QFileInfo(found).isDir() ? QString()
                                                           : QFileInfo(found).absoluteFilePath();
    }
    QStringList where{QDir::currentPath()};
    where += folders;
    for (const QString& folder : where) {
        const QString found = resolve(QDir(nativePath(folder)).filePath(native));
        if (!found.isEmpty() && !QFileInfo(found).isDir())
            return QFileInfo(found).absoluteFilePath();
    }
    return QString();
}

}  // namespace zvlisp
