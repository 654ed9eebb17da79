#pragma once
// A host document for the dialogs under the offscreen platform: the configuration folder
// (`*DIR_ZVCFG*`) and the profile root (`ROAMABLEROOTPREFIX`) in a temporary folder, the
// message files of the build, English texts. Dialogs and questions are answered by a queue
// of handlers, one per dialog shown, in order.
#include "QtPrinters.h"
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "app/HostDocument.h"
#include "dialogs/JanelaDialogo.h"
#include "sdk/LispInterface.h"
#include "settings/CIMensagens.h"

#include <QApplication>
#include <QDialog>
#include <QFile>
#include <QMessageBox>
#include <QTemporaryDir>
#include <QTextStream>

#include <gtest/gtest.h>

#include <deque>
#include <functional>

namespace teste {

inline void GaranteAplicacao() {
    if (QCoreApplication::instance()) return;
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
    static int argc = 1;
    static char nome[] = "dialogs_tests";
    static char* argv[] = {nome, nullptr};
    new QApplication(argc, argv);  // lives as long as the process
}

inline QByteArray Le(const QString& caminho) {
    QFile f(caminho);
    return f.open(QIODevice::ReadOnly) ? f.readAll() : QByteArray();
}

inline void Grava(const QString& caminho, const QByteArray& bytes) {
    QFile f(caminho);
    ASSERT_TRUE(f.open(QIODevice::WriteOnly)) << caminho.toStdString();
    f.write(bytes);
}

// A stored file with two named configurations; Painel is active and exported wires last.
inline const QByteArray kConfiguracoes =
    "{}\r\n-CFG_ATIVO=Painel\r\n\r\n"
    "{Painel}\r\n[]\r\nTIPO_IN=FIOS\r\n"
    "[FIOS]\r\nTIPO_IN=FIOS\r\nTIPO_OUT=XLSX\r\nXLSX_LINHA_INI_INT=3\r\n"
    "*FIO*S*N*Fio*N*N*N**\r\n*{FIO}/{SEQUENCIA}*S*N*Rotulo*S*N*N*6*-\r\n"
    "#FIO#3#X\r\n"
    "[BORNES]\r\nTIPO_IN=BORNES\r\nTIPO_OUT=HTML\r\nHTML_LARG_TABELA=2\r\n"
    "*REGUA*S*N*Regua*N*N*N**\r\n*NUMERO*N*N*Numero*N*N*S*4*0\r\n\r\n"
    "{Outra}\r\n[]\r\nTIPO_IN=PAGINAS\r\n[PAGINAS]\r\nTIPO_IN=PAGINAS\r\nTIPO_OUT=PDF\r\n\r\n";

// A console host that says it shows the module's dialogs, as the desktop host does.
class InterfaceJanelas : public zvhost::ConsoleUserInterface {
public:
    using zvhost::ConsoleUserInterface::ConsoleUserInterface;
    bool showsDialogs() const override { return true; }
};

class AmbienteDialogos : public ::testing::Test {
protected:
    virtual bool MostraJanelas() const { return false; }

    void SetUp() override {
        GaranteAplicacao();
        ASSERT_TRUE(pasta.isValid());
        qputenv("ZV_DATA_DIR", pasta.path().toUtf8());
        auto interface = MostraJanelas()
                             ? std::make_unique<InterfaceJanelas>(out, err, false)
                             : std::make_unique<zvhost::ConsoleUserInterface>(out, err, false);
        ui = interface.get();
        app = std::make_unique<zvhost::Application>(std::move(interface), out);
        app->setExecutableFolder(ZV_BIN_DIR);
        CIMensagens::Descarregar();
        documento = app->openDocument(pasta.filePath("projeto.dxf"));
        ASSERT_TRUE(
            documento->lisp()->lispEvaluate("(setq *DIR_ZVCFG* \"" + pasta.path() + "/\")"));
        Grava(ArquivoConfig(), kConfiguracoes);
    }
    void TearDown() override {
        EXPECT_TRUE(respostas.empty()) << respostas.size() << " dialogs were not shown";
        app.reset();
        CIMensagens::Descarregar();
    }

    QString ArquivoConfig() const { return pasta.filePath("cfgexportacao_2014.ini"); }
    QString Estado(const QString& nome) const { return pasta.filePath("ZVDLG/" + nome); }

    // The next dialog shown gets this handler; what it returns is the dialog's result.
    void Responde(std::function<int(QDialog&)> resposta) {
        respostas.push_back(std::move(resposta));
    }
    // The next dialog is a question by message number; it gets `botao`.
    void RespondePergunta(int numero, QMessageBox::StandardButton botao) {
        Responde([this, numero, botao](QDialog& d) {
            auto* caixa = qobject_cast<QMessageBox*>(&d);
            EXPECT_NE(caixa, nullptr) << "a question was expected";
            if (caixa) {
                EXPECT_EQ(caixa->text(), CIMensagens::Mensagem("ZVLISTAS", numero));
                perguntas.push_back(numero);
            }
            return int(botao);
        });
    }
    JanelaDialogo::Mostrador Mostrador() {
        return [this](QDialog& d) {
            if (respostas.empty()) {
                ADD_FAILURE() << "an unexpected dialog: " << d.windowTitle().toStdString();
                return int(QDialog::Rejected);
            }
            auto resposta = std::move(respostas.front());
            respostas.pop_front();
            return resposta(d);
        };
    }

    QTemporaryDir pasta;
    QString saida, erros;
    QTextStream out{&saida}, err{&erros};
    zvhost::ConsoleUserInterface* ui = nullptr;
    std::unique_ptr<zvhost::Application> app;
    zvhost::HostDocument* documento = nullptr;
    std::deque<std::function<int(QDialog&)>> respostas;
    std::vector<int> perguntas;
};

}  // namespace teste
