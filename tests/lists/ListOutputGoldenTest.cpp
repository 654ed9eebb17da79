// The terminal list's output bytes on generated projects of a few sizes, time stamps set
// aside, against digests taken from the build before the reader's caches and indexes came
// in; the wire list and the strip drawing likewise, against digests taken before their own
// readers and writers were made faster. A change here means the list prints something else:
// a faster path that answers differently, or a change of behaviour that must then be looked
// at and the digest renewed.
#include "ProductFolder.h"

#include <gtest/gtest.h>

#include <QCryptographicHash>
#include <QFile>
#include <QRegularExpression>

namespace {

struct Caso {
    const char* seed;
    const char* terminais;
    bool numerosNoProjeto;
    const char* digest;
};

// Shown in test names and failures.
void PrintTo(const Caso& caso, std::ostream* os) {
    *os << "seed " << caso.seed << ", " << caso.terminais << " terminals";
}

// SHA-256 of the output with every line that is a time ("hh:mm:ss") or a date ("dd/mm/yy")
// replaced by "*".
QByteArray Digest(const QString& arquivo) {
    QFile f(arquivo);
    if (!f.open(QIODevice::ReadOnly)) return {};
    static const QRegularExpression kCarimbo("^(\\d\\d:\\d\\d:\\d\\d|\\d\\d/\\d\\d/\\d\\d)$");
    QList<QByteArray> linhas = f.readAll().split('\n');
    for (QByteArray& linha : linhas)
        if (kCarimbo.match(QString::fromLatin1(linha)).hasMatch()) linha = "*";
    return QCryptographicHash::hash(linhas.join('\n'), QCryptographicHash::Sha256).toHex();
}

// Generates the project in the folder; the failure, or an empty text.
QString Prepara(zvtest::ProductFolder& pasta, const char* seed, const char* terminais,
                bool numerosNoProjeto) {
    QStringList gerar{"--seed", seed, "--terminals", terminais};
    if (numerosNoProjeto)
        gerar << "--numbers"
              << "project";
    return pasta.prepare(gerar);
}

class ListOutputGoldenTest : public ::testing::TestWithParam<Caso> {};

TEST_P(ListOutputGoldenTest, TheTerminalListPrintsTheSameBytesAsBefore) {
    const Caso& caso = GetParam();
    zvtest::ProductFolder pasta;
    const QString falha = Prepara(pasta, caso.seed, caso.terminais, caso.numerosNoProjeto);
    ASSERT_TRUE(falha.isEmpty()) << falha.toStdString();
    const zvtest::HostRun r =
        pasta.zvhost(pasta.terminalList(pasta.project(), pasta.path("l.dxf")));
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    // The stamp is there and is what the digest leaves out.
    QFile saida(pasta.path("l.dxf"));
    ASSERT_TRUE(saida.open(QIODevice::ReadOnly));
    EXPECT_TRUE(QRegularExpression("\n\\d\\d:\\d\\d:\\d\\d\n")
                    .match(QString::fromLatin1(saida.readAll()))
                    .hasMatch());
    EXPECT_EQ(Digest(pasta.path("l.dxf")).toStdString(), caso.digest);
}

INSTANTIATE_TEST_SUITE_P(
    GeneratedProjects, ListOutputGoldenTest,
    ::testing::Values(
        Caso{"3", "60", false, "2087118e531dfa4e251ba2dd6523dee6437ebb37fa589563be5d055a1de856fe"},
        Caso{"5", "400", true, "58ec5ad683a3524f379173c705d958c28da44154acc6d5db0e66ab87efe3876e"},
        Caso{"11", "2500", true,
             "23181992992a4495e0d8eec2e80a1ca7420035eb135b2d9fd2186c7a1bd9ce86"}),
    [](const ::testing::TestParamInfo<Caso>& info) {
        return std::string("seed") + info.param.seed + "_terminals" + info.param.terminais;
    });

// The wire list and the strip drawing, each with the template the user configuration
// names, on the same kind of projects.
struct CasoComando {
    const char* comando;
    const char* seed;
    const char* terminais;
    bool numerosNoProjeto;
    const char* digest;
};

void PrintTo(const CasoComando& caso, std::ostream* os) {
    *os << caso.comando << ", seed " << caso.seed << ", " << caso.terminais << " terminals";
}

class CommandOutputGoldenTest : public ::testing::TestWithParam<CasoComando> {};

TEST_P(CommandOutputGoldenTest, TheListPrintsTheSameBytesAsBefore) {
    const CasoComando& caso = GetParam();
    zvtest::ProductFolder pasta;
    const QString falha = Prepara(pasta, caso.seed, caso.terminais, caso.numerosNoProjeto);
    ASSERT_TRUE(falha.isEmpty()) << falha.toStdString();
    QStringList args = pasta.terminalList(pasta.project(), pasta.path("l.dxf"));
    args.last() = caso.comando;
    const zvtest::HostRun r = pasta.zvhost(args);
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    // The command added pages: the output is no copy of the project.
    QFile saida(pasta.path("l.dxf")), projeto(pasta.project());
    ASSERT_TRUE(saida.open(QIODevice::ReadOnly));
    ASSERT_TRUE(projeto.open(QIODevice::ReadOnly));
    EXPECT_GT(saida.size(), projeto.size());
    EXPECT_EQ(Digest(pasta.path("l.dxf")).toStdString(), caso.digest);
}

INSTANTIATE_TEST_SUITE_P(
    GeneratedProjects, CommandOutputGoldenTest,
    ::testing::Values(
        CasoComando{"gerarListaFiosGrf", "3", "60", false,
                    "afbfc16cb8e82321b444ff366c9820c6eddf3fe8411451966e613abf11aa8945"},
        CasoComando{"gerarListaFiosGrf", "5", "400", true,
                    "539ea3f39596cebc8861a6fdd938b56017d1ba4d386d8848990c2d98bb05c429"},
        CasoComando{"gerarListaFiosGrf", "11", "2500", true,
                    "088012f90ddd040639520e207a868fa1c46f4643d88f0908c9fae8c800863c18"},
        CasoComando{"gerarListaBornesDwg", "3", "60", false,
                    "e0658b0bd3c21a6ae245b484ca1f46af9e4d5a90d5616df0710d5888535ca8d9"},
        CasoComando{"gerarListaBornesDwg", "5", "400", true,
                    "42735e28f75b2cd05f2bf28c556b1f1550ad352f7301218b1c0a992975d951c4"},
        CasoComando{"gerarListaBornesDwg", "11", "2500", true,
                    "d961140bc50c5ac600155e6f45cba66b7d59345d077986f0490d280f0c8de777"}),
    [](const ::testing::TestParamInfo<CasoComando>& info) {
        return std::string(info.param.comando) + "_seed" + info.param.seed + "_terminals" +
               info.param.terminais;
    });

}  // namespace
