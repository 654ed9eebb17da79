#include "CCFioDataReader.h"

#include "CEAtributo.h"
#include "SelecaoPaginas.h"
#include "lists/CETemplate.h"
#include "module/CIProgress.h"

#include <memory>
#include <unordered_set>

namespace {

QString Tag(CampoTraduzido campo, int idioma) {
    return CICad::TagTraduzida(campo, idioma);
}

void Define(CIProgress* progresso, int percentual) {
    if (progresso) progresso->Definir(percentual);
}

}  // namespace

void CCFioDataReader::LerLadoIni(CEItemLista& item, const OdDbObjectId& entidade,
                                 CETemplate& modelo) {
    Q_UNUSED(item);
    Q_UNUSED(entidade);
    Q_UNUSED(modelo);
}

void CCFioDataReader::LerLadoFim(CEItemLista& item, const OdDbObjectId& entidade,
                                 CETemplate& modelo) {
    Q_UNUSED(item);
    Q_UNUSED(entidade);
    Q_UNUSED(modelo);
}

VetorItens* CCFioDataReader::LerDados(zvdb::Database* database,
                                      const std::optional<QStringList>& paginas, CETemplate& modelo,
                                      CIProgress& progresso) {
    Q_UNUSED(database);
    Q_UNUSED(paginas);
    std::optional<QStringList> escolhidas;
    if (modelo.LerLogico("*SELECAO_PAG_FIOS*") && CICad::GetDatabase())
        SelecionaPaginas(false, escolhidas);
    auto* itens = new VetorItens;
    progresso.Definir(0);
    const std::unique_ptr<VetorItens> lidos(LeFios(escolhidas, &modelo, &progresso));
    itens->juntarSemRepetir(*lidos);
    AplicaCaminhos(*itens);
    progresso.Definir(100);
    return itens;
}

std::vector<OdDbObjectId> CCFioDataReader::ListaFios(const QStringList& layers) {
    // One string argument per layer: a drawing has more layers than the nine of zvInvoke.
    zvsdk::ResultBuffer* chamada = zvsdk::newString("getListaFios");
    zvsdk::ResultBuffer* cauda = chamada;
    for (const QString& layer : layers)
        cauda = cauda->rbnext = zvsdk::newString(layer);
    zvsdk::ResultBuffer* resposta = CICad::InvokeChain(chamada);
    zvsdk::releaseChain(chamada);
    std::vector<OdDbObjectId> fios;
    for (const zvsdk::ResultBuffer* no = resposta; no; no = no->rbnext)
        if (no->restype == zvsdk::RTENAME) fios.emplace_back(no->rlname);
    CICad::LiberaLista(resposta);
    return fios;
}

CEItemLista* CCFioDataReader::ItemFio(const OdDbObjectId& polilinha, CETemplate* modelo) {
    if (ChaveDaEntidade(polilinha).isEmpty()) return nullptr;
    auto* item = new CEItemLista;
    item->ids.push_back(polilinha);
    CopiaEntidade(QString(), *item, polilinha, modelo);
    return item;
}

std::optional<QString> CCFioDataReader::LigacaoProxima(const QString& elemento,
                                                       const CEPonto& ponto) {
    const PontoElemento chave{elemento, ponto.x, ponto.y, ponto.z};
    auto achado = ligacoes_.find(chave);
    if (achado != ligacoes_.end()) return achado->second;
    const std::unique_ptr<zv::CEAtributo> atributo =
        AtributoConexaoProximo(CICad::IdDoHandle(elemento), ponto);
    std::optional<QString> valor;
    if (atributo) valor = atributo->GetValor();
    ligacoes_.emplace(chave, valor);
    return valor;
}

void CCFioDataReader::PreencheExtremidade(const QString& lado, CEItemLista& item,
                                          const QStringList& elementos,
                                          const QStringList& completas, int indice,
                                          CETemplate* modelo) {
    const QString sufixo = "_" + lado;
    CopiaEntidade(sufixo, item, CICad::IdDoHandle(elementos.value(indice)), modelo);
    LeSegmento(lado, item, completas.value(indice), modelo);
    CompoeExtremidade(sufixo, item, modelo, indice);
}

VetorItens* CCFioDataReader::LeFios(const std::optional<QStringList>& paginas, CETemplate* modelo,
                                    CIProgress* progresso) {
    Define(progresso, 0);
    auto* itens = new VetorItens;
    // An empty page list is no page at all, not every page.
    if (paginas && paginas->isEmpty()) {
        Define(progresso, 100);
        return itens;
    }
    // With pages the drawing is asked for the wires that have a polyline on them, so a wire
    // whose first polyline lies on another page still enters through one on a chosen page.
    const std::vector<OdDbObjectId> fios = ListaFios(paginas ? *paginas : CICad::GetLayers());
    Define(progresso, 30);
    CarregaLayout();
    CarregaConexoesFios();
    MapeiaLayout(modelo);
    Define(progresso, 50);

    const QSet<QString> escolhidas =
        paginas ? QSet<QString>(paginas->begin(), paginas->end()) : QSet<QString>();
    QSet<QString> numeros;
    for (const OdDbObjectId& fio : fios) {
        if (!CICad::EhPolilinha(fio)) continue;
        if (paginas && !escolhidas.contains(CICad::GetLayerEntidade(fio))) continue;
        CEItemLista* item = ItemFio(fio, modelo);
        if (!item) continue;
        const QString campo = CampoFio(*item);
        const QString numero = campo.isEmpty() ? QString() : item->valorCampo(campo);
        // The first polyline of a number speaks for all polylines of that number.
        if (numero.isEmpty() || item->valorCampo("WIRE_LISTA") != "S" || numeros.contains(numero) ||
            (modelo && !modelo->FiltraItem(*item))) {
            delete item;
            continue;
        }
        item->definirCampo("ZV_LISTA_TIPO", "FIO");
        numeros.insert(numero);

        const QStringList* a = ListaConexoes(numero);
        const QStringList* b = ListaConexoesCompletas(numero);
        const QStringList elementos = a ? *a : QStringList();
        const QStringList completas = b ? *b : QStringList();
        Trechos trechos;
        if (!elementos.isEmpty()) {
            const CEItemLista padrao = *item;
            PreencheExtremidade("INI", *item, elementos, completas, 0, modelo);
            CEItemLista* atual = item;
            trechos[atual] = {0, -1};
            const int n = int(elementos.size());
            for (int i = 1; i < n; ++i) {
                const OdDbObjectId elemento = CICad::IdDoHandle(elementos[i]);
                // An element that no longer exists leaves the stretch open.
                if (elemento.isNull()) break;
                // A run of one equipment is one passage: the wire goes in and out of it.
                const bool equipamento = EhEquipamento(elemento);
                if (elementos[i] != elementos[i - 1] || !equipamento) {
                    PreencheExtremidade("FIM", *atual, elementos, completas, i, modelo);
                    trechos[atual].fim = i;
                }
                if (i != n - 1 && (elementos[i] != elementos[i + 1] || !equipamento)) {
                    auto* novo = new CEItemLista(padrao);
                    PreencheExtremidade("INI", *novo, elementos, completas, i, modelo);
                    atual->ligado = novo;
                    itens->push_back(novo);
                    atual = novo;
                    trechos[atual] = {i, -1};
                }
            }
        }
        CalculaComprimentos(item, elementos, &trechos);
        // The first stretch stands behind the later ones; the writer sorts.
        itens->push_back(item);
    }
    for (CEItemLista* item : *itens)
        PartilhaNomes(*item);
    Define(progresso, 100);
    return itens;
}

VetorItens* CCFioDataReader::LeAnilhas(const QHash<QString, QString>& opcoes, CETemplate* modelo,
                                       CIProgress* progresso) {
    Define(progresso, 20);
    const std::vector<OdDbObjectId> fios = ListaFios(CICad::GetLayers());
    Define(progresso, 40);
    CarregaLayout();
    CarregaConexoesFios();
    MapeiaLayout(modelo);
    Define(progresso, 50);

    const QStringList paginas = ZVString(opcoes.value("PAGINAS")).Divide(";");
    const QSet<QString> escolhidas(paginas.begin(), paginas.end());
    auto* itens = new VetorItens;
    QSet<QString> numeros;
    for (const OdDbObjectId& fio : fios) {
        if (!CICad::EhPolilinha(fio)) continue;
        if (!escolhidas.isEmpty() && !escolhidas.contains(CICad::GetLayerEntidade(fio))) continue;
        CEItemLista* item = ItemFio(fio, modelo);
        if (!item) continue;
        const QString campo = CampoFio(*item);
        const QString numero = campo.isEmpty() ? QString() : item->valorCampo(campo);
        if (numero.isEmpty() || item->valorCampo("WIRE_LISTA") != "S" || numeros.contains(numero)) {
            delete item;
            continue;
        }
        numeros.insert(numero);
        item->definirCampo("ZV_LISTA_TIPO", "ANILHA");
        const size_t primeiro = itens->size();
        itens->push_back(item);

        const QStringList* a = ListaConexoes(numero);
        const QStringList* b = ListaConexoesCompletas(numero);
        const QStringList elementos = a ? *a : QStringList();
        const QStringList completas = b ? *b : QStringList();
        const int n = int(elementos.size());
        // A ferrule on each conductor end: a stretch between every two elements.
        CEItemLista* atual = item;
        Trechos trechos;
        for (int i = 0; n >= 2 && i + 1 < n; ++i) {
            PreencheExtremidade("INI", *atual, elementos, completas, i, modelo);
            PreencheExtremidade("FIM", *atual, elementos, completas, i + 1, modelo);
            trechos[atual] = {i, i + 1};
            if (i + 2 == n) break;
            CEItemLista* novo = ItemFio(fio, modelo);
            if (!novo) break;
            novo->definirCampo("ZV_LISTA_TIPO", "ANILHA");
            atual->ligado = novo;
            itens->push_back(novo);
            atual = novo;
        }
        // Stretches in a row that start at the same element make one: the first keeps the
        // link of the last. One pass gives what restarting after each merge would.
        size_t destino = primeiro + 1;
        for (size_t k = primeiro + 1; k < itens->size(); ++k) {
            CEItemLista* esta = (*itens)[k];
            CEItemLista* antes = (*itens)[destino - 1];
            if (esta->valorCampo("HANDLE_INI") == antes->valorCampo("HANDLE_INI")) {
                antes->ligado = esta->ligado;
                trechos.erase(esta);
                delete esta;
            } else {
                (*itens)[destino++] = esta;
            }
        }
        itens->resize(destino);
        CalculaComprimentos(item, elementos, &trechos);
    }
    for (CEItemLista* item : *itens)
        PartilhaNomes(*item);
    Define(progresso, 100);
    return itens;
}

void CCFioDataReader::LeSegmento(const QString& lado, CEItemLista& item, const QString& completo,
                                 CETemplate* modelo) {
    const QString campo = CampoFio(item);
    if (campo.isEmpty()) return;
    // The point of the first entry with this full text, as PontoDaConexaoCompleta answers,
    // from an index of the wire's entries made once.
    const QString numero = item.valorCampo(campo);
    auto lugares = lugaresCompletos_.find(numero);
    if (lugares == lugaresCompletos_.end()) {
        QHash<QString, int> primeiros;
        if (const QStringList* completas = ListaConexoesCompletas(numero))
            for (int i = int(completas->size()) - 1; i >= 0; --i)
                primeiros.insert((*completas)[i], i);
        lugares = lugaresCompletos_.insert(numero, primeiros);
    }
    const std::vector<CEPonto>* pontos = PontosConexao(numero);
    const int lugar = lugares->value(completo, -1);
    const CEPonto ponto = pontos && lugar >= 0 && size_t(lugar) < pontos->size()
                              ? (*pontos)[size_t(lugar)]
                              : CEPonto{};
    // The element's page: its LAYER under the end's suffix.
    const OdDbObjectId fio = FioNoPonto(item.valorCampo("LAYER_" + lado), ponto);
    if (!fio.isNull()) CopiaEntidade("_SEG" + lado, item, fio, modelo);
}

void CCFioDataReader::CompoeExtremidade(const QString& sufixo, CEItemLista& item,
                                        CETemplate* modelo, int indice) {
    const QString campo = CampoFio(item);
    if (campo.isEmpty()) return;
    const QString numero = item.valorCampo(campo);
    const std::vector<CEPonto>* pontos = PontosConexao(numero);
    const QStringList* elementos = ListaConexoes(numero);
    std::unique_ptr<zv::CEAtributo> ligacao;
    if (pontos && elementos && indice >= 0 && indice < elementos->size() &&
        size_t(indice) < pontos->size()) {
        const std::optional<QString> valor =
            LigacaoProxima((*elementos)[indice], (*pontos)[size_t(indice)]);
        if (valor)
            ligacao = std::make_unique<zv::CEAtributo>(QString(), QString(), *valor, OdDbObjectId(),
                                                       false);
    }
    ComporRelacaoFio(sufixo, item, modelo, ligacao.get());
}

void CCFioDataReader::ComporRelacaoFio(const QString& s, CEItemLista& item, CETemplate* modelo,
                                       const zv::CEAtributo* ligacao) {
    QString sep, sepLig;
    Separadores(modelo, sep, sepLig);
    // Without a template (the exports) the relation comes first.
    const bool relacaoPrimeiro = !modelo || modelo->LerTexto("*ORDEM_CONCAT_STD*") == "1";
    const QString lig = ligacao ? ligacao->GetValor() : QString();
    auto campo = [&item, &s](CampoTraduzido qual, int idioma) {
        return item.valorCampo(Tag(qual, idioma) + s);
    };
    auto tem = [&item, &s](CampoTraduzido qual, int idioma) {
        return item.temCampo(Tag(qual, idioma) + s);
    };

    // A pin: its connector and pin, in the template's order.
    const QString conector = item.valorCampo("CONECTOR" + s);
    for (int i = 1; i <= 3; ++i) {
        if (conector.isEmpty() || campo(CampoTraduzido::Pino, i).isEmpty()) continue;
        item.definirCampo("REL" + s, conector);
        item.definirCampo("LIG" + s, campo(CampoTraduzido::Pino, i));
        for (int j = 1; j <= 3; ++j) {
            if (!tem(CampoTraduzido::Pino, j)) continue;
            const QString pino = campo(CampoTraduzido::Pino, j);
            item.definirCampo(Tag(CampoTraduzido::Relacao, j) + s,
                              relacaoPrimeiro ? conector + sep + pino : pino + sep + conector);
        }
        return;
    }

    auto ehBorne = [&](int idioma) {
        return tem(CampoTraduzido::Regua, idioma) && tem(CampoTraduzido::Numero, idioma);
    };
    bool borne = false;
    for (int i = 1; i <= 3 && !borne; ++i) {
        if (!ehBorne(i)) continue;
        borne = true;
        item.definirCampo("REL" + s,
                          campo(CampoTraduzido::Regua, i) + sep + campo(CampoTraduzido::Numero, i));
    }
    for (int i = 1; i <= 3 && !borne; ++i) {
        if (!tem(CampoTraduzido::Relacao, i)) continue;
        item.definirCampo("REL" + s, campo(CampoTraduzido::Relacao, i));
        break;
    }
    item.definirCampo("LIG" + s, lig);

    // Each language present writes the text: the last one wins.
    QString texto;
    for (int i = 1; i <= 3; ++i) {
        if (borne) {
            if (!ehBorne(i)) continue;
            const QString regua = campo(CampoTraduzido::Regua, i);
            const QString numero = campo(CampoTraduzido::Numero, i);
            texto = relacaoPrimeiro ? regua + sep + numero + sepLig + lig
                                    : lig + sepLig + numero + sep + regua;
        } else if (tem(CampoTraduzido::Relacao, i)) {
            const QString relacao = campo(CampoTraduzido::Relacao, i);
            texto = relacaoPrimeiro ? relacao + sep + lig : lig + sep + relacao;
        }
    }
    for (int i = 1; i <= 3; ++i)
        item.definirCampo(Tag(CampoTraduzido::Relacao, i) + s, texto);
}
