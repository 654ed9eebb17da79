#include "CESerializable.h"

#include "CICad.h"
#include "drawing/Database.h"
#include "drawing/Dictionary.h"
#include "drawing/XRecord.h"

#include <cstdlib>
#include <string>

namespace ZVData {

namespace {

zvdb::Database* Db(zvdb::Database* database) {
    return database ? database : CICad::GetDatabase();
}

// The class's dictionary; the store's levels are made on the way, reading included.
zvdb::Dictionary* DicionarioClasse(zvdb::Database* db, const QString& classe) {
    if (!db) return nullptr;
    const std::string caminho[] = {"ZV_DATA_MGR", classe.toStdString()};
    return db->dictionaryAt(caminho, true);
}

QString Texto(std::string_view texto) {
    return QString::fromUtf8(texto.data(), int(texto.size()));
}

CEMapaCampos CamposDe(const zvdb::Dictionary& objeto) {
    CEMapaCampos campos;
    for (const zvdb::Dictionary::Entry& entrada : objeto.entries()) {
        zvdb::XRecord* registro = objeto.getXRecord(entrada.name);
        const std::vector<zvdb::Tag> dados = registro ? registro->data() : std::vector<zvdb::Tag>();
        campos.insert(Texto(entrada.name), dados.empty() ? QString() : Texto(dados.front().value));
    }
    return campos;
}

}  // namespace

CESerializable::CESerializable(const QString& classe, zvdb::Database* database)
    : database_(Db(database)), classe_(classe) {
    do {
        chave_ = QString::number(std::rand());
    } while (Existe(chave_, classe_, database_));
}

void CESerializable::Gravar() const {
    zvdb::Dictionary* dicionario = DicionarioClasse(database_, classe_);
    if (!dicionario) return;
    if (zvdb::DbObject* antigo = dicionario->get(chave_.toStdString())) antigo->erase();
    zvdb::Dictionary* objeto = dicionario->getOrCreateDictionary(chave_.toStdString());
    const CEMapaCampos campos = Salvar();
    for (auto it = campos.constBegin(); it != campos.constEnd(); ++it) {
        zvdb::XRecord* registro = objeto->getOrCreateXRecord(it.key().toStdString());
        const zvdb::Tag valor{1000, database_->store(it.value().toStdString())};
        registro->setData(std::span<const zvdb::Tag>(&valor, 1));
    }
}

bool CESerializable::Apagar() const {
    zvdb::Dictionary* dicionario = DicionarioClasse(database_, classe_);
    if (zvdb::DbObject* objeto = dicionario ? dicionario->get(chave_.toStdString()) : nullptr)
        objeto->erase();
    return true;
}

bool CESerializable::Existe(const QString& chave, const QString& classe, zvdb::Database* database) {
    zvdb::Dictionary* dicionario = DicionarioClasse(Db(database), classe);
    return dicionario && dicionario->getDictionary(chave.toStdString());
}

std::vector<std::pair<QString, CEMapaCampos>> CESerializable::CarregarClasse(
    const QString& classe, zvdb::Database* database) {
    std::vector<std::pair<QString, CEMapaCampos>> objetos;
    zvdb::Dictionary* dicionario = DicionarioClasse(Db(database), classe);
    if (!dicionario) return objetos;
    for (const zvdb::Dictionary::Entry& entrada : dicionario->entries())
        if (zvdb::Dictionary* objeto = dicionario->getDictionary(entrada.name))
            objetos.emplace_back(Texto(entrada.name), CamposDe(*objeto));
    return objetos;
}

CEMapaCampos CESerializable::CarregarObjeto(const QString& chave, const QString& classe,
                                            zvdb::Database* database) {
    zvdb::Dictionary* dicionario = DicionarioClasse(Db(database), classe);
    zvdb::Dictionary* objeto =
        dicionario ? dicionario->getDictionary(chave.toStdString()) : nullptr;
    return objeto ? CamposDe(*objeto) : CEMapaCampos();
}

void CESerializable::ApagarClasse(const QString& classe, zvdb::Database* database) {
    if (zvdb::Dictionary* dicionario = DicionarioClasse(Db(database), classe)) dicionario->erase();
}

}  // namespace ZVData
