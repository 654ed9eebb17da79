// The export command in a host that shows dialogs: the export dialog is the window the user
// confirms or cancels, and the export runs from what it filled.
#include "AmbienteDialogos.h"
#include "dialogs/CIDlgExporta.h"
#include "export/CEExportacao.h"

#include <QLineEdit>
#include <QTimer>

namespace {

class ComandoDialogo : public teste::AmbienteDialogos {
protected:
    bool MostraJanelas() const override { return true; }

    static std::unique_ptr<VetorItens> Terminais(CEExportacao&) {
        auto itens = std::make_unique<VetorItens>();
        for (const char* n : {"12", "3"}) {
            auto* item = new CEItemLista;
            item->definirCampo("ZV_LISTA_TIPO", "BORNE");
            item->definirCampo("REGUA", "X1");
            item->definirCampo("NUMERO", n);
            itens->push_back(item);
        }
        return itens;
    }
    // Runs the export; `usuario` acts on the dialog once it is up.
    zvsdk::CommandResult Roda(const QString& tipo, std::function<void(CIDlgExporta&)> usuario) {
        bool visto = false;
        QTimer::singleShot(0, [&] {
            auto* d = dynamic_cast<CIDlgExporta*>(QApplication::activeModalWidget());
            visto = d != nullptr;
            if (d) usuario(*d);
        });
        documento->addCommand("testeExporta", [tipo] {
            CEExportacao::Exporta(tipo, &Terminais);
            return 1;
        });
        zvsdk::CommandResult resultado = zvsdk::CommandResult::OutOfMemory;
        EXPECT_TRUE(documento->execute("testeExporta", &resultado));
        EXPECT_TRUE(visto) << "the export dialog did not come up";
        return resultado;
    }
};

}  // namespace

TEST_F(ComandoDialogo, TheConfirmedDialogDrivesTheExport) {
    const QString alvo = pasta.filePath("bornes.html");
    const auto resultado = Roda("BORNES", [&](CIDlgExporta& d) {
        EXPECT_EQ(d.NomeConfig, "Painel");
        EXPECT_TRUE(d.isVisible());
        d.Arquivo()->setText(alvo);
        d.accept();
    });
    EXPECT_EQ(resultado, zvsdk::CommandResult::Succeeded);
    const QByteArray html = teste::Le(alvo);
    EXPECT_TRUE(html.contains("Regua")) << html.toStdString();
    EXPECT_TRUE(html.contains("X1")) << html.toStdString();
    // The stored border width of the section reached the writer.
    EXPECT_TRUE(html.contains("border=\"2\"")) << html.toStdString();
    // No scripted answer was asked for.
    out.flush();
    err.flush();
    EXPECT_FALSE(erros.contains("export:")) << erros.toStdString();
}

TEST_F(ComandoDialogo, ACancelledDialogExportsNothing) {
    const auto resultado = Roda("", [](CIDlgExporta& d) { d.reject(); });
    EXPECT_EQ(resultado, zvsdk::CommandResult::Cancelled);
    EXPECT_FALSE(QFile::exists(pasta.filePath("projeto.xlsx")));
    EXPECT_EQ(teste::Le(ArquivoConfig()), teste::kConfiguracoes);
}
