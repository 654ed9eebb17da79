#include "readers/SelecaoPaginas.h"

#include "cad/CICad.h"

#include <QHash>

int SelecionaPaginas(bool comOpcoes, std::optional<QStringList>& paginas) {
    if (!CICad::GetDatabase()) return 2;
    CICad::AvaliaLisp(comOpcoes ? "(setq pblTmpSelPags (zv_seleciona_paginas 1 0))"
                                : "(setq pblTmpSelPags (zv_seleciona_paginas 0))");
    paginas = CICad::GetListaLisp("pblTmpSelPags");
    return 0;
}

bool SelecionaPaginasSolucao(CESelecao& selecao) {
    selecao.clear();
    // The solution picker is the one that runs with no drawing active.
    if (CICad::GetDatabase()) return false;
    CICad::AvaliaLisp("(setq pblTmpSelPags (zvselpagsolucao 0))");
    const QStringList resposta = CICad::GetListaLisp("pblTmpSelPags");
    if (resposta.isEmpty()) return false;
    MontaSelecaoSolucao(resposta, selecao);
    return true;
}

void MontaSelecaoSolucao(const QStringList& resposta, CESelecao& selecao) {
    struct Aberto {
        zvdb::Database* database = nullptr;
        std::shared_ptr<zvdb::Database> mantida;
    };
    QHash<QString, Aberto> abertos;
    for (const auto& [nome, database] : CICad::GetDesenhosAbertos())
        if (!abertos.contains(nome)) abertos.insert(nome, {database, nullptr});
    QHash<QString, size_t> entradas;
    for (const QString& elemento : resposta) {
        const int corte = elemento.indexOf('#');
        const QString projeto = corte < 0 ? elemento : elemento.left(corte);
        const QString pagina = corte < 0 ? QString() : elemento.mid(corte + 1);
        if (auto it = entradas.constFind(projeto); it != entradas.constEnd()) {
            selecao[it.value()].paginas->append(pagina);
            continue;
        }
        auto aberto = abertos.constFind(projeto);
        if (aberto == abertos.constEnd()) {
            Aberto lido;
            const QString arquivo = CICad::zvInvokeString("zvsolution_getProjFile", {projeto});
            if (!arquivo.isEmpty()) {
                lido.mantida = CICad::AbreDesenhoLateral(arquivo);
                lido.database = lido.mantida.get();
            }
            aberto = abertos.insert(projeto, lido);
        }
        entradas.insert(projeto, selecao.size());
        selecao.push_back({aberto->database, aberto->mantida, QStringList{pagina}});
    }
}

CESelecao SelecaoMateriais() {
    const bool perguntar = CICad::GetBoolLisp("*SELECAO_PAG_MATTABLE*");
    const bool solucao = CICad::zvInvokeBool("zvsolution_isloaded");
    CESelecao selecao;
    if (!solucao) {
        std::optional<QStringList> paginas;
        if (perguntar) SelecionaPaginas(false, paginas);
        selecao.push_back({CICad::GetDatabase(), nullptr, paginas});
    } else if (!perguntar) {
        for (const auto& [nome, database] : CICad::GetDesenhosAbertos())
            selecao.push_back({database, nullptr, CICad::GetLayers(database)});
    } else {
        SelecionaPaginasSolucao(selecao);
    }
    return selecao;
}
