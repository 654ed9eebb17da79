#include "CCCaboGrfWriter.h"

#include "CETemplate.h"
#include "readers/CCCaboDataReader.h"

namespace {

// The places of the detail and first-row blocks among the wire list's five.
constexpr size_t kDetalhe = 1, kPrimeira = 2;

}  // namespace

CCCaboGrfWriter::~CCCaboGrfWriter() {
    juntados_.destruirItens();
}

void CCCaboGrfWriter::EscreverItens(VetorItens& itens, CETemplate& modelo) {
    CCCaboDataReader::FundeLados(itens, juntados_);
    CCFioGrfWriter::EscreverItens(itens, modelo);
}

bool CCCaboGrfWriter::QuebraComBranco(CETemplate& modelo) {
    return modelo.LerTexto("*QUEBRA_POR_CFG*") == "L";
}

// Each page opens its cables anew: the first row of a cable on a page takes the first-row
// block, so that a page stands by itself.
void CCCaboGrfWriter::EscrevePagina(const CEPaginaLista& pagina) {
    QString anterior;
    for (const CELinhaLista& linha : pagina.linhas) {
        if (!linha.item) continue;
        const QString atual = CCCaboDataReader::NomeDoCabo(*linha.item);
        const bool primeira = atual != anterior && blocos_[kPrimeira].existe();
        InsereLinha(blocos_[primeira ? kPrimeira : kDetalhe], pagina.nome, linha);
        anterior = atual;
    }
}
