#pragma once
// Objects of the project as a whole, kept in the drawing's object store: below the
// named-objects dictionary, "ZV_DATA_MGR", one dictionary per class, one per object by its
// key, and one Xrecord per field holding its text.
#include <QMap>
#include <QString>

#include <vector>

namespace zvdb {
class Database;
}

namespace ZVData {

using CEMapaCampos = QMap<QString, QString>;

class CESerializable {
public:
    // A new object gets a free key of its class.
    explicit CESerializable(const QString& classe, zvdb::Database* database = nullptr);
    virtual ~CESerializable() = default;

    const QString& Chave() const { return chave_; }
    void SetChave(const QString& chave) { chave_ = chave; }
    const QString& Classe() const { return classe_; }

    virtual void Limpar() = 0;
    virtual bool Carregar(const CEMapaCampos& campos) = 0;
    virtual CEMapaCampos Salvar() const = 0;

    // Replaces the object's dictionary with one Xrecord per field.
    void Gravar() const;
    // Erases the object's dictionary.
    bool Apagar() const;

    // The store, by class. Looking at the store creates its dictionaries when missing.
    static bool Existe(const QString& chave, const QString& classe,
                       zvdb::Database* database = nullptr);
    // Every object of the class, in the store's order: key and fields.
    static std::vector<std::pair<QString, CEMapaCampos>> CarregarClasse(
        const QString& classe, zvdb::Database* database = nullptr);
    static CEMapaCampos CarregarObjeto(const QString& chave, const QString& classe,
                                       zvdb::Database* database = nullptr);
    static void ApagarClasse(const QString& classe, zvdb::Database* database = nullptr);

private:
    zvdb::Database* database_;
    QString chave_;
    QString classe_;
};

}  // namespace ZVData
