#pragma once
// The one way a user file is saved: the new content goes to a temporary file beside the
// target, every write is checked, the file is flushed to the disk, and only then does a
// rename put it in place. On any failure the temporary file is removed and the old file
// stays byte for byte; errorString() then says why, as "could not save FILE: REASON".
//
//     zvsdk::AtomicFile file(path);
//     if (!file.open() || !file.write(text) || !file.commit()) report(file.errorString());
//
// Libraries that write a file by its name (zip, PDF, image writers) write to
// temporaryPath() after open() and then call commit(), which checks what they left.
#include <QByteArray>
#include <QString>

#include <string_view>

namespace zvsdk {

class AtomicFile {
public:
    explicit AtomicFile(QString path);
    ~AtomicFile();  // removes the temporary file unless committed
    AtomicFile(const AtomicFile&) = delete;
    AtomicFile& operator=(const AtomicFile&) = delete;

    // Creates the temporary file; false with errorString() set when it can't.
    bool open();
    bool write(std::string_view bytes);
    bool write(const QByteArray& bytes) {
        return write(std::string_view(bytes.data(), size_t(bytes.size())));
    }
    // Flushes and closes the temporary file and renames it over the target.
    bool commit();
    // Drops the new content; the target is left as it was.
    void cancel();

    const QString& path() const { return path_; }
    // Where the new content goes until commit().
    const QString& temporaryPath() const { return temporary_; }
    bool failed() const { return !error_.isEmpty(); }
    QString errorString() const;

private:
    bool fail(int error);
    void closeDescriptor();

    QString path_;
    QString temporary_;
    int fd_ = -1;
    bool committed_ = false;
    QString error_;  // the reason of the first failure
};

// Saves `bytes` as the whole content of `path` through an AtomicFile.
bool saveFileAtomically(const QString& path, std::string_view bytes, QString* error);

}  // namespace zvsdk
