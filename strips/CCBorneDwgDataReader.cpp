#include "CCBorneDwgDataReader.h"

#include "CCBorneDwgWriter.h"

#include "lists/CETemplate.h"
#include "lists/CETemplateLisp.h"
#include "module/CIProgress.h"
#include "readers/CCBorneDataReader.h"

#include <algorithm>
#include <array>
#include <functional>
#include <memory>
#include <optional>
#include <vector>

namespace {

// The item's value under the name's number without a copy; empty when it has none.
const QString& Valor(const CEItemLista& item, std::uint32_t campo) {
    static const QString kVazio;
    const QString* valor = campo == CamposItem::kSemNome ? nullptr : item.campos.procura(campo);
    return valor ? *valor : kVazio;
}

// Whether the terminal has a wire on a side.
bool ComFio(const CEItemLista& borne, const CCBorneDwgDataReader::Chaves& chaves) {
    return !Valor(borne, chaves.relacaoIni).isEmpty() || !Valor(borne, chaves.relacaoFim).isEmpty();
}

// The fields of the sides the strip drawing reads: the terminal's blocks and template name
// theirs; the sides read relation, strip, number and handle of their neighbours; the model
// links a side's symbol by its handle and reads the side connections (LIG_...). None: all.
std::function<bool(const QString&)> CamposDosLados(std::optional<QSet<QString>> nomes) {
    if (!nomes) return {};
    for (const char* base : {"RELACAO", "TAG", "ETIQUETA", "REGUA", "STRIP", "REGLETA", "NUMERO",
                             "NUMBER", "HANDLE", "REL", "LIG"})
        for (const char* sufixo : {"_INI", "_FIM", "_SEGINI", "_SEGFIM"})
            *nomes << QLatin1String(base) + QLatin1String(sufixo);
    return [nomes = std::move(*nomes)](const QString& nome) {
        return nome.startsWith(QLatin1String("LIG_")) || nomes.contains(nome.toUpper());
    };
}

// What the drawing reads of a terminal: its sides' fields, its strip, number and jumper in
// every language, and its kind. None: all of them.
std::function<bool(const QString&)> CamposDoBorne(std::function<bool(const QString&)> dosLados) {
    if (!dosLados) return {};
    return [dosLados = std::move(dosLados)](const QString& nome) {
        for (const char* proprio :
             {"ZV_LISTA_TIPO", "REGUA", "STRIP", "REGLETA", "NUMERO", "NUMBER", "JUMPER"})
            if (nome == QLatin1String(proprio)) return true;
        return dosLados(nome);
    };
}

}  // namespace

// While a read runs, what the drawing and the template's filter read of the components: the
// layout's fields, the filter's and those of each key's symbol block. A component of a key
// known already is read for those fields alone.
struct CCBorneDwgDataReader::Cortes : CCDataReader::CamposDoSimbolo {
    Cortes(QSet<QString> filtro, CETemplate& m, CCBorneDwgWriter& e)
        : doFiltro(std::move(filtro)), modelo(m), escritor(e) {}
    QSet<QString> doFiltro;
    CETemplate& modelo;
    CCBorneDwgWriter& escritor;
    struct DaChave {
        std::optional<QSet<QString>> nomes;  // none: every field stays
        std::vector<char> fica;              // by name number: 0 not asked yet, 1 kept, 2 not
    };
    QHash<QString, DaChave> porChave;
    DaChave* lida = nullptr;  // the key of the component being read

    static QString Chave(const CEItemLista& item) {
        const QString* campo = item.campos.procura(NumeroCampo<"ZV_KEY">());
        return campo ? *campo : QString();
    }
    // What the writer reads of the component's key, asked once per key.
    DaChave& Da(const CEItemLista& item) {
        const QString chave = Chave(item);
        auto achado = porChave.find(chave);
        if (achado == porChave.end())
            achado = porChave.insert(chave, {escritor.CamposDoSimbolo(item, modelo), {}});
        return achado.value();
    }
    bool Fica(DaChave& daChave, std::uint32_t nome) const {
        if (nome >= daChave.fica.size()) daChave.fica.resize(size_t(nome) + 1, 0);
        char& resposta = daChave.fica[nome];
        if (!resposta) {
            const QString& texto = CamposItem::nome(nome);
            const QString maiusculo = texto.toUpper();
            const bool lido = CEModeloReguas::LeCampoDoSimbolo(texto) ||
                              daChave.nomes->contains(maiusculo) || doFiltro.contains(maiusculo);
            resposta = lido ? 1 : 2;
        }
        return resposta == 1;
    }
    bool Quer(std::uint32_t nome) override { return Fica(*lida, nome); }
    // A kind of its own other than a component's: the export reader keeps it whole.
    bool Inteiro(const CEItemLista& item) override {
        const QString* tipo = item.campos.procura(NumeroCampo<"ZV_LISTA_TIPO">());
        return tipo && !tipo->isEmpty() && *tipo != QLatin1String("COMP");
    }
};

CCBorneDwgDataReader::CCBorneDwgDataReader() {
    lerAcessorios_ = false;
    GuardaFios = false;
    GuardaBornes = false;
    GuardaSimbolos = false;
    LimitaEntidadesGuardadas(2048);
}

CCBorneDwgDataReader::~CCBorneDwgDataReader() = default;

void CCBorneDwgDataReader::ComponenteLido(CEItemLista& item) {
    if (!cortes_) return;
    Cortes::DaChave& daChave = cortes_->Da(item);
    if (!daChave.nomes) return;
    item.campos.reter([&](std::uint32_t nome) { return cortes_->Fica(daChave, nome); });
    item.campos.compactar();
}

void CCBorneDwgDataReader::SimboloGuardado(const CEItemLista& item) {
    if (!cortes_ || item.ids.empty() || cortes_->porChave.contains(Cortes::Chave(item))) return;
    // The first kept component of a key tells its key's fields, as ComponenteLido would ask
    // after the walk: terminals, and what keeps a kind of its own, are not cut there.
    const QString* tipo = item.campos.procura(NumeroCampo<"ZV_LISTA_TIPO">());
    const bool componente = tipo && !tipo->isEmpty()
                                ? *tipo == QLatin1String("COMP")
                                : !EhNomeDeBorne(CICad::NomeBlocoUtf8(item.ids.front()));
    if (componente) cortes_->Da(item);
}

CCDataReader::CamposDoSimbolo* CCBorneDwgDataReader::CamposDaLeitura(std::string_view bloco,
                                                                     const QString& chave) {
    // A terminal's fields stay for its sides.
    if (!cortes_ || EhNomeDeBorne(bloco)) return nullptr;
    const auto achado = cortes_->porChave.find(chave);
    if (achado == cortes_->porChave.end() || !achado->nomes) return nullptr;
    cortes_->lida = &achado.value();
    return cortes_.get();
}

void CCBorneDwgDataReader::LadosLidos(CEItemLista& borne) {
    if (!doBorne_) return;
    borne.campos.reter([this](std::uint32_t nome) {
        if (nome >= ficaNoBorne_.size()) ficaNoBorne_.resize(size_t(nome) + 1, 0);
        char& resposta = ficaNoBorne_[nome];
        if (!resposta) resposta = doBorne_(CamposItem::nome(nome)) ? 1 : 2;
        return resposta == 1;
    });
}

CCBorneDwgDataReader::Chaves CCBorneDwgDataReader::ChavesBornes(const VetorItens& bornes) {
    Chaves chaves;
    for (size_t i = 0; i < 3; ++i) {
        chaves.reguas[i] =
            CamposItem::numeroSeHouver(QString::fromLatin1(CCBorneDataReader::kCamposRegua[i]));
        chaves.numeros[i] =
            CamposItem::numeroSeHouver(QString::fromLatin1(CCBorneDataReader::kCamposNumero[i]));
    }
    chaves.relacaoIni = CamposItem::numeroSeHouver(QStringLiteral("RELACAO_INI"));
    chaves.relacaoFim = CamposItem::numeroSeHouver(QStringLiteral("RELACAO_FIM"));
    chaves.jumper = CamposItem::numeroSeHouver(QStringLiteral("JUMPER"));
    chaves.bornes.reserve(bornes.size());
    chaves.comFio.reserve(bornes.size());
    for (const CEItemLista* borne : bornes) {
        for (size_t i = 0; i < 3; ++i) {
            const QString& regua = Valor(*borne, chaves.reguas[i]);
            const QString& numero = Valor(*borne, chaves.numeros[i]);
            if (!regua.isEmpty() && !numero.isEmpty()) chaves.bornes[{regua, numero}] = true;
        }
        chaves.comFio.push_back(char(ComFio(*borne, chaves)));
    }
    return chaves;
}

bool CCBorneDwgDataReader::Ligado(const CEItemLista& borne, const Chaves& chaves) {
    if (ComFio(borne, chaves)) return true;
    const QString& jumper = Valor(borne, chaves.jumper);
    if (jumper.isEmpty()) return false;
    const QStringList numeros = jumper.split(',', Qt::SkipEmptyParts);
    for (size_t i = 0; i < 3; ++i) {
        const QString& regua = Valor(borne, chaves.reguas[i]);
        if (regua.isEmpty()) continue;
        for (const QString& numero : numeros)
            if (chaves.bornes.value(CEModeloReguas::ChaveBorne{regua, numero.trimmed()}))
                return true;
    }
    return false;
}

VetorItens* CCBorneDwgDataReader::LerDados(zvdb::Database* database,
                                           const std::optional<QStringList>& paginas,
                                           CETemplate& modelo, CIProgress& progresso) {
    CICad::SetIntLisp("EXPORTA", 3);
    // Each terminal copies its neighbours' fields: only those the drawing reads; and keeps
    // only those of its own, once its sides are read.
    const std::function<bool(const QString&)> dosLados =
        CamposDosLados(CCBorneDwgWriter::CamposDosBornes(modelo));
    FiltraSufixos(dosLados);
    doBorne_ = CamposDoBorne(dosLados);
    ficaNoBorne_.clear();
    // The components keep what the drawing and the filter read of them, each as it is read;
    // a filter that may read any field keeps them whole, and so does a read for no writer.
    std::optional<QSet<QString>> doFiltro =
        CETemplateLisp::CamposDaExpressao(modelo.LerTexto("*FILTRO_TEMPLATE*").trimmed());
    if (doFiltro) *doFiltro << QStringLiteral("ZV_LISTA");
    cortes_.reset(doFiltro && Escritor ? new Cortes(std::move(*doFiltro), modelo, *Escritor)
                                       : nullptr);
    struct FimDosCortes {
        CCBorneDwgDataReader& leitor;
        ~FimDosCortes() {
            leitor.cortes_.reset();
            leitor.doBorne_ = nullptr;
        }
    } fimDosCortes{*this};
    // The cable connections: the export read loads them for the components it reads, and
    // once is enough for a run.
    std::unique_ptr<VetorItens> lidos(Le(database, &modelo, true, paginas));
    if (!lidos) return nullptr;
    progresso.Definir(80);

    VetorItens componentes, bornes;
    static const QString kComp = QStringLiteral("COMP"), kBorne = QStringLiteral("BORNE");
    const std::uint32_t tipoCampo = NumeroCampo<"ZV_LISTA_TIPO">();
    for (CEItemLista* item : *lidos) {
        const QString* tipo = item->campos.procura(tipoCampo);
        if (!tipo) continue;
        if (*tipo == kComp) componentes.push_back(item);
        if (*tipo == kBorne) bornes.push_back(item);
    }
    if (!modelo.LerTexto("*FILTRO_TEMPLATE*").isEmpty()) {
        VetorItens ficam;
        const std::uint32_t listaCampo = NumeroCampo<"ZV_LISTA">();
        for (CEItemLista* item : componentes) {
            if (!modelo.FiltraItem(*item)) continue;
            const QString* lista = item->campos.procura(listaCampo);
            if (!lista || *lista != QLatin1String("N")) ficam.push_back(item);
        }
        componentes = std::move(ficam);
    }
    // A cancelled strip picker draws no terminal.
    if (CICad::GetBoolLisp("*SEL_REGUA_BORNE_CFG*"))
        bornes = CCBorneDataReader::SelecionaReguas(bornes);
    if (!CICad::GetBoolLisp("*BORNES_SEM_LIG_GRX*")) {
        const Chaves chaves = ChavesBornes(bornes);
        VetorItens ficam;
        for (size_t k = 0; k < bornes.size(); ++k)
            if (chaves.comFio[k] || Ligado(*bornes[k], chaves)) ficam.push_back(bornes[k]);
        bornes = std::move(ficam);
    }
    // Links the terminal reader made may point at terminals that went: they are made again
    // among those that stay, when the drawing shows jumpers.
    for (CEItemLista* borne : bornes)
        borne->anterior = borne->proximo = nullptr;
    if (CICad::GetBoolLisp("*MOSTRA_JUMPER_GRX*")) CCBorneDataReader::LigaJumpers(bornes);

    // Nothing to draw: the writer adds no page, and the user hears why.
    if (bornes.empty()) CICad::ImprimeMensagem(64);

    auto* resposta = new VetorItens(componentes);
    resposta->insert(resposta->end(), bornes.begin(), bornes.end());
    // What the filters took out is freed now: nothing that stays points at it. What stays
    // is found in one sorted array, with no node per item.
    std::vector<const CEItemLista*> ficam(resposta->begin(), resposta->end());
    std::sort(ficam.begin(), ficam.end());
    for (CEItemLista* item : *lidos)
        if (!std::binary_search(ficam.begin(), ficam.end(), item)) delete item;
    progresso.Definir(95);
    return resposta;
}
