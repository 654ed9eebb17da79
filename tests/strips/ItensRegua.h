#pragma once
// Items as the strip reader gives them, made by the tests: terminals with strip, number,
// the symbols on their sides and jumper links, and components with their connections.
#include "readers/CEItemLista.h"
#include "readers/VetorItens.h"

#include <memory>
#include <vector>

class ItensRegua {
public:
    CEItemLista* Borne(const QString& regua, const QString& numero) {
        CEItemLista* item = Novo();
        item->definirCampo("ZV_LISTA_TIPO", "BORNE");
        item->definirCampo("REGUA", regua);
        item->definirCampo("NUMERO", numero);
        item->definirCampo("HANDLE", QString::number(0x1000 + int(donos_.size()), 16));
        return item;
    }
    // A component; `ligacoes` are its connection names, LIGACAO_1, LIGACAO_2...
    CEItemLista* Simbolo(const QString& handle, const QString& rotulo,
                         const QStringList& ligacoes = {}) {
        CEItemLista* item = Novo();
        item->definirCampo("ZV_LISTA_TIPO", "COMP");
        item->definirCampo("HANDLE", handle);
        item->definirCampo("RELACAO", rotulo);
        for (int i = 0; i < ligacoes.size(); ++i)
            item->definirCampo("LIGACAO_" + QString::number(i + 1), ligacoes[i]);
        return item;
    }
    // Wires a terminal's side ("INI" or "FIM") to a symbol's connection.
    static void Liga(CEItemLista* borne, const QString& lado, const CEItemLista* simbolo,
                     const QString& ligacao) {
        borne->definirCampo("REL_" + lado, simbolo->valorCampo("RELACAO") + ":" + ligacao);
        borne->definirCampo("HANDLE_" + lado, simbolo->valorCampo("HANDLE"));
        borne->definirCampo("LIG_" + lado, ligacao);
        borne->definirCampo("RELACAO_" + lado, simbolo->valorCampo("RELACAO"));
    }
    // Links the terminals into one jumper chain, in the order given.
    static void Jumper(const std::vector<CEItemLista*>& cadeia) {
        for (size_t i = 0; i + 1 < cadeia.size(); ++i) {
            cadeia[i]->proximo = cadeia[i + 1];
            cadeia[i + 1]->anterior = cadeia[i];
        }
    }
    // A strip of terminals numbered 1..n.
    std::vector<CEItemLista*> Regua(const QString& regua, int n) {
        std::vector<CEItemLista*> bornes;
        for (int i = 1; i <= n; ++i)
            bornes.push_back(Borne(regua, QString::number(i)));
        return bornes;
    }

    VetorItens itens;

private:
    CEItemLista* Novo() {
        donos_.push_back(std::make_unique<CEItemLista>());
        itens.push_back(donos_.back().get());
        return donos_.back().get();
    }
    std::vector<std::unique_ptr<CEItemLista>> donos_;
};
