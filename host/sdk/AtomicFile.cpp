#include "AtomicFile.h"

#include <QFile>
#include <QFileInfo>

#include <atomic>
#include <cerrno>
#include <cstring>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace zvsdk {

namespace {

std::atomic<unsigned> temporaryCounter{0};

QString temporaryNameFor(const QString& path) {
    const QFileInfo info(path);
    return info.absolutePath() + "/." + info.fileName() + ".zvsave-" + QString::number(getpid()) +
           "-" + QString::number(++temporaryCounter);
}

int retryingOpen(const QByteArray& name, int flags, mode_t mode = 0) {
    int fd;
    do {
        fd = ::open(name.constData(), flags | O_CLOEXEC, mode);
    } while (fd < 0 && errno == EINTR);
    return fd;
}

// The folder's entry of the renamed file reaches the disk too; file systems that can't
// sync a folder say EINVAL, which is no failure of the save.
bool syncFolder(const QString& path) {
    const int fd = retryingOpen(QFile::encodeName(QFileInfo(path).absolutePath()), O_RDONLY);
    if (fd < 0) return true;
    const bool ok = ::fsync(fd) == 0 || errno == EINVAL || errno == EROFS;
    ::close(fd);
    return ok;
}

}  // namespace

AtomicFile::AtomicFile(QString path) : path_(std::move(path)) {}

AtomicFile::~AtomicFile() {
    if (!committed_) cancel();
}

bool AtomicFile::open() {
    if (QFileInfo(path_).isDir()) {
        error_ = "it is a directory";
        return false;
    }
    temporary_ = temporaryNameFor(path_);
    fd_ = retryingOpen(QFile::encodeName(temporary_), O_WRONLY | O_CREAT | O_EXCL, 0666);
    if (fd_ < 0) {
        const int error = errno;
        temporary_.clear();
        return fail(error);
    }
    // A replaced file keeps its permissions.
    struct stat old {};
    if (::stat(QFile::encodeName(path_).constData(), &old) == 0) ::fchmod(fd_, old.st_mode & 07777);
    return true;
}

bool AtomicFile::write(std::string_view bytes) {
    if (failed()) return false;
    if (fd_ < 0) {
        error_ = "the file is not open";
        return false;
    }
    while (!bytes.empty()) {
        const ssize_t n = ::write(fd_, bytes.data(), bytes.size());
        if (n < 0 && errno == EINTR) continue;
        if (n <= 0) return fail(n < 0 ? errno : ENOSPC);
        bytes.remove_prefix(size_t(n));
    }
    return true;
}

bool AtomicFile::commit() {
    if (failed() || temporary_.isEmpty()) {
        if (!failed()) error_ = "the file is not open";
        cancel();
        return false;
    }
    closeDescriptor();
    if (failed()) return cancel(), false;
    // Reopened by name: a library may have written the temporary file through a handle of
    // its own, or replaced it.
    const int fd = retryingOpen(QFile::encodeName(temporary_), O_RDONLY);
    if (fd < 0) return fail(errno);
    const bool synced = ::fsync(fd) == 0;
    const int syncError = errno;
    if (::close(fd) != 0 && synced) return fail(errno);
    if (!synced) return fail(syncError);
    if (::rename(QFile::encodeName(temporary_).constData(), QFile::encodeName(path_).constData()) !=
        0)
        return fail(errno);
    temporary_.clear();
    committed_ = true;
    if (!syncFolder(path_)) return fail(errno);
    return true;
}

void AtomicFile::cancel() {
    closeDescriptor();
    if (!temporary_.isEmpty()) ::unlink(QFile::encodeName(temporary_).constData());
    temporary_.clear();
}

QString AtomicFile::errorString() const {
    return "could not save " + path_ + ": " + error_;
}

bool AtomicFile::fail(int error) {
    if (error_.isEmpty()) error_ = QString::fromLocal8Bit(std::strerror(error));
    if (!committed_) cancel();
    return false;
}

void AtomicFile::closeDescriptor() {
    if (fd_ < 0) return;
    if (::close(fd_) != 0 && error_.isEmpty())
        error_ = QString::fromLocal8Bit(std::strerror(errno));
    fd_ = -1;
}

bool saveFileAtomically(const QString& path, std::string_view bytes, QString* error) {
    AtomicFile file(path);
    if (file.open() && file.write(bytes) && file.commit()) return true;
    if (error) *error = file.errorString();
    return false;
}

}  // namespace zvsdk
