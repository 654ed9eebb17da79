// The export configuration file: reading, writing, migration and damaged files.
#include "QtPrinters.h"
#include "export/CEExportConfigs.h"

#include <QDir>
#include <QFile>
#include <QRegularExpression>
#include <QTemporaryDir>

#include <gtest/gtest.h>

#include <filesystem>

#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>
#include <csignal>

namespace {

QByteArray Crlf(const QByteArray& texto) {
    QByteArray t = texto;
    return t.replace("\n", "\r\n");
}

CEExportConfigs Le(const QByteArray& texto) {
    CEExportConfigs configs;
    EXPECT_TRUE(configs.LeTexto(Crlf(texto)));
    return configs;
}

QByteArray LeArquivo(const QString& caminho) {
    QFile f(caminho);
    return f.open(QIODevice::ReadOnly) ? f.readAll() : QByteArray();
}

void Grava(const QString& caminho, const QByteArray& bytes) {
    QFile f(caminho);
    ASSERT_TRUE(f.open(QIODevice::WriteOnly | QIODevice::Truncate));
    ASSERT_EQ(f.write(bytes), bytes.size());
}

const QByteArray kExemplo =
    "{}\n"
    "-CFG_ATIVO=Painel\n"
    "\n"
    "{Painel}\n"
    "[]\n"
    "TIPO_IN=BORNES\n"
    "[BORNES]\n"
    "TIPO_IN=BORNES\n"
    "TIPO_OUT=CSV\n"
    "CSV_DELIM_CAMPO=,\n"
    "*REGUA*S*N*Regua*N*N*N**\n"
    "*NUMERO*S*N*Numero*N*N*S*4*0\n"
    "#REGUA#0#X1\n";

}  // namespace

TEST(ConfigArquivo, ReadsConfigurationsSectionsRowsAndOptions) {
    const CEExportConfigs c = Le(kExemplo);
    ASSERT_EQ(c.Configs.size(), 2u);
    EXPECT_EQ(c.Configs[0]->Nome, "");
    EXPECT_EQ(c.ObtemConfigAtiva(), "Painel");
    const CEExportConfig* painel = c.Config("Painel");
    ASSERT_NE(painel, nullptr);
    ASSERT_EQ(painel->Secoes.size(), 2u);
    EXPECT_EQ(painel->Secoes[0]->Nome, "");
    EXPECT_EQ(painel->Secoes[0]->Opcoes.valor("TIPO_IN"), "BORNES");
    const CEExportSecao* bornes = painel->Secao("BORNES");
    ASSERT_NE(bornes, nullptr);
    EXPECT_EQ(bornes->Opcoes.valor("TIPO_OUT"), "CSV");
    EXPECT_EQ(bornes->Opcoes.valor("CSV_DELIM_CAMPO"), ",");
    // Options the file does not set keep the defaults of a new section.
    EXPECT_EQ(bornes->Opcoes.valor("HTML_LARG_TABELA"), "1");
    EXPECT_EQ(bornes->Opcoes.valor("CSV_DELIM_TEXTO"), "\"");
    ASSERT_EQ(bornes->Colunas.size(), 2u);
    const auto& numero = bornes->Colunas[1];
    EXPECT_EQ(numero.Tag, "NUMERO");
    EXPECT_TRUE(numero.Visivel);
    EXPECT_FALSE(numero.Agrupa);
    EXPECT_EQ(numero.Titulo, "Numero");
    EXPECT_TRUE(numero.Direita);
    EXPECT_EQ(numero.Tamanho, "4");
    EXPECT_EQ(numero.Preenche, "0");
    EXPECT_EQ(bornes->Colunas[0].Tamanho, "");
    EXPECT_EQ(bornes->Colunas[0].Preenche, "");
    ASSERT_EQ(bornes->Filtros.size(), 1u);
    EXPECT_EQ(bornes->Filtros[0], (CEExportSecao::LinhaFiltro{"REGUA", 0, "X1"}));
}

TEST(ConfigArquivo, EmptyFieldsSlideTheRestLeft) {
    const CEExportConfigs c = Le("{A}\n[BORNES]\n*A*S*N**N*S*N*5*\n");
    const auto& col = c.Config("A")->Secao("BORNES")->Colunas.at(0);
    EXPECT_EQ(col.Tag, "A");
    EXPECT_EQ(col.Titulo, "N");
    EXPECT_TRUE(col.Literal);
    EXPECT_FALSE(col.Concatena);
    EXPECT_FALSE(col.Direita);  // "5" landed here and is not "S"
    EXPECT_EQ(col.Tamanho, "");
    EXPECT_EQ(col.Preenche, "");
}

TEST(ConfigArquivo, OnlyCapitalSIsTrue) {
    const CEExportConfigs c = Le("{A}\n[X]\n*T*s*SIM*Titulo*S*N*N*0*\n");
    const auto& col = c.Config("A")->Secao("X")->Colunas.at(0);
    EXPECT_FALSE(col.Visivel);
    EXPECT_FALSE(col.Agrupa);
    EXPECT_TRUE(col.Literal);
}

TEST(ConfigArquivo, EscapesAreUndoneInTitlesAndFiltersOnly) {
    CEExportConfigs c;
    CEExportSecao& s = c.ObtemSecao("A", "BORNES");
    s.Colunas.push_back({"TAG", true, false, "A*B", false, false, false, "5", "*"});
    s.Filtros.push_back({"F#1", 2, "v#w"});
    const QByteArray texto = c.Texto();
    EXPECT_TRUE(texto.contains("*TAG*S*N*A__=X=__B*N*N*N*5*__=X=__\r\n")) << texto.constData();
    EXPECT_TRUE(texto.contains("#F__=X=__1#2#v__=X=__w\r\n"));

    CEExportConfigs lido;
    ASSERT_TRUE(lido.LeTexto(texto));
    const CEExportSecao* volta = lido.Config("A")->Secao("BORNES");
    EXPECT_EQ(volta->Colunas.at(0).Titulo, "A*B");
    // The fill keeps the escape: that side has never been undone.
    EXPECT_EQ(volta->Colunas.at(0).Preenche, "__=X=__");
    EXPECT_EQ(volta->Filtros.at(0).Campo, "F#1");
    EXPECT_EQ(volta->Filtros.at(0).Valor, "v#w");
}

TEST(ConfigArquivo, ValuesStopAtTheNextEqualsAndAreTrimmed) {
    const CEExportConfigs c = Le("{A}\n-K1 =  um valor  \n[S]\nCSV_DELIM_CAMPO==\nX=a=b\nSOLTA\n");
    const CEExportConfig* a = c.Config("A");
    EXPECT_EQ(a->Valores.valor("K1"), "um valor");
    const CEExportSecao* s = a->Secao("S");
    EXPECT_TRUE(s->Opcoes.contem("CSV_DELIM_CAMPO"));
    EXPECT_EQ(s->Opcoes.valor("CSV_DELIM_CAMPO"), "");
    EXPECT_EQ(s->Opcoes.valor("X"), "a");
    // A line with no mark and no "=" is an option with an empty value.
    EXPECT_TRUE(s->Opcoes.contem("SOLTA"));
    EXPECT_EQ(s->Opcoes.valor("SOLTA"), "");
}

TEST(ConfigArquivo, WhitespaceOnlyValuesAreLost) {
    CEExportConfigs c;
    c.ObtemSecao("A", "CSV").Opcoes.definir("CSV_DELIM_CAMPO", "\t");
    CEExportConfigs lido;
    ASSERT_TRUE(lido.LeTexto(c.Texto()));
    EXPECT_EQ(lido.Config("A")->Secao("CSV")->Opcoes.valor("CSV_DELIM_CAMPO"), "");
}

TEST(ConfigArquivo, LinesWithoutAPlaceAreDropped) {
    // Options and rows before any section, and an unnamed configuration made on demand.
    const CEExportConfigs c =
        Le("-CFG_ATIVO=X\nTIPO_IN=BORNES\n*A*S*N*A*N*N*N**\n#A#0#B\n{Y}\n[S]\n");
    ASSERT_EQ(c.Configs.size(), 2u);
    EXPECT_EQ(c.Configs[0]->Nome, "");
    EXPECT_EQ(c.ObtemConfigAtiva(), "X");
    EXPECT_TRUE(c.Configs[0]->Secoes.empty());
    EXPECT_EQ(c.Config("Y")->Secao("S")->Colunas.size(), 0u);
}

TEST(ConfigArquivo, UnknownKeysAndSectionsSurviveARoundTrip) {
    const QByteArray texto = kExemplo +
                             "[OUTRA_COISA]\n"
                             "CHAVE_NOVA_SN=S\n"
                             "*X*N*S*Titulo X*S*S*S*10*ab\n";
    const CEExportConfigs c = Le(texto);
    const QByteArray escrito = c.Texto();
    CEExportConfigs lido;
    ASSERT_TRUE(lido.LeTexto(escrito));
    EXPECT_EQ(lido.Texto(), escrito);
    const CEExportSecao* outra = lido.Config("Painel")->Secao("OUTRA_COISA");
    ASSERT_NE(outra, nullptr);
    EXPECT_EQ(outra->Opcoes.valor("CHAVE_NOVA_SN"), "S");
    EXPECT_EQ(outra->Colunas.at(0), (CEExportSecao::LinhaColuna{"X", false, true, "Titulo X", true,
                                                                true, true, "10", "ab"}));
}

TEST(ConfigArquivo, WritesTheFileLineByLine) {
    CEExportConfigs c;
    c.Configs.push_back(std::make_unique<CEExportConfig>());
    c.DefineConfigAtiva("P");
    CEExportSecao& s = c.ObtemSecao("P", "BORNES");
    s.Colunas.push_back({"REGUA", true, false, "REGUA", false, false, false, "", ""});
    s.Filtros.push_back({"REGUA", 0, "X1"});
    const QString texto = QString::fromLatin1(c.Texto());
    const QStringList linhas = texto.split("\r\n");
    ASSERT_GE(linhas.size(), 33);
    EXPECT_EQ(linhas[0], "{}");
    EXPECT_EQ(linhas[1], "-CFG_ATIVO=P");
    EXPECT_EQ(linhas[2], "");
    EXPECT_EQ(linhas[3], "{P}");
    EXPECT_EQ(linhas[4], "[BORNES]");
    // Every option of a new section, in the order of the defaults.
    EXPECT_EQ(linhas[5], "CSV_CABECALHO_SN=S");
    EXPECT_EQ(linhas[6], "CSV_DELIM_CAMPO=;");
    EXPECT_EQ(linhas[7], "CSV_DELIM_TEXTO=\"");
    EXPECT_EQ(linhas[29], "FLT_TIPO_ORDEM=C");
    EXPECT_EQ(linhas[30], "*REGUA*S*N*REGUA*N*N*N**");
    EXPECT_EQ(linhas[31], "#REGUA#0#X1");
    EXPECT_EQ(linhas[32], "");
    EXPECT_FALSE(texto.contains(QRegularExpression("[^\r]\n")));
}

TEST(ConfigArquivo, BracesAndBracketsAloneNameTheEmptyConfigAndSection) {
    const CEExportConfigs c = Le("{}\n[]\nTIPO_IN=FIOS\n{\n[\n");
    ASSERT_EQ(c.Configs.size(), 2u);
    EXPECT_EQ(c.Configs[0]->Secoes.at(0)->Nome, "");
    EXPECT_EQ(c.Configs[0]->Secoes.at(0)->Opcoes.valor("TIPO_IN"), "FIOS");
    EXPECT_EQ(c.Configs[1]->Nome, "");
    EXPECT_EQ(c.Configs[1]->Secoes.at(0)->Nome, "");
}

TEST(ConfigArquivo, ALineOfTwoThousandCharactersIsReadAndOneMoreIsDamage) {
    const QByteArray valor(2000 - 3, 'v');  // "-K=" and the value: 2000
    CEExportConfigs c;
    ASSERT_TRUE(c.LeTexto("{A}\r\n-K=" + valor + "\r\n"));
    EXPECT_EQ(c.Config("A")->Valores.valor("K").size(), valor.size());

    CEExportConfigs d;
    ASSERT_TRUE(d.LeTexto(Crlf(kExemplo)));
    EXPECT_FALSE(d.LeTexto("{B}\r\n-K=" + valor + "x\r\n"));
    // The list stays as it was.
    EXPECT_NE(d.Config("Painel"), nullptr);
    EXPECT_EQ(d.Config("B"), nullptr);
}

TEST(ConfigArquivo, CharactersBeyondLatin1AreWrittenAsQuestionMarks) {
    CEExportConfigs c;
    CEExportSecao& s = c.ObtemSecao("Ação", "BORNES");
    s.Colunas.push_back({"T", true, false, QString::fromUtf8("Ω é"), false, false, false, "", ""});
    const QByteArray texto = c.Texto();
    EXPECT_TRUE(texto.contains("{A\xe7\xe3o}\r\n"));
    EXPECT_TRUE(texto.contains("*T*S*N*? \xe9*N*N*N**"));
    CEExportConfigs lido;
    ASSERT_TRUE(lido.LeTexto(texto));
    EXPECT_NE(lido.Config(QString::fromUtf8("Ação")), nullptr);
}

TEST(ConfigModelo, ObtainsSectionsAndRemovesConfigurations) {
    CEExportConfigs c;
    EXPECT_EQ(c.ObtemConfigAtiva(), "");
    c.DefineConfigAtiva("nada");  // no unnamed configuration: nothing happens
    EXPECT_TRUE(c.Configs.empty());

    c.Configs.push_back(std::make_unique<CEExportConfig>());
    CEExportSecao& a = c.ObtemSecao("Um", "FIOS");
    a.Opcoes.definir("TIPO_OUT", "XML");
    EXPECT_EQ(&c.ObtemSecao("Um", "FIOS"), &a);
    EXPECT_NE(&c.ObtemSecao("um", "FIOS"), &a);  // names compare exactly
    EXPECT_EQ(c.Configs.size(), 3u);
    EXPECT_EQ(c.Config("Um")->Secoes.size(), 1u);
    EXPECT_EQ(a.Opcoes.valor("PDF_DPI"), "300");

    c.DefineConfigAtiva("Um");
    EXPECT_EQ(c.ObtemConfigAtiva(), "Um");
    c.RemoveConfig("Um");
    EXPECT_EQ(c.Config("Um"), nullptr);
    EXPECT_EQ(c.ObtemConfigAtiva(), "");
    c.RemoveConfig("");
    EXPECT_NE(c.Config(""), nullptr);
}

TEST(ConfigModelo, PathsJoinFolderAndName) {
    EXPECT_EQ(CEExportConfigs::Caminho("/cfg", "a.ini"), "/cfg/a.ini");
    EXPECT_EQ(CEExportConfigs::Caminho("/cfg/", "a.ini"), "/cfg/a.ini");
    EXPECT_EQ(CEExportConfigs::Caminho("C:", "a.ini"), "C:a.ini");
    EXPECT_EQ(CEExportConfigs::Caminho("/cfg", "/outro/a.ini"), "/outro/a.ini");
}

class ConfigPasta : public ::testing::Test {
protected:
    QTemporaryDir pasta;
    QString Novo() const { return pasta.filePath(CEExportConfigs::kArquivo); }
    QString Antigo() const { return pasta.filePath(CEExportConfigs::kArquivoAntigo); }
};

TEST_F(ConfigPasta, TheOlderFileIsCopiedToTheNewName) {
    Grava(Antigo(), Crlf(kExemplo));
    CEExportConfigs c;
    c.CarregaDe(pasta.path());
    EXPECT_EQ(LeArquivo(Novo()), Crlf(kExemplo));
    EXPECT_EQ(LeArquivo(Antigo()), Crlf(kExemplo));
    EXPECT_EQ(c.ObtemConfigAtiva(), "Painel");
}

TEST_F(ConfigPasta, TheNewFileWinsOverTheOlderOne) {
    Grava(Antigo(), Crlf(kExemplo));
    Grava(Novo(), "{}\r\n-CFG_ATIVO=Novo\r\n");
    CEExportConfigs c;
    c.CarregaDe(pasta.path());
    EXPECT_EQ(c.ObtemConfigAtiva(), "Novo");
}

TEST_F(ConfigPasta, NoFileLeavesTheListAsItWas) {
    CEExportConfigs c;
    c.ObtemSecao("Antes", "BORNES");
    c.CarregaDe(pasta.path());
    EXPECT_NE(c.Config("Antes"), nullptr);
    EXPECT_FALSE(QFile::exists(Novo()));
}

TEST_F(ConfigPasta, ADamagedFileIsNeverReplacedSilently) {
    const QByteArray danificado = "{A}\r\n" + QByteArray(3000, 'x') + "\r\n";
    Grava(Novo(), danificado);
    CEExportConfigs c;
    c.ObtemSecao("Antes", "BORNES");
    c.CarregaDe(pasta.path());  // no older file: the load just ends
    EXPECT_NE(c.Config("Antes"), nullptr);
    EXPECT_EQ(c.Config("A"), nullptr);

    Grava(Antigo(), Crlf(kExemplo));
    EXPECT_THROW(c.CarregaDe(pasta.path()), std::filesystem::filesystem_error);
    EXPECT_EQ(LeArquivo(Novo()), danificado);
    EXPECT_NE(c.Config("Antes"), nullptr);
}

TEST_F(ConfigPasta, SavesAndLoadsBackTheSame) {
    CEExportConfigs c;
    ASSERT_TRUE(c.LeTexto(Crlf(kExemplo)));
    QString erro;
    ASSERT_TRUE(c.SalvaEm(pasta.path(), &erro)) << erro.toStdString();
    CEExportConfigs lido;
    lido.CarregaDe(pasta.path());
    EXPECT_EQ(lido.Texto(), c.Texto());
    EXPECT_EQ(LeArquivo(Novo()), c.Texto());
    // Only the file itself is left in the folder: the temporary one went.
    EXPECT_EQ(QDir(pasta.path()).entryList(QDir::Files | QDir::Hidden).size(), 1);
}

TEST_F(ConfigPasta, AFailedSaveKeepsTheOldFile) {
    Grava(Novo(), Crlf(kExemplo));
    CEExportConfigs c;
    c.ObtemSecao("Grande", "BORNES")
        .Colunas.assign(5000, {"TAG_LONGA", true, false, "Titulo", false, false, false, "", ""});
    // A child with a file-size limit below the new file's size.
    const pid_t filho = fork();
    ASSERT_GE(filho, 0);
    if (filho == 0) {
        std::signal(SIGXFSZ, SIG_IGN);
        rlimit limite{20000, 20000};
        setrlimit(RLIMIT_FSIZE, &limite);
        QString erro;
        const bool ok = c.SalvaEm(pasta.path(), &erro);
        _exit(!ok && erro.contains("could not save") ? 0 : 1);
    }
    int estado = 0;
    ASSERT_EQ(waitpid(filho, &estado, 0), filho);
    ASSERT_TRUE(WIFEXITED(estado));
    EXPECT_EQ(WEXITSTATUS(estado), 0);
    EXPECT_EQ(LeArquivo(Novo()), Crlf(kExemplo));
    EXPECT_EQ(QDir(pasta.path()).entryList(QDir::Files | QDir::Hidden).size(), 1);
}

TEST_F(ConfigPasta, AFolderThatIsNotThereGivesAClearError) {
    CEExportConfigs c;
    c.ObtemSecao("A", "B");
    QString erro;
    EXPECT_FALSE(c.SalvaEm(pasta.filePath("nao/existe"), &erro));
    EXPECT_TRUE(erro.startsWith("could not save ")) << erro.toStdString();
}

TEST(ConfigDados, TheShippedConfigurationsReadAndWriteBackTheSame) {
    const QByteArray original = LeArquivo(ZV_SOURCE_DIR "/data/config/cfgexportacao_2014.ini");
    ASSERT_FALSE(original.isEmpty());
    CEExportConfigs c;
    ASSERT_TRUE(c.LeTexto(original));
    EXPECT_EQ(c.ObtemConfigAtiva(), "Completa");
    const CEExportConfig* completa = c.Config("Completa");
    ASSERT_NE(completa, nullptr);
    for (const char* tipo : {"BORNES", "FIOS", "CABOS", "COMPS"}) {
        const CEExportSecao* s = completa->Secao(tipo);
        ASSERT_NE(s, nullptr) << tipo;
        EXPECT_EQ(s->Opcoes.valor("TIPO_IN"), tipo);
        EXPECT_FALSE(s->Colunas.empty()) << tipo;
        for (const auto& coluna : s->Colunas) {
            EXPECT_FALSE(coluna.Tag.isEmpty()) << tipo;
            EXPECT_FALSE(coluna.Titulo.isEmpty()) << tipo;
            EXPECT_TRUE(coluna.Visivel) << tipo;
        }
    }
    EXPECT_EQ(completa->Secao("BORNES")->Colunas.at(1).Tamanho, "4");
    EXPECT_EQ(completa->Secao("BORNES")->Colunas.at(1).Preenche, "0");
    EXPECT_EQ(c.Config("Bornes X1")->Secao("BORNES")->Opcoes.valor("FLT_TIPO_ORDEM"), "D");
    // Written back and read again it says the same.
    CEExportConfigs de_novo;
    ASSERT_TRUE(de_novo.LeTexto(c.Texto()));
    EXPECT_EQ(de_novo.Texto(), c.Texto());
}

TEST_F(ConfigPasta, ALineTooLongToReadBackIsNotSaved) {
    Grava(Novo(), Crlf(kExemplo));
    CEExportConfigs c;
    // 300 asterisks in a title are written as 2100 characters of escapes.
    c.ObtemSecao("A", "BORNES")
        .Colunas.push_back({"T", true, false, QString(300, '*'), false, false, false, "", ""});
    QString erro;
    EXPECT_FALSE(c.SalvaEm(pasta.path(), &erro));
    EXPECT_TRUE(erro.contains("longer than 2000")) << erro.toStdString();
    EXPECT_EQ(LeArquivo(Novo()), Crlf(kExemplo));
}
