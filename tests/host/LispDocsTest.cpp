// docs/lisp.md lists every function a document's LISP provides: the list is taken from the
// interpreter's registry, so a function added without its line in the docs fails here.
#include "LispHostFixture.h"
#include "QtPrinters.h"
#include "lisp/Symbol.h"

#include <QFile>
#include <QRegularExpression>
#include <QSet>

namespace {

// Every word inside `backticks` of a documentation file, lower case.
QSet<QString> documentedNames(const QString& path) {
    QFile file(path);
    EXPECT_TRUE(file.open(QIODevice::ReadOnly)) << path.toStdString();
    QString text = QString::fromUtf8(file.readAll());
    // Fenced blocks are examples, not names; their triple backticks would pair wrongly.
    text.remove(QRegularExpression(QStringLiteral("```.*?```"),
                                   QRegularExpression::DotMatchesEverythingOption));
    QSet<QString> names;
    static const QRegularExpression code(QStringLiteral("`([^`]+)`"));
    for (auto it = code.globalMatch(text); it.hasNext();) {
        const QString span = it.next().captured(1);
        for (const QString& word : span.split(QRegularExpression("[\\s()]+"), Qt::SkipEmptyParts))
            names.insert(word.toLower());
    }
    return names;
}

class LispDocsTest : public LispHostFixture {};

TEST_F(LispDocsTest, EveryRegisteredFunctionIsDocumented) {
    const QSet<QString> lisp = documentedNames(ZV_SOURCE_DIR "/docs/lisp.md");
    const QSet<QString> product = documentedNames(ZV_SOURCE_DIR "/docs/product-lisp.md");
    QStringList missing;
    int functions = 0;
    for (zvlisp::Symbol* symbol : interpreter().symbols().all()) {
        const bool builtin = symbol->special || symbol->value.type() == zvlisp::Type::Native;
        if (!builtin) continue;
        ++functions;
        const QString name = symbol->name.toLower();
        if (!lisp.contains(name) && !product.contains(name)) missing << name;
    }
    missing.sort();
    EXPECT_TRUE(missing.isEmpty()) << "not in docs/lisp.md: " << missing.join(' ').toStdString();
    // The registry is the interpreter's whole set, the host's functions with it.
    EXPECT_GT(functions, 250);
}

TEST_F(LispDocsTest, TheDocsSayWhatIsNotProvided) {
    QFile file(ZV_SOURCE_DIR "/docs/lisp.md");
    ASSERT_TRUE(file.open(QIODevice::ReadOnly));
    const QString text = QString::fromUtf8(file.readAll());
    EXPECT_TRUE(text.contains("DCL")) << "DCL dialogs";
    EXPECT_TRUE(text.contains("ActiveX"));
    // Each function that fails for want of a screen or a system service is named there.
    for (const char* name : {"grread", "menucmd", "tablet", "vl-registry-read"}) {
        const std::string message = ev(QString("(%1)").arg(name));
        EXPECT_EQ(message.rfind(std::string("ERROR: ") + name + ": not available", 0), 0u)
            << message;
        EXPECT_TRUE(text.contains(QString("`%1`").arg(name)) || text.contains(name)) << name;
    }
}

}  // namespace
