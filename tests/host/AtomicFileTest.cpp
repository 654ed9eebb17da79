// The one checked save of user files: content, permissions, and a full disk or a file-size
// limit that leaves the old file as it was and no temporary file behind.
#include "sdk/AtomicFile.h"

#include <gtest/gtest.h>

#include <QDir>
#include <QFile>
#include <QTemporaryDir>

#include <csignal>
#include <string>

#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

QByteArray contentOf(const QString& path) {
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray("<missing>");
}

void writeFile(const QString& path, const QByteArray& bytes) {
    QFile file(path);
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    file.write(bytes);
}

// Everything in the folder but the named files: the leftovers of a save.
QStringList othersIn(const QString& folder, const QStringList& known) {
    QStringList others;
    for (const QString& name :
         QDir(folder).entryList(QDir::Files | QDir::Hidden | QDir::NoDotAndDotDot))
        if (!known.contains(name)) others << name;
    return others;
}

// Saves `size` bytes in a child process whose files may grow to `limit` bytes; the child's
// exit status is 0 when the save succeeded, 1 when it failed, and it writes the error text
// to `errorFile`.
int saveUnderLimit(const QString& path, std::size_t size, rlim_t limit, const QString& errorFile) {
    const pid_t child = fork();
    if (child == 0) {
        std::signal(SIGXFSZ, SIG_IGN);
        const rlimit files{limit, limit};
        setrlimit(RLIMIT_FSIZE, &files);
        QString error;
        const bool saved = zvsdk::saveFileAtomically(path, std::string(size, 'n'), &error);
        QFile out(errorFile);
        if (out.open(QIODevice::WriteOnly)) out.write(error.toUtf8().left(200));
        out.close();  // _exit flushes nothing
        _exit(saved ? 0 : 1);
    }
    int status = 0;
    waitpid(child, &status, 0);
    return WIFEXITED(status) ? WEXITSTATUS(status) : 128;
}

TEST(AtomicFile, ReplacesTheContentAndKeepsThePermissions) {
    QTemporaryDir folder;
    const QString path = folder.filePath("list.csv");
    writeFile(path, "old");
    ASSERT_EQ(chmod(QFile::encodeName(path).constData(), 0640), 0);

    zvsdk::AtomicFile file(path);
    ASSERT_TRUE(file.open());
    EXPECT_TRUE(QFile::exists(file.temporaryPath()));
    EXPECT_EQ(contentOf(path), "old");  // nothing shows before the commit
    ASSERT_TRUE(file.write(std::string_view("new ")));
    ASSERT_TRUE(file.write(QByteArray("content")));
    ASSERT_TRUE(file.commit()) << file.errorString().toStdString();

    EXPECT_EQ(contentOf(path), "new content");
    struct stat info {};
    ASSERT_EQ(stat(QFile::encodeName(path).constData(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777, 0640u);
    EXPECT_EQ(othersIn(folder.path(), {"list.csv"}), QStringList());
}

TEST(AtomicFile, ADroppedOrCancelledSaveLeavesTheOldFile) {
    QTemporaryDir folder;
    const QString path = folder.filePath("page.dxf");
    writeFile(path, "old");
    {
        zvsdk::AtomicFile file(path);
        ASSERT_TRUE(file.open());
        ASSERT_TRUE(file.write(std::string_view("half")));
    }  // never committed
    zvsdk::AtomicFile cancelled(path);
    ASSERT_TRUE(cancelled.open());
    cancelled.cancel();
    EXPECT_FALSE(cancelled.commit());
    EXPECT_EQ(contentOf(path), "old");
    EXPECT_EQ(othersIn(folder.path(), {"page.dxf"}), QStringList());
}

TEST(AtomicFile, AFolderOrAMissingFolderIsRefusedWithItsReason) {
    QTemporaryDir folder;
    QString error;
    EXPECT_FALSE(zvsdk::saveFileAtomically(folder.path(), "x", &error));
    EXPECT_EQ(error, "could not save " + folder.path() + ": it is a directory");
    const QString missing = folder.filePath("no/such/folder/a.csv");
    EXPECT_FALSE(zvsdk::saveFileAtomically(missing, "x", &error));
    EXPECT_EQ(error, "could not save " + missing + ": No such file or directory");
}

TEST(AtomicFile, AFileSizeLimitFailsTheSaveAndKeepsTheOldFileByteForByte) {
    QTemporaryDir folder;
    const QString path = folder.filePath("drawing.dxf");
    const QString errorFile = folder.filePath("error.txt");
    const QByteArray old(5000, 'o');
    writeFile(path, old);

    // 64 KiB may be written: a 1 MiB save fails halfway, a 10 KiB one passes.
    EXPECT_EQ(saveUnderLimit(path, 1 << 20, 64 << 10, errorFile), 1);
    EXPECT_EQ(contentOf(path), old);
    EXPECT_EQ(contentOf(errorFile), "could not save " + path.toUtf8() + ": File too large");
    EXPECT_EQ(othersIn(folder.path(), {"drawing.dxf", "error.txt"}), QStringList());

    EXPECT_EQ(saveUnderLimit(path, 10 << 10, 64 << 10, errorFile), 0);
    EXPECT_EQ(contentOf(path), QByteArray(10 << 10, 'n'));
}

}  // namespace
