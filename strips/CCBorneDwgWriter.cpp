#include "CCBorneDwgWriter.h"

#include "cad/CICad.h"
#include "lists/CCListaPaginada.h"
#include "lists/CETemplate.h"
#include "readers/CEListaAtributos.h"
#include "readers/Descarte.h"
#include "readers/VetorItens.h"
#include "readers/ZVString.h"
#include "settings/CIMensagens.h"

#include <limits>
#include <memory>
#include <new>
#include <utility>

namespace {

constexpr int kMensagemSemArquivo = 150;

bool ComecaCom(const QString& tag, const char* a, const char* b) {
    return tag.startsWith(QLatin1String(a), Qt::CaseInsensitive) ||
           tag.startsWith(QLatin1String(b), Qt::CaseInsensitive);
}

// A text in UTF-8. A handle is a few hex digits: its bytes are its units, made in place
// without a byte array of Qt's in between.
std::string Utf8(const QString& texto) {
    std::string feito;
    feito.reserve(size_t(texto.size()));
    for (const QChar unidade : texto) {
        if (unidade.unicode() >= 0x80) return texto.toStdString();
        feito.push_back(char(unidade.unicode()));
    }
    return feito;
}

CCBorneDwgWriter::Bloco Configurado(const QString& valor, const QString& prefixo,
                                    const QString& pasta) {
    if (valor.isEmpty()) return {};
    const QStringList partes = ZVString(valor).Divide("\\");
    return {prefixo + (partes.isEmpty() ? QString() : partes.last()), pasta + valor + ".dwg"};
}

}  // namespace

CCBorneDwgWriter::CCBorneDwgWriter()
    : prefixo_(CICad::GetStringLisp("*ZV_PREFIX*")),
      pastaRede_(CICad::GetStringLisp("*DIRETORIO_REDE*")) {}

CCBorneDwgWriter::~CCBorneDwgWriter() {
    // Its terminals, symbols, strips and pages are many small pieces that point only at
    // each other and at items nobody follows any more.
    try {
        Descarte::Descartar(std::make_unique<CEModeloReguas>(std::move(modelo_)));
    } catch (const std::bad_alloc&) {
        // No room to move it: it goes here, with the writer.
    }
}

CCBorneDwgWriter::Bloco CCBorneDwgWriter::BlocoConfigurado(const QString& valor) const {
    return Configurado(valor, prefixo_, pastaRede_);
}

std::optional<QSet<QString>> CCBorneDwgWriter::CamposDosBornes(CETemplate& modelo) {
    const QString prefixo = CICad::GetStringLisp("*ZV_PREFIX*");
    const QString pasta = CICad::GetStringLisp("*DIRETORIO_REDE*");
    QSet<QString> nomes;
    for (const char* simbolo : {"*BLOCO_BORNE_GRX*", "*BLOCO_DETALHE_GRX*"}) {
        const Bloco bloco = Configurado(modelo.LerTexto(simbolo), prefixo, pasta);
        if (!bloco.existe()) continue;
        const auto definicoes = CICad::LeDefinicoesAtributos(bloco.arquivo, bloco.nome);
        if (!definicoes || !CCListaPaginada::JuntaCampos(definicoes.get(), nomes, true))
            return std::nullopt;
    }
    const CEModeloReguas::Parametros parametros = CEModeloReguas::Parametros::DoModelo(modelo);
    for (const QStringList* lista : {&parametros.camposDetalhe, &parametros.chavesQuebra})
        for (const QString& nome : *lista)
            nomes << nome.trimmed().toUpper();
    return nomes;
}

std::optional<QSet<QString>> CCBorneDwgWriter::CamposDoSimbolo(const CEItemLista& componente,
                                                               CETemplate& modelo) {
    norma_ = modelo.LerTexto("*NORMA_UTILIZADA*");
    representacao_ = modelo.LerTexto("PBLCHAVEREPBORNEDWG");
    const Bloco bloco = BlocoSimbolo(componente);
    // The block's key, and the link back to the schematic.
    QSet<QString> nomes{QStringLiteral("ZV_KEY"), QStringLiteral("HANDLE")};
    // A symbol without a block is drawn with no cells.
    if (!bloco.existe()) return nomes;
    const auto definicoes = CICad::LeDefinicoesAtributos(bloco.arquivo, bloco.nome);
    if (!definicoes || !CCListaPaginada::JuntaCampos(definicoes.get(), nomes, true))
        return std::nullopt;
    return nomes;
}

CCBorneDwgWriter::Bloco CCBorneDwgWriter::BlocoSimbolo(const CEItemLista& item) {
    const QString* campo = item.campos.procura(NumeroCampo<"ZV_KEY">());
    const QString chave = campo ? *campo : QString();
    auto it = blocosSimbolo_.constFind(chave);
    if (it != blocosSimbolo_.constEnd()) return it.value();
    const QString nome = catalogo_.BlocoRepresentacao(chave, norma_, representacao_);
    Bloco bloco;
    if (!nome.isEmpty()) {
        QString pasta = CICad::GetStringLisp("*DIR_BLOCOS*");
        if (pasta.isEmpty())
            pasta = "DADOS\\" + CICad::GetStringLisp("*NORMA_UTILIZADA*") + "\\BLOCOS\\";
        bloco = BlocoConfigurado(pasta + nome);
    }
    return blocosSimbolo_.insert(chave, bloco).value();
}

OdDbObjectId CCBorneDwgWriter::Insere(const Bloco& bloco, const QString& layer, double x,
                                      double y) {
    if (!bloco.existe()) return {};
    return insercoes_.Insere(bloco.arquivo, bloco.nome, layer, x, y);
}

CCBorneDwgWriter::CampoDaCelula CCBorneDwgWriter::Celula(const QString& tag,
                                                         const QString& padrao) {
    // A VARIAVEL cell names the field in its default text; any other is the field of its tag.
    const bool variavel = ComecaCom(tag, "VARIAVEL", "VARIABLE");
    return CampoDaCelula{variavel, CECampoPorNumero::De(variavel ? padrao : tag)};
}

OdDbObjectId CCBorneDwgWriter::InserePreenchido(const Bloco& bloco, const QString& layer, double x,
                                                double y, const CEItemLista& item) {
    celulas_.Inicia(bloco.nome);
    // Two pointers: the function holds them in place, with no allocation per block.
    return preenchidos_.Insere(bloco.arquivo, bloco.nome, layer, x, y, item,
                               [this, &item](const QString& tag, const QString& padrao) {
                                   CampoDaCelula& esta = celulas_.Proxima(tag, padrao, &Celula);
                                   return std::optional<QString>(
                                       esta.campo.Valor(item.campos, esta.variavel ? padrao : tag));
                               });
}

void CCBorneDwgWriter::InsereDetalhe(const CEDetalheReguaDwg& detalhe, const QString& layer,
                                     double x, double y) {
    // The run's last terminal lends its fields to an item of no entity while the block goes
    // in (its functions see no entity), and takes them back, even when the insertion throws.
    struct Emprestimo {
        CEItemLista* dono;
        CEItemLista campos;
        explicit Emprestimo(CEItemLista* d) : dono(d) {
            if (dono) std::swap(campos.campos, dono->campos);
        }
        ~Emprestimo() {
            if (dono) std::swap(campos.campos, dono->campos);
        }
        Emprestimo(const Emprestimo&) = delete;
        Emprestimo& operator=(const Emprestimo&) = delete;
    } emprestimo(detalhe.ultimo);
    InserePreenchido(detalhe_, layer, x, y, emprestimo.campos);
}

void CCBorneDwgWriter::DesenhaRegua(CEReguaDwg& regua, const QString& layer) {
    const OdDbObjectId cabecalho = Insere(regua_, layer, regua.x, regua.y);
    if (!cabecalho.isNull())
        for (const char* tag : {"REGUA", "STRIP", "REGLETA"})
            CICad::SetAtributo(cabecalho, tag, regua.nome);

    // Detail runs, with a separator behind each one but the run that fills the strip.
    const int limite = bornesPorRegua_ > 0 ? bornesPorRegua_ : std::numeric_limits<int>::max();
    double c = regua.x;
    int contagem = 0;
    for (CEDetalheReguaDwg& detalhe : regua.detalhes) {
        const double k = detalhe.quantidade;
        InsereDetalhe(detalhe, layer, c + k * passo_ * 0.5 - passo_ * 0.5, regua.y);
        contagem += detalhe.quantidade;
        if (contagem < limite) Insere(traco_, layer, c + k * passo_ - passo_ * 0.5, regua.y);
        c += k * passo_;
    }

    double x = regua.x;
    for (const CEBorneDwg* borne : regua.bornes) {
        InserePreenchido(borne_, layer, x, regua.y, *borne->item);
        for (size_t i = 0; i < borne->trilhas.size(); ++i) {
            const std::int32_t estado = borne->trilhas[i];
            if (estado > 0 && estado < 5)
                Insere(pontes_[estado], layer, x, regua.y - double(i) * distJumper_);
        }
        x += passo_;
    }

    x = regua.x;
    for (const CESimboloDwg* simbolo : regua.Simbolos()) {
        if (simbolo) {
            const OdDbObjectId ref = InserePreenchido(BlocoSimbolo(*simbolo->item), layer, x,
                                                      regua.y - entreBornes_, *simbolo->item);
            if (!ref.isNull()) {
                const QString* handle = simbolo->item->campos.procura(NumeroCampo<"HANDLE">());
                const std::string handleUtf8 = handle ? Utf8(*handle) : std::string();
                CICad::SetXDataTextos(ref, "KVR_ZV_REPRESENTACAO",
                                      {representacaoUtf8_, handleUtf8});
            }
        }
        x += passo_;
    }
}

void CCBorneDwgWriter::DesenhaSemBorne(const std::vector<CESimboloDwg*>& simbolos,
                                       const QString& layer) {
    double x = 100;
    for (const CESimboloDwg* simbolo : simbolos) {
        InserePreenchido(BlocoSimbolo(*simbolo->item), layer, x, 100, *simbolo->item);
        x += passoSemBorne_;
    }
}

void CCBorneDwgWriter::Escreve(VetorItens& itens, CETemplate& modelo) {
    modelo_ = CEModeloReguas();
    preenchidos_.Reinicia();
    insercoes_.Reinicia();
    celulas_.Reinicia();
    const CEModeloReguas::Parametros parametros = CEModeloReguas::Parametros::DoModelo(modelo);
    modelo_.Constroi(itens);
    modelo_.CalculaTrilhas();
    modelo_.CortaReguas(parametros.bornesPorRegua, parametros.chavesQuebra);
    modelo_.Pagina(parametros.reguasPorPagina);
    if (modelo_.paginas.empty()) return;
    modelo_.CalculaPontos(parametros.distanciaReguas, parametros.refX, parametros.refY);
    modelo_.CalculaDetalhes(parametros.camposDetalhe);

    const QString grupo = modelo.LerTexto("*GP_PAGINA_GRX*");
    const bool capa = modelo.LerLogico("*INSERIR_CAPA_GRX*");
    const Bloco aviso = BlocoConfigurado(modelo.LerTexto("*BLOCO_ATENCAO_GRX*"));
    regua_ = BlocoConfigurado(modelo.LerTexto("*BLOCO_REGUA_GRX*"));
    borne_ = BlocoConfigurado(modelo.LerTexto("*BLOCO_BORNE_GRX*"));
    detalhe_ = BlocoConfigurado(modelo.LerTexto("*BLOCO_DETALHE_GRX*"));
    traco_ = BlocoConfigurado(modelo.LerTexto("*BLOCO_TRACO_GRX*"));
    pontes_[0] = {};
    pontes_[1] = BlocoConfigurado(modelo.LerTexto("*BLOCO_PONTEI_GRX*"));
    pontes_[2] = BlocoConfigurado(modelo.LerTexto("*BLOCO_PONTE_GRX*"));
    pontes_[3] = BlocoConfigurado(modelo.LerTexto("*BLOCO_PONTEF_GRX*"));
    pontes_[4] = BlocoConfigurado(modelo.LerTexto("*BLOCO_PONTEM_GRX*"));
    passo_ = modelo.LerReal("*PONTO_X_INC_GRX*");
    distJumper_ = modelo.LerReal("*DIST_JUMPER_GRX*");
    entreBornes_ = modelo.LerReal("*ENTRE_BORNES_GRX*");
    passoSemBorne_ = modelo.LerReal("*NAO_BORNES_GRX*");
    bornesPorRegua_ = parametros.bornesPorRegua;
    norma_ = modelo.LerTexto("*NORMA_UTILIZADA*");
    representacao_ = modelo.LerTexto("PBLCHAVEREPBORNEDWG");
    representacaoUtf8_ = representacao_.toStdString();

    // Every block the template names must be there before anything is drawn.
    for (const Bloco* bloco :
         std::initializer_list<const Bloco*>{&aviso, &regua_, &borne_, &detalhe_, &traco_,
                                             &pontes_[1], &pontes_[2], &pontes_[3], &pontes_[4]})
        if (bloco->existe() && (capa || bloco != &aviso) && !CICad::ExisteArquivo(bloco->arquivo))
            throw ZVString(CIMensagens::Mensagem("ZVLISTAS", kMensagemSemArquivo) + bloco->arquivo);

    const std::vector<CESimboloDwg*> semBorne = modelo.LerLogico("*SIMB_NAO_LIG_BORNES_GRX*")
                                                    ? modelo_.SimbolosSemBorne()
                                                    : std::vector<CESimboloDwg*>();
    // The warning page, the page of symbols without terminals, then the strips' pages; all
    // are made before the first block goes in.
    std::vector<CEPaginaLista> paginas(size_t(capa) + size_t(!semBorne.empty()) +
                                       modelo_.paginas.size());
    CCListaPaginada::CriaPaginas(grupo, paginas);
    // Each symbol drawn under a strip links back to its schematic symbol.
    CICad::RegistraApp("KVR_ZV_REPRESENTACAO");
    size_t p = 0;
    if (capa) Insere(aviso, paginas[p++].nome, 0, 0);
    if (!semBorne.empty()) DesenhaSemBorne(semBorne, paginas[p++].nome);
    for (const auto& pagina : modelo_.paginas)
        pagina->nome = paginas[p++].nome;
    for (const auto& pagina : modelo_.paginas)
        for (CEReguaDwg* regua : pagina->reguas)
            DesenhaRegua(*regua, pagina->nome);
}
