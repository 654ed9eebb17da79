// alert, getcfg and setcfg (in the product settings file, beside the other modules' keys),
// startapp and help.
#include "LispHostFixture.h"
#include "QtPrinters.h"

#include <QDir>
#include <QFile>
#include <QThread>

namespace {

class SystemLispTest : public LispHostFixture {
protected:
    void SetUp() override {
        LispHostFixture::SetUp();
        hadDataDir_ = qEnvironmentVariableIsSet("ZV_DATA_DIR");
        oldDataDir_ = qgetenv("ZV_DATA_DIR");
        qputenv("ZV_DATA_DIR", folder.path().toUtf8());
        settingsFile_ = folder.filePath("FV/FVREG2022SP0.xml");
    }
    void TearDown() override {
        if (hadDataDir_)
            qputenv("ZV_DATA_DIR", oldDataDir_);
        else
            qunsetenv("ZV_DATA_DIR");
    }
    void writeSettings(const QByteArray& bytes) {
        QDir().mkpath(QFileInfo(settingsFile_).absolutePath());
        QFile file(settingsFile_);
        ASSERT_TRUE(file.open(QIODevice::WriteOnly));
        file.write(bytes);
    }
    QByteArray settings() {
        QFile file(settingsFile_);
        return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
    }

    QString settingsFile_;

private:
    bool hadDataDir_ = false;
    QByteArray oldDataDir_;
};

TEST_F(SystemLispTest, ConfigurationValuesLiveInTheSettingsFile) {
    writeSettings(
        "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<registros>\n"
        "  <registro key=\"Database\" value=\"SQLITE\"/>\n</registros>\n");
    EXPECT_EQ(ev("(getcfg \"AppData/ZVTeste/Cor\")"), "nil");
    EXPECT_EQ(ev("(setcfg \"AppData/ZVTeste/Cor\" \"azul & <verde>\")"), "\"azul & <verde>\"");
    EXPECT_EQ(ev("(getcfg \"AppData/ZVTeste/Cor\")"), "\"azul & <verde>\"");
    EXPECT_EQ(ev("(setcfg \"AppData/ZVTeste/Cor\" \"\")"), "\"\"");
    EXPECT_EQ(ev("(getcfg \"AppData/ZVTeste/Cor\")"), "\"\"");
    const QByteArray saved = settings();
    EXPECT_TRUE(saved.contains("key=\"Database\" value=\"SQLITE\"")) << saved.toStdString();
    EXPECT_TRUE(saved.contains("key=\"AppData/ZVTeste/Cor\"")) << saved.toStdString();
    // Only the AppData part is LISP's.
    EXPECT_EQ(ev("(getcfg \"Database\")"), "nil");
    EXPECT_EQ(ev("(setcfg \"Database\" \"MDB\")"), "nil");
    EXPECT_EQ(ev("(setcfg \"AppData//x\" \"1\")"), "nil");
    EXPECT_TRUE(settings().contains("value=\"SQLITE\""));
    EXPECT_EQ(ev("(setcfg \"AppData/A/B\" 5)"), "ERROR: bad argument type: stringp 5");
}

TEST_F(SystemLispTest, AFileMissingIsMadeAndABrokenOneIsKept) {
    EXPECT_EQ(ev("(setcfg \"AppData/ZV/Primeiro\" \"1\")"), "\"1\"");
    EXPECT_EQ(ev("(getcfg \"AppData/ZV/Primeiro\")"), "\"1\"");
    writeSettings("<registros><registro key=\"Database\"");
    const std::string result = ev("(setcfg \"AppData/ZV/Segundo\" \"2\")");
    EXPECT_EQ(result.rfind("ERROR: setcfg: could not read", 0), 0u) << result;
    EXPECT_EQ(settings(), "<registros><registro key=\"Database\"");
}

TEST_F(SystemLispTest, AlertStartappAndHelp) {
    EXPECT_EQ(ev("(alert \"Lista pronta\")"), "nil");
    EXPECT_TRUE(messages.contains("ZVListas: Lista pronta")) << messages.toStdString();
    EXPECT_EQ(ev("(alert 3)"), "ERROR: bad argument type: stringp 3");
    const QString marker = folder.filePath("started");
    EXPECT_EQ(ev("(type (startapp \"/usr/bin/touch\" " + zvlisp::Printer::quoted(marker) + "))"),
              "INT");
    for (int i = 0; i < 100 && !QFile::exists(marker); ++i)
        QThread::msleep(20);
    EXPECT_TRUE(QFile::exists(marker));
    EXPECT_EQ(ev("(startapp \"/nao/existe/programa\")"), "nil");
    EXPECT_EQ(ev("(help \"zv.chm\" \"entmake\")"), "\"zv.chm\"");
    EXPECT_TRUE(commandLine.contains("docs/lisp.md")) << commandLine.toStdString();
}

}  // namespace
