#include "CEExportaPdf.h"

#include "CENavegacaoPdf.h"
#include "cad/CICad.h"
#include "host/sdk/AtomicFile.h"
#include "module/CIProgress.h"
#include "settings/CIMensagens.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QRandomGenerator>
#include <QThread>

#include <qpdf/QPDF.hh>
#include <qpdf/QPDFPageDocumentHelper.hh>
#include <qpdf/QPDFWriter.hh>

#include <algorithm>
#include <memory>

namespace {

constexpr int kMsgTituloRaiz = 0x41;
constexpr int kMsgFalhaPdf = 0x52;
constexpr int kMsgFalhaJuntar = 0x54;
constexpr int kMsgDispositivo = 0x99;

QString Texto(int numero) {
    return CIMensagens::Mensagem("ZVLISTAS", numero);
}

// The sort key of a page for the step count: its group, and whether it is a cover or index.
QString ChavePagina(const QString& pagina) {
    const QString grupo = pagina.section('$', 0, 0);
    return grupo + (CICad::IsPaginaCapa(pagina) || CICad::IsPaginaIndice(pagina) ? "_S" : "_N");
}

}  // namespace

CEExportaPdf::CEExportaPdf(Opcoes opcoes, CIProgress* progresso)
    : opcoes_(std::move(opcoes)), progresso_(progresso) {}

const QStringList& CEExportaPdf::Folhas() {
    static const QStringList folhas{
        "A0 (1.189 x 841 mm)", "A0 (841 x 1.189 mm)", "A1 (594 x 841 mm)", "A1 (841 x 594 mm)",
        "A2 (420 x 594 mm)",   "A2 (594 x 420 mm)",   "A3 (297 x 420 mm)", "A3 (420 x 297 mm)",
        "A4 (210 x 297 mm)",   "A4 (297 x 210 mm)"};
    return folhas;
}

QString CEExportaPdf::TamanhoFolha(const QString& nome) {
    static const QHash<QString, QString> tamanhos{
        {"A0 (1.189 x 841 mm)", "1189,841"}, {"A0 (841 x 1.189 mm)", "841,1189"},
        {"A1 (594 x 841 mm)", "594,841"},    {"A1 (841 x 594 mm)", "841,594"},
        {"A2 (420 x 594 mm)", "420,594"},    {"A2 (594 x 420 mm)", "594,420"},
        {"A3 (297 x 420 mm)", "297,420"},    {"A3 (420 x 297 mm)", "420,297"},
        {"A4 (210 x 297 mm)", "210,297"},    {"A4 (297 x 210 mm)", "297,210"}};
    return tamanhos.value(nome);
}

QStringList CEExportaPdf::ListaPaginas(const QString& opcaoPaginas) {
    QStringList paginas;
    if (opcaoPaginas.isEmpty()) {
        zvsdk::ResultBuffer* lista = CICad::zvInvokeLista("buscalistapaginas");
        for (const zvsdk::ResultBuffer* no = lista; no; no = no->rbnext)
            if (no->restype == zvsdk::RTSTR && no->rstring.contains('$')) paginas << no->rstring;
        CICad::LiberaLista(lista);
        return paginas;
    }
    paginas = opcaoPaginas.split(';');
    if (paginas.size() == 1 && paginas.front().isEmpty()) return ListaPaginas(QString());
    return paginas;
}

QStringList CEExportaPdf::ComandoImpressao(const QString& folha, bool paisagem, bool comJanela,
                                           double x1, double y1, double x2, double y2,
                                           const QString& dpi, const QString& estilo,
                                           bool pesoLinha, const QString& arquivo) {
    const QStringList lados = TamanhoFolha(folha).split(',');
    QStringList c{"_-PRINT",
                  "_Y",
                  "Model",
                  "PDF",
                  Texto(kMsgDispositivo),
                  "M",
                  QString::number(lados.value(1).toDouble(), 'f', 1),
                  QString::number(lados.value(0).toDouble(), 'f', 1),
                  "0.0",
                  "0.0",
                  "0.0",
                  "0.0",
                  paisagem ? "_L" : "_P",
                  "_N"};
    if (comJanela)
        c << "_S" << QString("%1,%2").arg(x2, 0, 'g', 17).arg(y2, 0, 'g', 17)
          << QString("%1,%2").arg(x1, 0, 'g', 17).arg(y1, 0, 'g', 17);
    else
        c << "_A";
    if (!dpi.isEmpty()) c << "_R" << QString::number(std::clamp<int>(short(dpi.toInt()), 100, 600));
    c << "_F"
      << "_C";
    if (estilo.isEmpty())
        c << "_N";
    else
        c << "_Y" << estilo;
    c << (pesoLinha ? "_Y" : "_N") << "_D" << QString(arquivo).replace("\\", "\\\\") << "_N"
      << "_Y";
    return c;
}

void CEExportaPdf::Progresso(int percentual, const QString& texto) {
    if (progresso_) progresso_->Definir(percentual, texto);
}

bool CEExportaPdf::Cancelado() {
    return progresso_ && progresso_->Cancelado();
}

bool CEExportaPdf::Exporta(const QString& arquivo) {
    if (progresso_) progresso_->Mostrar();
    AlturaPag.clear(), LarguraPag.clear(), OrigemX.clear(), OrigemY.clear();
    ArquivosPdf.clear(), PaginasImpressas.clear();
    const QStringList paginas = ListaPaginas(opcoes_.value("PAGINAS"));
    QString folha = opcoes_.value("PDF_PAPER_SIZE_PZ");
    if (!Folhas().contains(folha)) {
        folha = Folhas().front();
        CICad::Imprime(QString("\nInvalid sheet size. Using %1\n").arg(folha));
    }
    const bool paisagem = opcoes_.value("PDF_ORIENTATION_LP") == "L";
    const QString estilo = opcoes_.value("PDF_TABELA_ESTILO");
    const QString dpi = opcoes_.value("PDF_DPI");
    const bool pesoLinha = opcoes_.value("PDF_PESOLINHA_SN") == "S";
    const QString lembrada = CICad::GetLayerCorrente();

    // The steps: one a page, and one more at each group seen for the first time.
    int total = 0;
    QString maior;
    for (const QString& pagina : paginas) {
        ++total;
        const QString chave = ChavePagina(pagina);
        if (chave > maior) {
            ++total;
            maior = chave;
        }
    }
    // One page shows at a time: each page's print thaws it and freezes the one before.
    CICad::SetLayerCorrente("0");
    CICad::CongelaTodosLayers();
    CICad::DescongelaLayer("0");
    int i = 0;
    for (const QString& pagina : paginas) {
        ++i;
        if (!CICad::ExisteLayer(pagina)) {
            CICad::Imprime("\nPDF: no such page: " + pagina + "\n");
            continue;
        }
        CICad::TrocaPagina(pagina);
        CICad::zvInvokeVoid("AtualizaModemacro");
        ImprimePagina(i, std::max(total, 1), pagina, folha, paisagem, estilo, dpi, pesoLinha);
        if (Cancelado()) break;
    }
    EsperaArquivos();
    if (!lembrada.isEmpty() && lembrada != "0") CICad::MostraPagina(lembrada, true);

    bool pronto = false;
    if (!ArquivosPdf.isEmpty()) {
        QByteArray pdf = Junta(ArquivosPdf);
        if (!pdf.isEmpty() && opcoes_.value("PDF_SMART_SN") == "S") {
            std::vector<CENavegacaoPdf::GeometriaPagina> geometria;
            for (size_t p = 0; p < size_t(PaginasImpressas.size()); ++p) {
                CENavegacaoPdf::GeometriaPagina g;
                g.Altura = AlturaPag[p], g.Largura = LarguraPag[p];
                g.OrigemX = OrigemX[p], g.OrigemY = OrigemY[p];
                if (p < AlturaPdf.size()) {
                    g.AlturaPdf = AlturaPdf[p], g.LarguraPdf = LarguraPdf[p];
                    g.Rotacao = RotacaoPdf[p];
                }
                geometria.push_back(g);
            }
            CENavegacaoPdf navegacao(PaginasImpressas, geometria, progresso_);
            if (!navegacao.Navega(pdf)) pdf.clear();
        }
        // The watermark option is kept with the configuration and leaves no mark.
        if (!pdf.isEmpty()) {
            QString erro;
            pronto = zvsdk::saveFileAtomically(
                arquivo, std::string_view(pdf.data(), size_t(pdf.size())), &erro);
            if (!pronto) CICad::MessageBox(Texto(kMsgFalhaPdf) + arquivo + "\n" + erro);
        }
    }
    for (const QString& temporario : ArquivosPdf) {
        BytesPaginas += QFileInfo(temporario).size();
        QFile::remove(temporario);
    }
    if (progresso_) progresso_->Fechar();
    return pronto;
}

bool CEExportaPdf::ImprimePagina(int i, int total, const QString& pagina, const QString& folha,
                                 bool paisagem, const QString& estilo, const QString& dpi,
                                 bool pesoLinha) {
    const QString pasta = QDir::tempPath() + "/";
    QString nome;
    do {
        nome = QString("%1%2_%3.pdf")
                   .arg(pasta)
                   .arg(i, 15, 10, QChar('0'))
                   .arg(QRandomGenerator::global()->bounded(1 << 30));
    } while (QFile::exists(nome));
    double x1 = 0, y1 = 0, x2 = 0, y2 = 0;
    const bool janela = ExtensaoPagina(pagina, x1, y1, x2, y2);
    if (!CICad::Comando(ComandoImpressao(folha, paisagem, janela, x1, y1, x2, y2, dpi, estilo,
                                         pesoLinha, nome)))
        return false;
    if (!janela && !CICad::ExtensaoVisivel(x1, y1, x2, y2)) x1 = y1 = 0, x2 = y2 = 1;
    ArquivosPdf << nome;
    PaginasImpressas << pagina;
    Progresso(i * 100 / total, QString("%1/%2").arg(i).arg(total));
    AlturaPag.push_back(std::abs(y2 - y1));
    LarguraPag.push_back(std::abs(x2 - x1));
    OrigemX.push_back(-std::min(x1, x2));
    OrigemY.push_back(-std::min(y1, y2));
    return true;
}

bool CEExportaPdf::ExtensaoPagina(const QString& pagina, double& x1, double& y1, double& x2,
                                  double& y2) {
    if (pagina.isEmpty() || pagina == "0") return false;
    const QString bloco = "FORMATO_" + pagina.section('$', 0, 0);
    OdDbObjectId definicao, referencia;
    // Only a drawing that has the block is searched for its reference.
    if (CICad::GetBlocoId(bloco, definicao))
        referencia = CICad::GetReferenciaNoLayer(bloco, pagina);
    double xMax, xMin, yMax, yMin;
    if (referencia.isNull() || !CICad::GetExtensao(referencia, xMax, xMin, yMax, yMin, false)) {
        CICad::ZoomExtents();
        return false;
    }
    x1 = xMin, y1 = yMin, x2 = xMax, y2 = yMax;
    return true;
}

void CEExportaPdf::EsperaArquivos() {
    // The host may finish a file late: each is waited for, 50 ms at a time, at most three
    // minutes, with the progress window alive and its cancel button heard.
    for (const QString& nome : ArquivosPdf) {
        for (int vez = 0; vez < 3600 && !QFile::exists(nome); ++vez) {
            if (Cancelado()) return;
            Progresso(progresso_ ? progresso_->Percentual() : 0);
            QThread::msleep(50);
        }
        if (!QFile::exists(nome)) CICad::MessageBox(nome);
    }
}

QByteArray CEExportaPdf::Junta(const QStringList& nomes) {
    AlturaPdf.clear(), LarguraPdf.clear(), RotacaoPdf.clear();
    if (nomes.isEmpty()) return {};
    try {
        QPDF destino;
        destino.emptyPDF();
        QPDFPageDocumentHelper paginas(destino);
        // The sources stay open until the result is written: their pages are copied then.
        std::vector<std::unique_ptr<QPDF>> fontes;
        for (const QString& nome : nomes) {
            auto fonte = std::make_unique<QPDF>();
            try {
                fonte->processFile(QFile::encodeName(nome).constData());
            } catch (const std::exception&) {
                CICad::MessageBox(Texto(kMsgFalhaPdf) + nome);
                return {};
            }
            try {
                for (QPDFPageObjectHelper& pagina : QPDFPageDocumentHelper(*fonte).getAllPages())
                    paginas.addPage(pagina, false);
            } catch (const std::exception&) {
                CICad::MessageBox(Texto(kMsgFalhaJuntar) + nome);
                return {};
            }
            fontes.push_back(std::move(fonte));
        }
        for (QPDFPageObjectHelper& pagina : paginas.getAllPages()) {
            const QPDFObjectHandle::Rectangle caixa =
                pagina.getMediaBox(true).getArrayAsRectangle();
            LarguraPdf.push_back(caixa.urx - caixa.llx);
            AlturaPdf.push_back(caixa.ury - caixa.lly);
            QPDFObjectHandle rotacao = pagina.getAttribute("/Rotate", false);
            RotacaoPdf.push_back(rotacao.isInteger() ? rotacao.getIntValueAsInt() : 0);
        }
        QPDFWriter escritor(destino);
        escritor.setOutputMemory();
        escritor.setObjectStreamMode(qpdf_o_generate);
        escritor.setCompressStreams(true);
        escritor.write();
        std::shared_ptr<Buffer> buffer(escritor.getBufferSharedPointer());
        return QByteArray(reinterpret_cast<const char*>(buffer->getBuffer()),
                          static_cast<int>(buffer->getSize()));
    } catch (const std::exception& erro) {
        CICad::MessageBox(Texto(kMsgFalhaJuntar) + QString::fromUtf8(erro.what()));
        return {};
    }
}
