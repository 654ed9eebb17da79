// The message files that ship with the module: every number the code prints and every row
// of docs/messages.md has a text in the three languages, and the table documents them all.
#include "AmbienteTeste.h"
#include "settings/CIRegistro.h"

#include <QDirIterator>
#include <QMap>
#include <QRegularExpression>
#include <QSet>

#include <array>

namespace {

using Numeros = QMap<QString, QSet<int>>;  // section -> numbers

const QString kFonte = QStringLiteral(ZV_SOURCE_DIR);
const QStringList kPastasModulo = {"module", "readers", "lists",     "strips",   "topographic",
                                   "export", "cad",     "catalogue", "settings", "dialogs"};
const QMap<QString, QString> kArquivos = {{"ZVLISTAS", "ZVListas.config"},
                                          {"ZVINC", "ZVINC.config"}};

int Numero(const QString& texto, bool* ok) {
    return texto.toInt(ok, 0);
}

// A named constant of the file: "kNome = 900;" (also in enums).
int Constante(const QString& fonte, const QString& nome, bool* ok) {
    const QRegularExpression definicao("\\b" + QRegularExpression::escape(nome) +
                                       "\\s*=\\s*(0[xX][0-9A-Fa-f]+|\\d+)\\s*[;,}]");
    const QRegularExpressionMatch achado = definicao.match(fonte);
    *ok = false;
    return achado.hasMatch() ? Numero(achado.captured(1), ok) : 0;
}

// Arguments that are computed (a parameter, "299 + n") are left to the table's check.
void Registra(const QString& fonte, const QString& secao, const QString& argumento,
              Numeros& numeros) {
    bool ok = false;
    int numero = Numero(argumento, &ok);
    if (!ok) numero = Constante(fonte, argumento, &ok);
    if (ok) numeros[secao].insert(numero);
}

Numeros NumerosDoCodigo() {
    static const QRegularExpression imprime("ImprimeMensagem\\(\\s*(\\w+)\\s*\\)");
    static const QRegularExpression mensagem("Mensagem\\(\\s*\"(\\w+)\"\\s*,\\s*(\\w+)\\s*\\)");
    Numeros numeros;
    for (const QString& pasta : kPastasModulo) {
        QDirIterator arquivos(kFonte + "/" + pasta, {"*.cpp", "*.h"}, QDir::Files,
                              QDirIterator::Subdirectories);
        while (arquivos.hasNext()) {
            const QString fonte = QString::fromUtf8(AmbienteTeste::Le(arquivos.next()));
            for (auto it = imprime.globalMatch(fonte); it.hasNext();)
                Registra(fonte, "ZVLISTAS", it.next().captured(1), numeros);
            for (auto it = mensagem.globalMatch(fonte); it.hasNext();) {
                const QRegularExpressionMatch achado = it.next();
                Registra(fonte, achado.captured(1), achado.captured(2), numeros);
            }
        }
    }
    return numeros;
}

// The rows "| 63 | 0x3F | ..." under each "## Section NAME" of docs/messages.md.
Numeros NumerosDaTabela() {
    static const QRegularExpression secao("^## Section (\\w+)");
    static const QRegularExpression linha("^\\| (\\d+) \\| 0x[0-9A-F]+ \\|");
    Numeros numeros;
    QString atual;
    const QString texto = QString::fromUtf8(AmbienteTeste::Le(kFonte + "/docs/messages.md"));
    for (const QString& l : texto.split('\n')) {
        if (const auto s = secao.match(l); s.hasMatch()) atual = s.captured(1);
        if (const auto n = linha.match(l); n.hasMatch() && !atual.isEmpty())
            numeros[atual].insert(n.captured(1).toInt());
    }
    return numeros;
}

// Every number that a shipped file holds, in any language.
Numeros NumerosDosArquivos() {
    static const QRegularExpression msg("<msg numero=\"(\\d+)\"");
    Numeros numeros;
    for (auto it = kArquivos.constBegin(); it != kArquivos.constEnd(); ++it) {
        const QString xml =
            QString::fromUtf8(AmbienteTeste::Le(kFonte + "/data/program/" + it.value()));
        for (auto m = msg.globalMatch(xml); m.hasNext();)
            numeros[it.key()].insert(m.next().captured(1).toInt());
    }
    return numeros;
}

class ArquivosMensagensTest : public AmbienteTeste {
protected:
    void SetUp() override {
        AmbienteTeste::SetUp();
        for (const QString& arquivo : kArquivos)
            ASSERT_TRUE(
                QFile::copy(kFonte + "/data/program/" + arquivo, PastaPrograma() + "/" + arquivo))
                << arquivo.toStdString();
    }

    // The texts of a message in Portuguese, English and Spanish, through the real loader.
    static std::array<QString, 3> Textos(const QString& secao, int numero) {
        std::array<QString, 3> textos;
        for (int idioma = 1; idioma <= 3; ++idioma) {
            CIRegistro::SetIdiomaMenuSel(idioma);
            CIMensagens::Descarregar();
            textos[size_t(idioma - 1)] = CIMensagens::Mensagem(secao, numero);
        }
        return textos;
    }

    // Reports each number of `numeros` that lacks a text in some language.
    void ExigeTextos(const Numeros& numeros, const char* origem) {
        for (auto it = numeros.constBegin(); it != numeros.constEnd(); ++it) {
            ASSERT_TRUE(kArquivos.contains(it.key()))
                << origem << " uses section " << it.key().toStdString()
                << ", which has no message file in data/program";
            for (int numero : it.value()) {
                const std::array<QString, 3> textos = Textos(it.key(), numero);
                for (size_t i = 0; i < textos.size(); ++i)
                    EXPECT_FALSE(textos[i].trimmed().isEmpty())
                        << origem << ": " << it.key().toStdString() << " " << numero
                        << " has no text in language " << i + 1;
            }
        }
    }
};

TEST_F(ArquivosMensagensTest, EveryNumberTheCodePrintsHasATextInEachLanguage) {
    const Numeros numeros = NumerosDoCodigo();
    // The scan itself must see the pipeline's messages, or it proves nothing.
    ASSERT_TRUE(numeros.value("ZVLISTAS").contains(63));
    ASSERT_TRUE(numeros.value("ZVLISTAS").contains(88));
    ExigeTextos(numeros, "the module's code");
}

TEST_F(ArquivosMensagensTest, EveryDocumentedNumberHasATextInEachLanguage) {
    const Numeros tabela = NumerosDaTabela();
    ASSERT_GT(tabela.value("ZVLISTAS").size(), 100);
    ASSERT_EQ(tabela.value("ZVINC"), QSet<int>({17, 18}));
    ExigeTextos(tabela, "docs/messages.md");
}

TEST_F(ArquivosMensagensTest, EveryNumberOfTheFilesIsDocumented) {
    const Numeros tabela = NumerosDaTabela();
    const Numeros arquivos = NumerosDosArquivos();
    ASSERT_EQ(arquivos.keys(), kArquivos.keys());
    for (auto it = arquivos.constBegin(); it != arquivos.constEnd(); ++it)
        for (int numero : it.value())
            EXPECT_TRUE(tabela.value(it.key()).contains(numero))
                << it.key().toStdString() << " " << numero << " is not in docs/messages.md";
}

TEST_F(ArquivosMensagensTest, TextsAreReadyToShow) {
    const Numeros tabela = NumerosDaTabela();
    for (auto it = tabela.constBegin(); it != tabela.constEnd(); ++it)
        for (int numero : it.value())
            for (const QString& texto : Textos(it.key(), numero))
                EXPECT_FALSE(texto.contains("PRODUCTNAME]")) << numero;
    // The languages differ where they should, and the paper names must not.
    EXPECT_EQ(Textos("ZVLISTAS", 63),
              (std::array<QString, 3>{"Lista gerada.", "List created.", "Lista generada."}));
    for (int papel = 0xBA; papel <= 0xC3; ++papel) {
        const std::array<QString, 3> textos = Textos("ZVLISTAS", papel);
        EXPECT_TRUE(textos[0] == textos[1] && textos[1] == textos[2]) << papel;
        EXPECT_TRUE(textos[0].endsWith(" mm)")) << textos[0].toStdString();
    }
    EXPECT_EQ(Textos("ZVLISTAS", 0x99)[1], "FV PDF");
    EXPECT_TRUE(Textos("ZVLISTAS", 326)[1].startsWith('\n'));
}

}  // namespace
