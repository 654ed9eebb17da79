#include "CENavegacaoPdf.h"

#include "cad/CICad.h"
#include "module/CIProgress.h"
#include "readers/CEAtributo.h"
#include "settings/CIMensagens.h"

#include <qpdf/QPDF.hh>
#include <qpdf/QPDFPageDocumentHelper.hh>
#include <qpdf/QPDFWriter.hh>

#include <algorithm>
#include <functional>

namespace {

constexpr int kMsgProjeto = 0x41, kMsgComponentes = 0x42, kMsgFios = 0x47, kMsgReferencias = 0x48;
constexpr int kMsgContatosNA = 0x43, kMsgContatosNF = 0x44, kMsgContatosNAF = 0x45,
              kMsgBornes = 0x46;
constexpr int kMsgFalhaPdf = 0x52;

QString Texto(int numero) {
    return CIMensagens::Mensagem("ZVLISTAS", numero);
}

bool ComecaCom(const QString& nome, std::initializer_list<const char*> prefixos) {
    for (const char* prefixo : prefixos)
        if (nome.startsWith(QLatin1String(prefixo), Qt::CaseInsensitive)) return true;
    return false;
}

// Blocks of the sheet and of the product's furniture name no component.
bool Excluido(const QString& bloco) {
    return ComecaCom(bloco, {"*", "FORMATO", "SELO", "PAGINA_DE", "ANILHA", "BLK_CTR_", "TOPO_"});
}

bool EhContato(const QString& bloco) {
    return ComecaCom(bloco, {"NA-", "NF-", "BT-", "NAF-"});
}

bool EhBorne(const QString& bloco) {
    return ComecaCom(bloco, {"BOR-", "BORNE"});
}

QRectF Caixa(const OdDbObjectId& id) {
    double xMax = 0, xMin = 0, yMax = 0, yMin = 0;
    if (!CICad::GetExtensao(id, xMax, xMin, yMax, yMin, false)) return {};
    return QRectF(QPointF(xMin, yMin), QPointF(xMax, yMax));
}

// A bookmark to be written: its title, where it goes, its children.
struct No {
    explicit No(QString t) : titulo(std::move(t)) {}
    QString titulo;
    int pagina = -1;  // from 0; -1 goes nowhere
    bool inteira = true;
    double esquerda = 0, topo = 0, zoom = 0;
    std::vector<No> filhos;
};

QPDFObjectHandle Destino(const No& no, const std::vector<QPDFPageObjectHelper>& paginas) {
    QPDFObjectHandle destino = QPDFObjectHandle::newArray();
    destino.appendItem(paginas[size_t(no.pagina)].getObjectHandle());
    if (no.inteira) {
        destino.appendItem(QPDFObjectHandle::newName("/Fit"));
        return destino;
    }
    destino.appendItem(QPDFObjectHandle::newName("/XYZ"));
    destino.appendItem(QPDFObjectHandle::newReal(no.esquerda, 2));
    destino.appendItem(QPDFObjectHandle::newReal(no.topo, 2));
    destino.appendItem(QPDFObjectHandle::newReal(no.zoom, 3));
    return destino;
}

// Writes the children of `pai` as outline items; answers how many items lie below.
int EscreveFilhos(QPDF& pdf, QPDFObjectHandle pai, const std::vector<No>& filhos,
                  const std::vector<QPDFPageObjectHelper>& paginas) {
    QPDFObjectHandle anterior;
    int total = 0;
    for (const No& filho : filhos) {
        QPDFObjectHandle item = pdf.makeIndirectObject(QPDFObjectHandle::newDictionary());
        item.replaceKey("/Title", QPDFObjectHandle::newUnicodeString(filho.titulo.toStdString()));
        item.replaceKey("/Parent", pai);
        if (filho.pagina >= 0 && size_t(filho.pagina) < paginas.size())
            item.replaceKey("/Dest", Destino(filho, paginas));
        if (anterior.isInitialized()) {
            anterior.replaceKey("/Next", item);
            item.replaceKey("/Prev", anterior);
        } else {
            pai.replaceKey("/First", item);
        }
        pai.replaceKey("/Last", item);
        const int abaixo = EscreveFilhos(pdf, item, filho.filhos, paginas);
        // Closed below the first level: a negative count.
        if (abaixo > 0) item.replaceKey("/Count", QPDFObjectHandle::newInteger(-abaixo));
        anterior = item;
        total += 1;
    }
    return total;
}

}  // namespace

CENavegacaoPdf::CENavegacaoPdf(QStringList paginas, std::vector<GeometriaPagina> geometria,
                               CIProgress* progresso)
    : paginas_(std::move(paginas)), geometria_(std::move(geometria)), progresso_(progresso) {}

int CENavegacaoPdf::NumeroDaPagina(const QString& layer) const {
    const int indice = paginas_.indexOf(layer);
    return indice < 0 ? 0 : indice + 1;
}

QRectF CENavegacaoPdf::ParaPdf(const QRectF& caixa, const GeometriaPagina& pagina) {
    if (pagina.Rotacao != 0 && pagina.Rotacao != 90) return QRectF(0, 0, 0, 0);
    const bool deitada = pagina.Rotacao == 90;
    const double largura = deitada ? pagina.AlturaPdf : pagina.LarguraPdf;
    const double altura = deitada ? pagina.LarguraPdf : pagina.AlturaPdf;
    if (pagina.Largura <= 0 || pagina.Altura <= 0) return QRectF(0, 0, 0, 0);
    // The frame fills the sheet as far as its shape lets it, centred.
    const double escala = std::min(largura / pagina.Largura, altura / pagina.Altura);
    const double dx = (largura - pagina.Largura * escala) / 2;
    const double dy = (altura - pagina.Altura * escala) / 2;
    auto x = [&](double v) { return dx + (pagina.OrigemX + v) * escala; };
    auto y = [&](double v) { return dy + (pagina.OrigemY + v) * escala; };
    double x1 = x(caixa.left()), x2 = x(caixa.right());
    double y1 = y(caixa.top()), y2 = y(caixa.bottom());
    if (deitada) {
        const double a1 = pagina.AlturaPdf - y2, a2 = pagina.AlturaPdf - y1;
        y1 = x1, y2 = x2, x1 = a1, x2 = a2;
    }
    const double cx = (x1 + x2) / 2, cy = (y1 + y2) / 2;
    const double meiaLargura = 1.1 * std::abs(x2 - x1), meiaAltura = 1.1 * std::abs(y2 - y1);
    const double limiteX = deitada ? pagina.AlturaPdf : pagina.LarguraPdf;
    const double limiteY = deitada ? pagina.LarguraPdf : pagina.AlturaPdf;
    const double l = std::max(0.0, cx - meiaLargura), r = std::min(limiteX, cx + meiaLargura);
    const double b = std::max(0.0, cy - meiaAltura), t = std::min(limiteY, cy + meiaAltura);
    return QRectF(QPointF(l, b), QPointF(std::max(l, r), std::max(b, t)));
}

void CENavegacaoPdf::ColetaComponentes() {
    Componentes.clear();
    std::vector<std::pair<QString, CEMarcador>> filhos;
    const auto referencias = CICad::GetReferenciasPorBloco();
    for (auto it = referencias.cbegin(); it != referencias.cend(); ++it) {
        const QString& bloco = it.key();
        if (Excluido(bloco)) continue;
        for (const OdDbObjectId& id : it.value()) {
            const int pagina = NumeroDaPagina(CICad::GetLayerEntidade(id));
            if (pagina == 0) continue;
            std::unique_ptr<zv::CEAtributo> rotulo;
            CICad::GetAtributoTraduzido(CampoTraduzido::Relacao, id, rotulo);
            if (!rotulo || rotulo->GetValor().trimmed().isEmpty()) continue;
            CEMarcador no;
            no.Nome = rotulo->GetValor().trimmed();
            no.Ordem = no.Nome;
            no.Handle = id.handle();
            no.Bloco = bloco;
            no.Caixa = Caixa(id);
            no.NumPagina = pagina;
            if (EhContato(bloco) || EhBorne(bloco)) {
                no.TipoNo = EhBorne(bloco) ? CEMarcador::Borne : CEMarcador::Contato;
                filhos.emplace_back(no.Nome, no);
            } else {
                Componentes.push_back(no);
            }
        }
    }
    auto porOrdem = [](const CEMarcador& a, const CEMarcador& b) {
        return a.Ordem < b.Ordem || (a.Ordem == b.Ordem && a.NumPagina < b.NumPagina);
    };
    std::sort(Componentes.begin(), Componentes.end(), porOrdem);
    // Contacts and terminals go under the first component of their label.
    QHash<QString, size_t> primeiro;
    for (size_t i = 0; i < Componentes.size(); ++i)
        if (!primeiro.contains(Componentes[i].Nome)) primeiro.insert(Componentes[i].Nome, i);
    for (auto& [rotulo, no] : filhos) {
        auto it = primeiro.constFind(rotulo);
        if (it == primeiro.constEnd()) continue;
        CEMarcador& dono = Componentes[it.value()];
        if (no.TipoNo == CEMarcador::Borne)
            dono.Bornes.push_back(no);
        else if (no.Bloco.startsWith("NAF-", Qt::CaseInsensitive))
            dono.ContatosNAF.push_back(no);
        else if (no.Bloco.startsWith("NF-", Qt::CaseInsensitive))
            dono.ContatosNF.push_back(no);
        else
            dono.ContatosNA.push_back(no);
    }
    for (CEMarcador& dono : Componentes)
        for (auto* lista : {&dono.ContatosNA, &dono.ContatosNF, &dono.ContatosNAF, &dono.Bornes})
            std::sort(lista->begin(), lista->end(), porOrdem);
}

void CENavegacaoPdf::ColetaFios() {
    Fios.clear();
    for (const OdDbObjectId& id : CICad::GetEntidadesComXData("KVR_ZV_WIRE")) {
        const int pagina = NumeroDaPagina(CICad::GetLayerEntidade(id));
        if (pagina == 0) continue;
        QString nome;
        for (const char* tag : {"CABO", "WIRE", "ALAMBRE", "FIO"}) {
            const auto atributo = CICad::GetAtributoEntidade(tag, id);
            if (atributo && !atributo->GetValor().trimmed().isEmpty()) {
                nome = atributo->GetValor().trimmed();
                break;
            }
        }
        if (nome.isEmpty()) continue;
        CEMarcador no;
        no.Nome = no.Ordem = nome;
        no.Handle = id.handle();
        no.Caixa = Caixa(id);
        no.NumPagina = pagina;
        no.TipoNo = CEMarcador::Fio;
        Fios.push_back(no);
    }
    std::sort(Fios.begin(), Fios.end(), [](const CEMarcador& a, const CEMarcador& b) {
        return a.Ordem < b.Ordem || (a.Ordem == b.Ordem && a.NumPagina < b.NumPagina);
    });
}

void CENavegacaoPdf::ColetaLinks() {
    // A contact drawn on another page than its component points to it, and back.
    Links.clear();
    for (const CEMarcador& componente : Componentes)
        for (const auto* lista :
             {&componente.ContatosNA, &componente.ContatosNF, &componente.ContatosNAF})
            for (const CEMarcador& contato : *lista) {
                if (contato.NumPagina == componente.NumPagina) continue;
                Links.push_back(
                    {contato.NumPagina, componente.NumPagina, contato.Caixa, componente.Caixa});
                Links.push_back(
                    {componente.NumPagina, contato.NumPagina, componente.Caixa, contato.Caixa});
            }
}

void CENavegacaoPdf::ColetaPaginas() {
    Grupos.clear();
    zvsdk::ResultBuffer* lista = CICad::zvInvokeLista("buscalistapaginas", {"T"});
    // ((GROUP PAGE ...) ...): a list begins each group.
    int profundidade = 0;
    for (const zvsdk::ResultBuffer* no = lista; no; no = no->rbnext) {
        if (no->restype == zvsdk::RTLB) {
            if (++profundidade == 2) Grupos.push_back({});
            continue;
        }
        if (no->restype == zvsdk::RTLE) {
            --profundidade;
            continue;
        }
        if (no->restype != zvsdk::RTSTR || profundidade != 2 || Grupos.empty()) continue;
        CEGrupoPaginas& grupo = Grupos.back();
        if (grupo.Nome.isEmpty() && !no->rstring.contains('$')) {
            grupo.Nome = no->rstring;
            continue;
        }
        const int numero = NumeroDaPagina(no->rstring);
        // Pages left out of the selection have no place in the document.
        if (numero > 0) grupo.Paginas.push_back({no->rstring, no->rstring, QString(), numero});
    }
    CICad::LiberaLista(lista);
    Grupos.erase(std::remove_if(Grupos.begin(), Grupos.end(),
                                [](const CEGrupoPaginas& g) { return g.Paginas.empty(); }),
                 Grupos.end());
}

bool CENavegacaoPdf::Navega(QByteArray& pdf) {
    auto passo = [&](int n) {
        if (progresso_) progresso_->Definir(n * 25, QString("%1/%2").arg(n).arg(4));
    };
    ColetaComponentes();
    passo(1);
    ColetaFios();
    passo(2);
    ColetaLinks();
    passo(3);
    ColetaPaginas();
    try {
        QPDF documento;
        documento.processMemoryFile("navegacao", pdf.constData(), size_t(pdf.size()));
        std::vector<QPDFPageObjectHelper> paginas = QPDFPageDocumentHelper(documento).getAllPages();
        auto geometria = [&](int numero) -> const GeometriaPagina* {
            return numero >= 1 && size_t(numero) <= geometria_.size()
                       ? &geometria_[size_t(numero - 1)]
                       : nullptr;
        };
        std::vector<No> raizes;
        No projeto(Texto(kMsgProjeto));
        for (const CEGrupoPaginas& grupo : Grupos) {
            No g(grupo.Nome);
            for (const CEPaginaPdf& pagina : grupo.Paginas) {
                No p(pagina.Descricao.isEmpty() ? pagina.Nome
                                                : pagina.Nome + " - " + pagina.Descricao);
                p.pagina = pagina.NumPagina - 1;
                g.filhos.push_back(p);
            }
            projeto.filhos.push_back(g);
        }
        raizes.push_back(projeto);
        std::function<No(const CEMarcador&)> escreveNo = [&](const CEMarcador& marcador) {
            No no(marcador.Nome);
            if (const GeometriaPagina* g = geometria(marcador.NumPagina)) {
                const QRectF r = ParaPdf(marcador.Caixa, *g);
                no.pagina = marcador.NumPagina - 1;
                no.inteira = false;
                no.esquerda = r.left();
                no.topo = r.bottom();
                no.zoom = r.height() > 0 ? std::min(g->AlturaPdf / r.height(), 8.0) : 0.0;
            }
            const std::pair<const std::vector<CEMarcador>*, int> tipos[] = {
                {&marcador.ContatosNA, kMsgContatosNA},
                {&marcador.ContatosNF, kMsgContatosNF},
                {&marcador.ContatosNAF, kMsgContatosNAF},
                {&marcador.Bornes, kMsgBornes}};
            for (const auto& [lista, titulo] : tipos) {
                if (lista->empty()) continue;
                No tipo(Texto(titulo));
                for (const CEMarcador& filho : *lista)
                    tipo.filhos.push_back(escreveNo(filho));
                no.filhos.push_back(tipo);
            }
            return no;
        };
        const int total = int(Componentes.size() + Fios.size() + Links.size());
        int feito = 0;
        No componentes(Texto(kMsgComponentes)), fios(Texto(kMsgFios)),
            referencias(Texto(kMsgReferencias));
        for (const CEMarcador& marcador : Componentes) {
            componentes.filhos.push_back(escreveNo(marcador));
            if (progresso_) {
                progresso_->Definir(75 + 25 * ++feito / std::max(total, 1));
                if (progresso_->Cancelado()) break;
            }
        }
        for (const CEMarcador& marcador : Fios)
            fios.filhos.push_back(escreveNo(marcador));
        raizes.push_back(componentes);
        raizes.push_back(fios);

        // Each cross reference: a link annotation on its page, and a bookmark to its target.
        for (const CELink& link : Links) {
            const GeometriaPagina* origem = geometria(link.PaginaOrigem);
            const GeometriaPagina* destino = geometria(link.PaginaDestino);
            if (!origem || !destino) continue;
            const QRectF de = ParaPdf(link.RetOrigem, *origem);
            const QRectF para = ParaPdf(link.RetDestino, *destino);
            QPDFObjectHandle anotacao =
                documento.makeIndirectObject(QPDFObjectHandle::newDictionary());
            anotacao.replaceKey("/Type", QPDFObjectHandle::newName("/Annot"));
            anotacao.replaceKey("/Subtype", QPDFObjectHandle::newName("/Link"));
            anotacao.replaceKey("/Rect", QPDFObjectHandle::newFromRectangle(
                                             {de.left(), de.top(), de.right(), de.bottom()}));
            QPDFObjectHandle borda = QPDFObjectHandle::newArray();
            for (int i = 0; i < 3; ++i)
                borda.appendItem(QPDFObjectHandle::newInteger(0));
            anotacao.replaceKey("/Border", borda);
            QPDFObjectHandle alvo = QPDFObjectHandle::newArray();
            alvo.appendItem(paginas[size_t(link.PaginaDestino - 1)].getObjectHandle());
            alvo.appendItem(QPDFObjectHandle::newName("/FitR"));
            for (double v : {para.left(), para.top(), para.right(), para.bottom()})
                alvo.appendItem(QPDFObjectHandle::newReal(v, 2));
            anotacao.replaceKey("/Dest", alvo);
            QPDFObjectHandle pagina = paginas[size_t(link.PaginaOrigem - 1)].getObjectHandle();
            anotacao.replaceKey("/P", pagina);
            QPDFObjectHandle anotacoes = pagina.getKey("/Annots");
            if (!anotacoes.isArray()) {
                anotacoes = QPDFObjectHandle::newArray();
                pagina.replaceKey("/Annots", anotacoes);
            }
            anotacoes.appendItem(anotacao);
            No ref(QString("%1 > %2").arg(paginas_.value(link.PaginaOrigem - 1),
                                          paginas_.value(link.PaginaDestino - 1)));
            ref.pagina = link.PaginaDestino - 1;
            referencias.filhos.push_back(ref);
        }
        raizes.push_back(referencias);

        QPDFObjectHandle outlines = documento.makeIndirectObject(QPDFObjectHandle::newDictionary());
        outlines.replaceKey("/Type", QPDFObjectHandle::newName("/Outlines"));
        const int topo = EscreveFilhos(documento, outlines, raizes, paginas);
        outlines.replaceKey("/Count", QPDFObjectHandle::newInteger(topo));
        QPDFObjectHandle catalogo = documento.getRoot();
        catalogo.replaceKey("/Outlines", outlines);
        catalogo.replaceKey("/PageMode", QPDFObjectHandle::newName("/UseOutlines"));

        QPDFWriter escritor(documento);
        escritor.setOutputMemory();
        escritor.setObjectStreamMode(qpdf_o_generate);
        escritor.write();
        std::shared_ptr<Buffer> buffer(escritor.getBufferSharedPointer());
        pdf = QByteArray(reinterpret_cast<const char*>(buffer->getBuffer()),
                         static_cast<int>(buffer->getSize()));
        passo(4);
        return true;
    } catch (const std::exception&) {
        CICad::MessageBox(Texto(kMsgFalhaPdf));
        return false;
    }
}
