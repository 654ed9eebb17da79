// The user's configuration file found under ZV_DATA_DIR and loaded, or its error reported.
#include "product/UserConfig.h"

#include "lisp/Interpreter.h"

#include <QDir>
#include <QFile>
#include <QTemporaryDir>

#include <gtest/gtest.h>

namespace zvproduct {
namespace {

void write(const QString& path, const char* text) {
    QFile file(path);
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    file.write(text);
}

TEST(UserConfigTest, FoundInTheDataFolderOrItsConfigFolderAndLoaded) {
    QTemporaryDir data;
    const QByteArray saved = qgetenv("ZV_DATA_DIR");
    qputenv("ZV_DATA_DIR", data.path().toUtf8());
    EXPECT_TRUE(UserConfig::file().isEmpty());
    ASSERT_TRUE(QDir(data.path()).mkpath("config"));
    write(data.path() + "/config/zvconfig.lsp", "(setq *DIRETORIO_REDE* \"/rede/\")");
    EXPECT_EQ(UserConfig::file(), data.path() + "/config/zvconfig.lsp");
    write(data.path() + "/zvconfig.lsp", "(setq *DIR_ZVCFG* \"/cfg/\")\n(setq PBLBLNRUNONLSTS T)");
    EXPECT_EQ(UserConfig::file(), data.path() + "/zvconfig.lsp");

    zvlisp::Interpreter lisp;
    QString out;
    lisp.setOutput([&out](const QString& text) { out += text; });
    EXPECT_TRUE(UserConfig::load(lisp, UserConfig::file()));
    EXPECT_EQ(lisp.global("*DIR_ZVCFG*").asString(), "/cfg/");
    EXPECT_FALSE(lisp.global("PBLBLNRUNONLSTS").isNil());

    write(data.path() + "/zvconfig.lsp", "(setq *A* 1)\n(car 5)\n");
    EXPECT_FALSE(UserConfig::load(lisp, UserConfig::file()));
    EXPECT_TRUE(out.contains("bad argument type")) << out.toStdString();
    EXPECT_TRUE(out.contains("user configuration")) << out.toStdString();
    if (saved.isEmpty())
        qunsetenv("ZV_DATA_DIR");
    else
        qputenv("ZV_DATA_DIR", saved);
}

}  // namespace
}  // namespace zvproduct
