// The reading of a symbol: its attributes, key, catalogue data, circuit, position, layer and
// layout, gathered in one visit of the drawing and joined to the item in one merge.
#include "CCDataReader.h"

#include "CEAtributo.h"
#include "CEListaAtributos.h"

#include <algorithm>
#include <cmath>

namespace {

// Memories of texts seen in the drawing start over past this size: a drawing that makes up
// texts keeps them bounded.
constexpr std::size_t kMaxTextos = std::size_t(1) << 16;
// The same for the orders of the symbols' batches, which are larger.
constexpr std::size_t kMaxOrdens = 1024;

const QLatin1String kPalavrasConexao[] = {QLatin1String("LIGACAO"), QLatin1String("CONNECTION"),
                                          QLatin1String("CONEXION")};

QString Texto(std::string_view texto) {
    return QString::fromUtf8(texto.data(), int(texto.size()));
}

// The drawing an object is of: the facade's default one for an object that names none.
const void* DesenhoDe(zvdb::Database* database) {
    return database ? database : CICad::GetDatabase();
}

template <class Mapa>
void Limita(Mapa& mapa) {
    if (mapa.size() >= kMaxTextos) mapa.clear();
}

}  // namespace

const CCDataReader::ChaveLida& CCDataReader::ChaveDoTexto(std::string_view texto) const {
    auto it = chaves_.find(texto);
    if (it != chaves_.end()) return it->second;
    // The catalogue data the entries point to stays while they do.
    Limita(chaves_);
    ChaveLida lida;
    ZVString(Texto(texto)).DivideEmDois(kSeparador, lida.chave, lida.norma);
    return chaves_.emplace(std::string(texto), std::move(lida)).first->second;
}

bool CCDataReader::ChaveENorma(const OdDbObjectId& entidade, QString& chave, QString& norma) const {
    std::string_view texto;
    bool temTexto = false;
    if (!CICad::TextoChave(entidade, texto, temTexto)) return false;
    if (!temTexto) return true;
    const ChaveLida& lida = ChaveDoTexto(texto);
    chave = lida.chave;
    norma = lida.norma;
    return true;
}

void CCDataReader::PoeColunasFio(const QString& s, const ChaveLida& chave) {
    if (chave.colunasFio) {
        for (const auto& [nome, valor] : *chave.colunasFio)
            lote_.push_back({CamposItem::numeroComSufixo(nome, s), valor});
        return;
    }
    // The first time each column is split and written in turn: names are numbered in the
    // order they are first met.
    std::vector<std::pair<std::uint32_t, QString>> campos;
    for (const QString& coluna : catalogo_.ColunasFio(chave.chave)) {
        const std::pair<std::uint32_t, QString>& dividida = ColunaDividida(coluna);
        if (dividida.first == kSemColuna) continue;
        campos.push_back(dividida);
        lote_.push_back({CamposItem::numeroComSufixo(dividida.first, s), dividida.second});
    }
    chave.colunasFio = std::move(campos);
}

const std::pair<QString, QString>& CCDataReader::ListaDescricaoFioDe(const ChaveLida& chave) {
    if (!chave.listaDescricaoFio)
        chave.listaDescricaoFio.emplace(catalogo_.ListaFio(chave.chave, chave.norma),
                                        catalogo_.DescricaoFio(chave.chave));
    return *chave.listaDescricaoFio;
}

CCDataReader::TagLida& CCDataReader::TagDoTexto(std::string_view tag) const {
    Limita(tags_);
    return tags_.obtem(tag, [tag] {
        QString texto = Texto(tag).trimmed();
        const QString maiusculas = texto.toUpper();
        const bool ligacao = std::any_of(
            std::begin(kPalavrasConexao), std::end(kPalavrasConexao),
            [&maiusculas](QLatin1String palavra) { return maiusculas.startsWith(palavra); });
        return TagLida{CamposItem::kSemNome, ligacao, std::move(texto)};
    });
}

const QString& CCDataReader::ValorDoTexto(std::string_view valor) const {
    Limita(valores_);
    return valores_.obtem(valor, [valor] { return Texto(valor).trimmed(); });
}

const CCDataReader::LayerLido& CCDataReader::LayerDoNome(std::string_view nome) const {
    // A block's symbols come page by page: most ask for the layer the one before asked for.
    if (ultimoLayer_ && ultimoLayer_->first == nome) return ultimoLayer_->second;
    auto it = layers_.find(nome);
    if (it == layers_.end()) {
        LayerLido lido;
        lido.nome = Texto(nome);
        const std::pair<QString, QString>& partes = GrupoPagina(lido.nome);
        lido.grupo = partes.first;
        lido.pagina = partes.second;
        it = layers_.emplace(std::string(nome), std::move(lido)).first;
    }
    ultimoLayer_ = &*it;
    return it->second;
}

const QString& CCDataReader::LayerDe(const OdDbObjectId& entidade) const {
    // Both sides of a terminal ask for its layer, each twice.
    const std::uint64_t versao = CICad::VersaoDesenho(entidade.database());
    if (layerDoUltimo_ && entidade == layerDe_ && versao == layerVersao_) return *layerDoUltimo_;
    layerDoUltimo_ = &LayerDoNome(CICad::NomeLayerUtf8(entidade)).nome;
    layerDe_ = entidade;
    layerVersao_ = versao;
    return *layerDoUltimo_;
}

QString CCDataReader::PosicaoNoPonto(const OdDbObjectId& entidade, const QString& grupo,
                                     const QString& pagina, const CEPonto& p) const {
    using zvsdk::ResultBuffer;
    if (!chamadaPosicao_) {
        ResultBuffer* chamada = zvsdk::newString(QStringLiteral("BuscarCoordenadas"));
        ResultBuffer* cauda = chamada->rbnext = zvsdk::newEntity({});
        cauda = cauda->rbnext = zvsdk::newString(QString());
        cauda = cauda->rbnext = zvsdk::newString(QString());
        cauda = cauda->rbnext = zvsdk::newReal(0.0);
        cauda->rbnext = zvsdk::newReal(0.0);
        chamadaPosicao_.reset(chamada);
    }
    ResultBuffer* no = chamadaPosicao_->rbnext;
    no->rlname = entidade.entityName();
    (no = no->rbnext)->rstring = grupo;
    (no = no->rbnext)->rstring = pagina;
    (no = no->rbnext)->rreal = p.x;
    no->rbnext->rreal = p.y;
    ResultBuffer* resposta = CICad::InvokeChain(chamadaPosicao_.get());
    const QString texto =
        resposta && resposta->restype == zvsdk::RTSTR ? resposta->rstring : QStringLiteral("??");
    CICad::LiberaLista(resposta);
    return texto;
}

const CCDataReader::Circuito& CCDataReader::CircuitoDe(bool tem, int numero) {
    static const Circuito kNenhum;
    if (!tem) return kNenhum;
    auto it = circuitos_.constFind(numero);
    if (it == circuitos_.constEnd()) {
        Circuito novo;
        QString terceiro;
        novo.ok = CICad::GetCircuitoLocalInfo(numero, novo.circuito, novo.painel, terceiro);
        if (!novo.ok) novo.circuito.clear(), novo.painel.clear();
        it = circuitos_.insert(numero, novo);
    }
    return it.value();
}

const CCDataReader::CatalogoComp& CCDataReader::DadosCatalogoComp(const QString& chave,
                                                                  const QString& norma) {
    auto achado = catalogoComp_.find({chave, norma});
    if (achado != catalogoComp_.end()) return achado->second;
    CatalogoComp dados;
    dados.colunas = catalogo_.ColunasComp(chave);
    for (const QString& coluna : dados.colunas) {
        const std::pair<std::uint32_t, QString>& dividida = ColunaDividida(coluna);
        if (dividida.first != kSemColuna) dados.campos.push_back(dividida);
    }
    dados.lista = catalogo_.ListaComp(chave, norma);
    dados.descricao = catalogo_.DescricaoComp(chave);
    dados.tipo = TextoTipo(catalogo_.TipoComp(chave));
    dados.material = catalogo_.MaterialSap(chave);
    return catalogoComp_.emplace(std::pair(chave, norma), std::move(dados)).first->second;
}

const CCDataReader::ConstantesBloco& CCDataReader::ConstantesDoBloco(const OdDbObjectId& referencia,
                                                                     std::string_view bloco) {
    const std::uint64_t versao = CICad::VersaoDesenho(referencia.database());
    auto it = constantes_.find(bloco);
    if (it == constantes_.end())
        it = constantes_.emplace(std::string(bloco), ConstantesBloco{}).first;
    ConstantesBloco& constantes = it->second;
    if (constantes.desenho == referencia.database() && constantes.versao == versao &&
        constantes.desenho)
        return constantes;
    constantes.desenho = referencia.database();
    constantes.versao = versao;
    constantes.campos.clear();
    std::unique_ptr<zv::CEListaAtributos> atributos;
    CICad::GetAtributosConstantes(referencia, atributos);
    for (int i = 0; atributos && i < atributos->Quantidade(); ++i)
        constantes.campos.emplace_back(CamposItem::numero((*atributos)[i].GetTag()),
                                       (*atributos)[i].GetValor());
    return constantes;
}

CCDataReader::OrdemLote& CCDataReader::OrdenaLote() {
    if (ultimaOrdem_ && std::equal(lote_.begin(), lote_.end(), nomesLote_.begin(), nomesLote_.end(),
                                   [](const CamposItem::Campo& campo, std::uint32_t nome) {
                                       return campo.nome == nome;
                                   }))
        return *ultimaOrdem_;
    nomesLote_.clear();
    for (const CamposItem::Campo& campo : lote_)
        nomesLote_.push_back(campo.nome);
    if (auto it = ordensLote_.find(nomesLote_); it != ordensLote_.end()) {
        ultimaOrdem_ = &it->second;
        return it->second;
    }
    // By name, and of one name the last written: sorted by name and place, the last of each
    // run of a name is kept.
    ordemLote_.clear();
    for (std::size_t i = 0; i < lote_.size(); ++i)
        ordemLote_.push_back(std::uint64_t(lote_[i].nome) << 32 | i);
    std::sort(ordemLote_.begin(), ordemLote_.end());
    std::size_t n = 0;
    for (std::size_t i = 0; i < ordemLote_.size(); ++i)
        if (i + 1 == ordemLote_.size() || (ordemLote_[i + 1] >> 32) != (ordemLote_[i] >> 32))
            ordemLote_[n++] = ordemLote_[i];
    // A drawing of many kinds of symbols keeps this bounded.
    if (ordensLote_.size() >= kMaxOrdens) ordensLote_.clear();
    OrdemLote nova;
    nova.ordem.assign(ordemLote_.begin(), ordemLote_.begin() + std::ptrdiff_t(n));
    ultimaOrdem_ = &ordensLote_.emplace(nomesLote_, std::move(nova)).first->second;
    return *ultimaOrdem_;
}

void CCDataReader::JuntaLote(CEItemLista& item) {
    const std::vector<std::uint64_t>& ordem = OrdenaLote().ordem;
    item.campos.juntarOrdenados(
        ordem.size(), [&ordem](std::size_t j) { return std::uint32_t(ordem[j] >> 32); },
        [this, &ordem](std::size_t j) -> QString&& {
            return std::move(lote_[std::uint32_t(ordem[j])].valor);
        });
    lote_.clear();
}

bool CCDataReader::LidaAgora(const OdDbObjectId& referencia, std::string_view& bloco,
                             CEPonto& posicao, const QString*& layer) const {
    if (lidaAgora_.isNull() || referencia != lidaAgora_ || !simbolo_.referencia) return false;
    bloco = simbolo_.bloco;
    posicao = simbolo_.posicao;
    layer = &LayerDoNome(simbolo_.layer).nome;
    return true;
}

bool CCDataReader::LeChaveDoSimbolo(const OdDbObjectId& referencia) {
    // As ChaveDaEntidade tells it, from the walk of the extended data the reading makes.
    return CICad::LeituraChaveSimbolo(referencia, simbolo_) && simbolo_.temTextoChave &&
           !ChaveDoTexto(simbolo_.textoChave).chave.isEmpty();
}

void CCDataReader::GuardaAcessoriosDe(const OdDbObjectId& referencia, const ChaveLida& chave) {
    const std::uint64_t versao = CICad::VersaoDesenho(referencia.database());
    const void* desenho = DesenhoDe(referencia.database());
    if (desenhoAcessorios_ != desenho || versaoAcessorios_ != versao) {
        acessoriosLidos_.limpa();
        desenhoAcessorios_ = desenho;
        versaoAcessorios_ = versao;
    }
    AcessoriosLidos lidos{simbolo_.temChave, chave.chave, chave.norma, {}};
    for (const std::string_view texto : simbolo_.vinculos)
        lidos.vinculos << Texto(texto);
    acessoriosLidos_.porSimbolo.insere(referencia, acessoriosLidos_.numero(std::move(lidos)));
}

const CCDataReader::AcessoriosLidos* CCDataReader::AcessoriosGuardados(
    const OdDbObjectId& id) const {
    if (acessoriosLidos_.porSimbolo.empty() || desenhoAcessorios_ != DesenhoDe(id.database()) ||
        versaoAcessorios_ != CICad::VersaoDesenho(id.database()))
        return nullptr;
    const std::uint32_t* numero = acessoriosLidos_.porSimbolo.procura(id);
    return numero ? &acessoriosLidos_.distintas[*numero] : nullptr;
}

void CCDataReader::RegistraAppVinculos(zvdb::Database* database) {
    const std::uint64_t antes = CICad::VersaoDesenho(database);
    const void* desenho = DesenhoDe(database);
    if (appVinculosEm_ == desenho && appVinculosVersao_ == antes) return;
    CICad::RegistraApp(QStringLiteral("ZV_VINC_ADITIVO"), database);
    const std::uint64_t depois = CICad::VersaoDesenho(database);
    // A new application record changes no symbol: what was kept of them holds.
    if (desenhoAcessorios_ == desenho && versaoAcessorios_ == antes) versaoAcessorios_ = depois;
    appVinculosEm_ = desenho;
    appVinculosVersao_ = depois;
}

void CCDataReader::LeBloco(const QString& s, CEItemLista& item, const OdDbObjectId& referencia,
                           CETemplate* modelo) {
    Q_UNUSED(modelo);
    CICad::LeituraSimbolo(referencia, simbolo_);
    LeSimboloLido(s, item, referencia);
}

void CCDataReader::LeSimboloLido(const QString& s, CEItemLista& item,
                                 const OdDbObjectId& referencia) {
    FazLote(s, item.campos, referencia);
    JuntaLote(item);
}

void CCDataReader::LeSimboloCortado(CEItemLista& item, const OdDbObjectId& referencia) {
    CamposDoSimbolo* campos =
        simbolo_.referencia
            ? CamposDaLeitura(simbolo_.bloco, ChaveDoTexto(simbolo_.textoChave).chave)
            : nullptr;
    camposDaLeitura_ = campos;
    LeSimboloLido(QString(), item, referencia);
    camposDaLeitura_ = nullptr;
    if (!campos || !campos->Inteiro(item)) return;
    // The reader wants this one whole after all: `simbolo_` still holds its reading.
    item.campos.clear();
    LeSimboloLido(QString(), item, referencia);
}

const CCDataReader::NomesDoLote& CCDataReader::NomesDoLoteCom(const QString& s) {
    for (const NomesDoLote& feitos : nomesDoLote_)
        if (feitos.feitos && feitos.sufixo.isSharedWith(s)) return feitos;
    for (const NomesDoLote& feitos : nomesDoLote_)
        if (feitos.feitos && feitos.sufixo == s) return feitos;
    NomesDoLote& n = nomesDoLote_[proximoNomesDoLote_++ % nomesDoLote_.size()];
    // Asked in the order FazLote writes them: a name new under the suffix is numbered so.
    n.sufixo = s;
    n.handle = NumeroCampo<"HANDLE">(s);
    n.painel = NumeroCampo<"PAINEL">(s);
    n.local = NumeroCampo<"LOCAL">(s);
    n.circuito = NumeroCampo<"CIRCUITO">(s);
    n.lista = NumeroCampo<"ZV_LISTA">(s);
    n.chave = NumeroCampo<"ZV_KEY">(s);
    n.descricao = NumeroCampo<"DESCRICAO">(s);
    n.tpDescri = NumeroCampo<"TP_DESCRI">(s);
    n.posicao = NumeroCampo<"POSICAO">(s);
    n.layer = NumeroCampo<"LAYER">(s);
    n.grupo = NumeroCampo<"GRUPO">(s);
    n.pagina = NumeroCampo<"PAGINA">(s);
    n.tipo = NumeroCampo<"COMPONENTTYPE">(s);
    n.qtd = NumeroCampo<"QTD">(s);
    n.material = NumeroCampo<"SAP_MATERIAL">(s);
    n.feitos = true;
    return n;
}

void CCDataReader::FazLote(const QString& s, const CamposItem& campos,
                           const OdDbObjectId& referencia) {
    // The names are numbered in the order the fields are written, as when each was set on
    // the item: the order of the fields in LISP depends on it.
    const CESimboloLido& lido = simbolo_;
    const ChaveLida& chave = lido.temTextoChave ? ChaveDoTexto(lido.textoChave) : semChave_;
    if (GuardaAcessorios) GuardaAcessoriosDe(referencia, chave);
    const CatalogoComp& catalogo =
        chave.catalogo ? *chave.catalogo : DadosCatalogoComp(chave.chave, chave.norma);
    chave.catalogo = &catalogo;
    lote_.clear();
    const std::vector<char>* lidos = CamposLidos;
    CamposDoSimbolo* doSimbolo = camposDaLeitura_;
    // A value no field will hold is not worked out: its name is still numbered in turn.
    const auto quer = [this, lidos, doSimbolo](std::uint32_t nome) {
        if (doSimbolo) return doSimbolo->Quer(nome);
        return lidos ? nome < lidos->size() && (*lidos)[nome] : Quer(nome);
    };
    auto poe = [this, &quer](std::uint32_t nome, const QString& valor) {
        if (quer(nome)) lote_.push_back({nome, valor});
    };
    for (const auto& [nome, valor] : catalogo.campos)
        poe(CamposItem::numeroComSufixo(nome, s), valor);

    ligacoesLidas_.clear();
    for (const CESimboloLido::Atributo& atributo : lido.atributos) {
        TagLida& tag = TagDoTexto(atributo.tag);
        // A name is numbered when first written: under a suffix the whole name only, since
        // the bare tag may be the field of no item.
        if (s.isEmpty() && tag.numero == CamposItem::kSemNome)
            tag.numero = CamposItem::numero(tag.texto);
        const std::uint32_t nome = s.isEmpty() ? tag.numero : CamposItem::numero(tag.texto + s);
        if (!tag.ligacao && !quer(nome)) continue;
        // A reading for the sides leaves blank what none of them keeps: the values that cost
        // a look-up or a call are not worked out.
        if (!tag.ligacao && !Vale(nome)) {
            lote_.push_back({nome, QString()});
            continue;
        }
        const QString& valor = ValorDoTexto(atributo.valor);
        poe(nome, valor);
        if (tag.ligacao) ligacoesLidas_.push_back({tag.texto, valor, atributo.id});
    }
    atributosDe_ = referencia;
    atributosVersao_ = CICad::VersaoDesenho(referencia.database());
    if (lido.referencia) {
        for (const auto& [nome, valor] : ConstantesDoBloco(referencia, lido.bloco).campos)
            poe(CamposItem::numeroComSufixo(nome, s), valor);
        if (lido.bloco.starts_with("PIN-")) {
            const CEListaXData pino = CICad::GetXData(referencia, "ZV_PINO");
            if (!pino.empty() && pino[0].codigo == 1000)
                poe(NumeroCampo<"CONECTOR">(s), pino[0].texto);
        }
    }
    const NomesDoLote& nomes = NomesDoLoteCom(s);
    poe(nomes.handle, Vale(nomes.handle) ? ZVString::DeHandle(referencia.handle()) : QString());
    // PAINEL and LOCAL hold the same value: templates use either name.
    if (quer(nomes.painel) || quer(nomes.local) || quer(nomes.circuito)) {
        static const Circuito kSemCircuito;
        const bool vale = Vale(nomes.painel) || Vale(nomes.local) || Vale(nomes.circuito);
        const Circuito& circuito =
            vale ? CircuitoDe(lido.temCircuito, lido.circuito) : kSemCircuito;
        poe(nomes.painel, circuito.painel);
        poe(nomes.local, circuito.painel);
        poe(nomes.circuito, circuito.circuito);
    }
    poe(nomes.lista, catalogo.lista);
    poe(nomes.chave, chave.chave);
    poe(nomes.descricao, catalogo.descricao);
    poe(nomes.tpDescri, catalogo.descricao);
    const LayerLido& layer = LayerDoNome(lido.layer);
    // A reference's position is its insertion point; anything else is asked the long way.
    if (quer(nomes.posicao))
        poe(nomes.posicao, !Vale(nomes.posicao)    ? QString()
                           : !lido.referencia      ? Posicao(referencia)
                           : layer.grupo.isEmpty() ? QStringLiteral("??")
                                                   : PosicaoNoPonto(referencia, layer.grupo,
                                                                    layer.pagina, lido.posicao));
    poe(nomes.layer, layer.nome);
    poe(nomes.grupo, layer.grupo);
    poe(nomes.pagina, layer.pagina);
    poe(nomes.tipo, catalogo.tipo);
    // QTD as the item has it so far: the last written here, or the item's own.
    const std::uint32_t qtd = nomes.qtd;
    const QString* valorQtd = nullptr;
    for (auto it = lote_.rbegin(); it != lote_.rend() && !valorQtd; ++it)
        if (it->nome == qtd) valorQtd = &it->valor;
    if (!valorQtd) valorQtd = campos.procura(qtd);
    if (!valorQtd || valorQtd->isEmpty()) poe(qtd, QStringLiteral("1"));
    poe(nomes.material, catalogo.material);
    QString orientacao = QStringLiteral("0");
    if (lido.temLayout) {
        const CEListaXData layout = CICad::GetXData(referencia, "KVR_LAYOUT_ESQUEMA");
        for (size_t indice : {size_t(0), size_t(2)}) {
            if (indice >= layout.size()) continue;
            const OdDbObjectId ref = CICad::IdDoHandle(layout[indice].texto, referencia.database());
            if (!CICad::EhReferencia(ref)) continue;
            const CEPonto p = CICad::GetPosicao(ref);
            poe(NumeroCampo<"LAYOUTPOSITIONX">(s), QString::number(qint64(std::trunc(p.x))));
            poe(NumeroCampo<"LAYOUTPOSITIONY">(s), QString::number(qint64(std::trunc(p.y))));
            break;
        }
        if (!layout.empty() && layout[0].codigo == 1000) {
            const OdDbObjectId ref = CICad::IdDoHandle(layout[0].texto, referencia.database());
            if (CICad::EhReferencia(ref))
                orientacao = ZVString::DeReal(CICad::GetRotacao(ref) * 180.0 / M_PI);
        }
    }
    poe(NumeroCampo<"ORIENTACAO">(s), orientacao);
}
