// The strip drawing's layout (strips in symbol order, jumper tracks, cuts, pages, points,
// detail runs) on generated item vectors of 20,000 and 80,000 terminals, as the strip reader
// would give them: strips of 10 to 400 terminals, a component for every three terminals,
// jumper chains of two to six terminals, some long ones across a strip's rows. Prints the
// times and their ratio; a layout that grows linearly stays near 4.
#include "readers/VetorItens.h"
#include "strips/CEModeloReguas.h"

#include <benchmark/benchmark.h>

#include <chrono>
#include <cstdio>
#include <random>

namespace {

struct Projeto {
    VetorItens itens;
    ~Projeto() { itens.destruirItens(); }
};

void Gera(Projeto& projeto, int terminais, unsigned semente) {
    std::mt19937 gerador(semente);
    auto uniforme = [&](int a, int b) { return std::uniform_int_distribution<int>(a, b)(gerador); };
    int regua = 0, restantes = 0, numero = 0, simbolo = 0;
    std::vector<CEItemLista*> cadeia;
    auto fechaCadeia = [&] {
        for (size_t i = 0; i + 1 < cadeia.size(); ++i) {
            cadeia[i]->proximo = cadeia[i + 1];
            cadeia[i + 1]->anterior = cadeia[i];
        }
        cadeia.clear();
    };
    int tamanhoCadeia = 0;
    CEItemLista* componente = nullptr;
    int ligacao = 0;
    for (int t = 0; t < terminais; ++t) {
        if (restantes == 0) {
            fechaCadeia();
            ++regua;
            restantes = uniforme(10, 400);
            numero = 0;
        }
        --restantes;
        auto* item = new CEItemLista;
        item->definirCampo("ZV_LISTA_TIPO", "BORNE");
        item->definirCampo("REGUA", "X" + QString::number(regua));
        item->definirCampo("NUMERO", QString::number(++numero));
        item->definirCampo("HANDLE", QString::number(0x100000 + t, 16));
        item->definirCampo("ZV_KEY", "1001");
        item->definirCampo("LAYER", "ESQ$" + QString::number(t / 40 + 1) + "$A");
        for (int c = 0; c < 20; ++c)
            item->definirCampo("CAMPO" + QString::number(c), "valor " + QString::number(c));
        if (t % 3 == 0) {
            componente = new CEItemLista;
            componente->definirCampo("ZV_LISTA_TIPO", "COMP");
            componente->definirCampo("HANDLE", QString::number(0x900000 + simbolo, 16));
            componente->definirCampo("RELACAO", "-K" + QString::number(++simbolo));
            componente->definirCampo("ZV_KEY", "2001");
            for (int l = 1; l <= 3; ++l)
                componente->definirCampo("LIGACAO_" + QString::number(l), QString::number(l));
            projeto.itens.push_back(componente);
            ligacao = 0;
        }
        const QString lig = QString::number(++ligacao);
        item->definirCampo("REL_INI", componente->valorCampo("RELACAO") + ":" + lig);
        item->definirCampo("RELACAO_INI", componente->valorCampo("RELACAO"));
        item->definirCampo("HANDLE_INI", componente->valorCampo("HANDLE"));
        item->definirCampo("LIG_INI", lig);
        projeto.itens.push_back(item);
        // Jumper chains: most short and next to each other, one in twenty long.
        if (tamanhoCadeia == 0 && uniforme(0, 9) < 3)
            tamanhoCadeia = uniforme(0, 19) == 0 ? uniforme(20, 60) : uniforme(2, 6);
        if (tamanhoCadeia > 0 && uniforme(0, 1) == 0) {
            cadeia.push_back(item);
            if (--tamanhoCadeia == 0) fechaCadeia();
        }
    }
    fechaCadeia();
}

double Mede(int terminais, size_t* paginas) {
    Projeto projeto;
    Gera(projeto, terminais, 7);
    CEModeloReguas::Parametros p;
    p.bornesPorRegua = 50;
    p.chavesQuebra = QStringList{"REGUA"};
    p.reguasPorPagina = 2;
    p.distanciaReguas = 135;
    p.refX = 50;
    p.refY = 90;
    p.camposDetalhe = QStringList{"RELACAO_INI"};
    double melhor = 1e300;
    for (int vez = 0; vez < 3; ++vez) {
        CEModeloReguas modelo;
        const auto inicio = std::chrono::steady_clock::now();
        modelo.Monta(projeto.itens, p);
        const std::chrono::duration<double> tempo = std::chrono::steady_clock::now() - inicio;
        melhor = std::min(melhor, tempo.count());
        *paginas = modelo.paginas.size();
    }
    return melhor;
}

}  // namespace

int main() {
    size_t paginas20 = 0, paginas80 = 0;
    const double t20 = Mede(20000, &paginas20);
    const double t80 = Mede(80000, &paginas80);
    std::printf("strip drawing layout, 20000 terminals: %.3f s (%zu pages)\n", t20, paginas20);
    std::printf("strip drawing layout, 80000 terminals: %.3f s (%zu pages)\n", t80, paginas80);
    const double razao = t80 / t20;
    std::printf("ratio 80k/20k: %.2f (goal under 4.5): %s\n", razao, razao < 4.5 ? "PASS" : "FAIL");
    return 0;
}
