#pragma once
// The ordered vector of items that a reader hands a writer. Null entries are tolerated.
#include "CEItemLista.h"

#include <QStringList>

#include <utility>
#include <vector>

class VetorItens : public std::vector<CEItemLista*> {
public:
    using std::vector<CEItemLista*>::vector;

    // Appends each pointer of `origem`, in order, unless that very pointer is already here.
    void juntarSemRepetir(const VetorItens& origem);
    void inserirEm(CEItemLista* item, size_t indice);
    // Inserts one by one at the same index, so the source ends up reversed.
    void inserirVariosEm(const VetorItens& origem, size_t indice);
    // Removes the pointer, keeping the order; the item lives on.
    void removerEm(size_t indice);
    // Sorts by the fields' natural forms, then by their raw texts. Not stable.
    void ordenar(const QStringList& campos);
    // The same sort, stable: items whose fields tie keep the order they had.
    void ordenarEstavel(const QStringList& campos);
    void inverter();
    // The items whose every key has its value; shared with this vector, not copied.
    VetorItens filtrar(const std::vector<std::pair<QString, QString>>& pares) const;
    // Destroys every item, then empties the vector.
    void destruirItens();

    // The sort fields that can decide a comparison, in their order: those some item holds,
    // each once (a name no item holds reads empty for all, a name given again is equal the
    // second time). All of them when none is held: the sort still runs, and moves equal items
    // as it did. Sorting by these makes the very same moves without the others' tables.
    static QStringList camposQueDecidem(const QStringList& campos);
    // <0, 0 or >0: the order of two items by the fields, as `ordenar` sorts them.
    static int compararItens(const CEItemLista* a, const CEItemLista* b, const QStringList& campos);
};
