#pragma once
// What the sources of the facade share: conversions between the facade's types and the
// drawing's, and how objects are found by id. Only cad/ includes it.
#include "CICad.h"

#include "drawing/Database.h"
#include "drawing/DbObject.h"
#include "drawing/LayerRecord.h"

#include <QString>

#include <exception>
#include <optional>
#include <string>
#include <string_view>
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

template <class T>
T* Como(const OdDbObjectId& id) {
    return dynamic_cast<T*>(Objeto(id));
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
