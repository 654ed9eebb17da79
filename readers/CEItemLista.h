#pragma once
// One list item: text fields by name, the drawing objects it came from, and chain links.
#include "CamposItem.h"
#include "ZVString.h"
#include "cad/OdDbObjectId.h"

#include <QSet>

#include <vector>

class CEItemLista {
public:
    CamposItem campos;
    // The entity that made the item stands first.
    std::vector<OdDbObjectId> ids;
    // Non-owning: the previous and next terminal of a jumper group, the next wire stretch.
    CEItemLista* anterior = nullptr;
    CEItemLista* proximo = nullptr;
    CEItemLista* ligado = nullptr;

    bool temCampo(const QString& chave) const { return campos.contains(chave); }
    // True and the value when present; false and `valor` untouched otherwise.
    bool obterCampo(const QString& chave, QString& valor) const;
    QString valorCampo(const QString& chave) const { return campos.value(chave); }
    // The value without a copy, or null; valid until the item's fields change.
    const QString* campo(const QString& chave) const { return campos.procura(chave); }
    void definirCampo(const QString& chave, const QString& valor) { campos.insert(chave, valor); }
    // By name number (CamposItem::numero), for names the readers write again and again.
    void definirCampo(std::uint32_t numero, const QString& valor) { campos.insert(numero, valor); }
    void definirCampoInteiro(const QString& chave, int valor);
    void definirCampoReal(const QString& chave, double valor, int decimais = -1);
    void copiarCampos(const CEItemLista& origem);
    // Each source field under "key_suffix"; an empty suffix keeps the keys.
    void copiarCamposComSufixo(const CEItemLista& origem, const QString& sufixo);
    // Gives back the spare room of the item's fields once it is complete (the names
    // themselves are kept once for the whole program).
    void partilharNomes() { campos.compactar(); }
    // Publishes the item to LISP: `reg` the fields as an association list, `ename` the
    // first object (left as it was when the item has none).
    void paraLisp() const;
    // `ename` alone, as paraLisp sets it.
    void entidadeParaLisp() const;
    static void limparLisp();
    // All field names, each followed by one blank.
    QString textoCampos() const;
};

// A null item has no fields.
inline bool obterCampo(const CEItemLista* item, const QString& chave, QString& valor) {
    return item && item->obterCampo(chave, valor);
}
