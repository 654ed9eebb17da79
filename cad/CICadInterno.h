#pragma once
// What the sources of the facade share: conversions between the facade's types and the
// drawing's, and how objects are found by id. Only cad/ includes it.
#include "CICad.h"

#include "drawing/Database.h"
#include "drawing/DbObject.h"
#include "drawing/LayerRecord.h"

#include <QString>

#include <array>
#include <atomic>
#include <cstdint>
#include <exception>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <type_traits>
#include <typeinfo>
#include <vector>

namespace zvdb {
class Attribute;
class BlockRecord;
}  // namespace zvdb

namespace cicad {

inline std::string U8(const QString& texto) {
    return texto.toStdString();
}
inline QString Q(std::string_view texto) {
    return QString::fromUtf8(texto.data(), int(texto.size()));
}

inline zvdb::Database* Db(zvdb::Database* database) {
    return database ? database : CICad::GetDatabase();
}

inline zvdb::DbObject* Objeto(const OdDbObjectId& id) {
    if (id.isNull()) return nullptr;
    zvdb::DbObject* objeto = id.database()->objectByHandle(id.handle());
    return objeto && !objeto->isErased() ? objeto : nullptr;
}

// The address of the object's own type. Asked outside the template below: in it, GCC 12
// gave the type of the pointer instead of the object's.
inline std::uintptr_t TipoDe(const zvdb::DbObject& objeto) {
    return reinterpret_cast<std::uintptr_t>(&typeid(objeto));
}

// The object as a T, or null when it is none: as dynamic_cast answers, but the drawing's
// classes derive singly and publicly, so the answer for a type holds for each object of it.
// The last types asked of are kept, each in one word (the type's address, and in its low bit
// whether it is a T), all in one cache line; the facade asks the same of many objects of a
// few types.
template <class T>
T* Classe(zvdb::DbObject* objeto) {
    static_assert(std::is_base_of_v<zvdb::DbObject, T> && alignof(std::type_info) > 1);
    if (!objeto) return nullptr;
    alignas(64) static std::array<std::atomic<std::uintptr_t>, 8> vistos{};
    static std::atomic<unsigned> proximo{0};
    const std::uintptr_t tipo = TipoDe(*objeto);
    for (const std::atomic<std::uintptr_t>& visto : vistos) {
        const std::uintptr_t palavra = visto.load(std::memory_order_relaxed);
        if ((palavra & ~std::uintptr_t(1)) == tipo)
            return (palavra & 1) ? static_cast<T*>(objeto) : nullptr;
    }
    const bool eh = dynamic_cast<T*>(objeto) != nullptr;
    vistos[proximo.fetch_add(1, std::memory_order_relaxed) % vistos.size()].store(
        tipo | (eh ? 1 : 0), std::memory_order_relaxed);
    return eh ? static_cast<T*>(objeto) : nullptr;
}

template <class T>
T* Como(const OdDbObjectId& id) {
    return Classe<T>(Objeto(id));
}

inline OdDbObjectId Id(const zvdb::DbObject* objeto) {
    return objeto ? OdDbObjectId(&objeto->database(), objeto->handle()) : OdDbObjectId();
}

inline zvdb::LayerRecord* Layer(const QString& nome, zvdb::Database* database) {
    zvdb::Database* db = Db(database);
    return db && !nome.isEmpty() ? db->layer(U8(nome)) : nullptr;
}

// What a new reference of a block takes: the block's definitions that are not constant and,
// when values are asked for, the value of each (none: its default).
struct AtributosNovos {
    std::vector<const zvdb::Attribute*> definicoes;
    std::vector<std::optional<std::string_view>> dados;
    std::vector<std::string> textos;  // what `dados` points into
};
void PreparaAtributos(zvdb::Database& db, const zvdb::BlockRecord& bloco,
                      const CEValoresAtributos& valores, AtributosNovos& novos);

// Past a point's y and z items in extended data, which belong to its one item (`i` at its x).
void PassaPonto(std::span<const zvdb::Tag> itens, std::size_t& i);
// The items' texts in order, a point's as its x's (its y and z belong to it), with each
// item's code when `codigos` is given.
void TextosDosItens(std::span<const zvdb::Tag> itens, std::vector<std::string_view>& textos,
                    std::vector<int>* codigos = nullptr);

// The project-settings operations log what goes wrong and answer nothing.
template <class F>
auto Protegido(const char* nome, F&& f) -> decltype(f()) {
    try {
        return f();
    } catch (const std::exception& erro) {
        CICad::Log(QString(nome) + ": " + QString::fromUtf8(erro.what()));
    } catch (...) {
        CICad::Log(nome);
    }
    return decltype(f())();
}

}  // namespace cicad
