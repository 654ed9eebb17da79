// Templates come from users and other people's projects: whatever a template file holds,
// loading it ends with T or with a clear error on the command line, and the document's LISP
// still works. The inputs in data/templates-fuzz/ once made the template fuzzer fail.
#include "TemplateFuzzing.h"

#include <QDir>
#include <QFile>

#include <gtest/gtest.h>

namespace {

QByteArray contentOf(const QString& path) {
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

class TemplateRobustness : public ::testing::Test {
protected:
    TemplateFuzzing fuzzing{ZV_SOURCE_DIR "/data/templates"};
};

TEST_F(TemplateRobustness, TheProductTemplatesLoadInTheSandbox) {
    // The fuzzer's seeds: each loads as it does in a document, the sequential terminal list
    // by loading bornes.grt beside it.
    const QFileInfoList templates =
        QDir(ZV_SOURCE_DIR "/data/templates").entryInfoList(QDir::Files);
    ASSERT_GE(templates.size(), 5);
    for (const QFileInfo& file : templates) {
        const TemplateFuzzing::Result result = fuzzing.run(contentOf(file.filePath()));
        EXPECT_TRUE(result.loaded)
            << file.fileName().toStdString() << ": " << result.printed.toStdString();
        EXPECT_TRUE(result.stillWorks) << file.fileName().toStdString();
    }
}

TEST_F(TemplateRobustness, BrokenTemplatesEndWithAClearError) {
    const struct {
        const char* name;
        QByteArray text;
        const char* error;
    } cases[] = {
        {"unbalanced", "(setq *COLUNA_SN* (list 1 2)", "; error:"},
        {"binary", QByteArray("\x00\xff\xfe(\x01\x80\"", 8), "; error:"},
        {"endless loop", "(setq *QUEBRA_PAGINA* T) (while t (setq i 1))", "Function cancelled"},
        {"endless recursion", "(defun f (x) (f (1+ x))) (f 0)", "; error:"},
        {"string bomb", "(setq s \"x\") (repeat 40 (setq s (strcat s s)))",
         "string too long: strcat"},
        {"deep nesting", QByteArray(100000, '(') + QByteArray(100000, ')'), "; error:"},
        {"missing load", "(load \"no-such-template.grt\")", "; error:"},
        {"file writer", "(zvExportaLayerDxf \"LISTAS$0001$A\" \"/tmp/x.dxf\")", "; error:"},
    };
    for (const auto& c : cases) {
        const TemplateFuzzing::Result result = fuzzing.run(c.text);
        EXPECT_FALSE(result.loaded) << c.name;
        EXPECT_TRUE(result.printed.contains(c.error))
            << c.name << ": " << result.printed.toStdString();
        EXPECT_TRUE(result.stillWorks) << c.name;
    }
}

TEST_F(TemplateRobustness, InputsThatOnceFailedTheFuzzer) {
    const QFileInfoList inputs =
        QDir(ZV_TEST_DIR "/data/templates-fuzz").entryInfoList(QDir::Files, QDir::Name);
    if (inputs.isEmpty()) GTEST_SKIP() << "no fuzzer findings stored";
    for (const QFileInfo& file : inputs) {
        const TemplateFuzzing::Result result = fuzzing.run(contentOf(file.filePath()));
        EXPECT_TRUE(result.stillWorks) << file.fileName().toStdString();
        if (!result.loaded) {
            EXPECT_TRUE(result.printed.contains("; error:"))
                << file.fileName().toStdString() << ": " << result.printed.toStdString();
        }
    }
}

}  // namespace
