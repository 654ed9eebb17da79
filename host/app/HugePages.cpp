#include "HugePages.h"

#include <QCoreApplication>
#include <QFile>
#include <QFileInfo>

#include <unistd.h>

#include <cstdlib>  // setenv, unsetenv
#include <vector>

namespace zvhost {

namespace {

constexpr char kTunable[] = "glibc.malloc.hugetlb=1";

}  // namespace

bool kernelOffersHugePages() {
    QFile mode("/sys/kernel/mm/transparent_hugepage/enabled");
    return mode.open(QIODevice::ReadOnly) && !mode.readAll().contains("[never]");
}

bool wantsHugePages(const QString& drawing) {
    const QByteArray asked = qgetenv("ZV_HUGE_PAGES");
    if (asked == "0") return false;
    if (qgetenv("GLIBC_TUNABLES").contains("glibc.malloc.hugetlb")) return false;
    if (asked != "1" && QFileInfo(drawing).size() < kLargeDrawingBytes) return false;
    return kernelOffersHugePages();
}

void restartWithHugePages(const QString& drawing) {
    if (!wantsHugePages(drawing)) return;
    const bool hadTunables = qEnvironmentVariableIsSet("GLIBC_TUNABLES");
    const QByteArray before = qgetenv("GLIBC_TUNABLES");
    const QByteArray tunables = before.isEmpty() ? QByteArray(kTunable) : before + ':' + kTunable;
    if (setenv("GLIBC_TUNABLES", tunables.constData(), 1) != 0) return;
    std::vector<QByteArray> arguments;
    for (const QString& argument : QCoreApplication::arguments())
        arguments.push_back(QFile::encodeName(argument));
    std::vector<char*> argv;
    for (QByteArray& argument : arguments)
        argv.push_back(argument.data());
    argv.push_back(nullptr);
    execv("/proc/self/exe", argv.data());
    // Still here: the run goes on in this process, with the environment as it was.
    if (hadTunables)
        setenv("GLIBC_TUNABLES", before.constData(), 1);
    else
        unsetenv("GLIBC_TUNABLES");
}

}  // namespace zvhost
