#pragma once
// The product's settings file, shared by all modules: one XML file of key/value records
// in the folder for all users' application data.
#include <QList>
#include <QPair>
#include <QString>

class CIRegistro {
public:
    // The folder for all users' application data: $ZV_DATA_DIR when set, else the
    // platform's shared data folder for applications.
    static QString PastaDadosComuns();
    // The settings file's full path.
    static QString ArquivoRegistro();
    // The system's folder for temporary files; empty when the system gives none.
    static QString PastaTemporaria();

    // The value of a key, or empty when the file or the key is missing.
    static QString LerRegistro(const QString& chave);
    // Sets a key's value, adding its record when there is none, and saves the file. False
    // when nothing was saved: the file can't be read (it is never replaced then), or the
    // save failed and the old file stayed as it was; `erro` then says why.
    static bool GravarRegistro(const QString& chave, const QString& valor, QString* erro = nullptr);
    // Several keys in one save: all of them or none.
    static bool GravarRegistros(const QList<QPair<QString, QString>>& valores,
                                QString* erro = nullptr);
    // Why the file can't be read: empty when it reads, or when there is none.
    static QString ProblemaArquivo();

    static QString Database() { return LerRegistro("Database"); }
    static bool SetDatabase(const QString& v) { return GravarRegistro("Database", v); }
    static QString NetworkZV() { return LerRegistro("NetworkZV"); }
    static bool SetNetworkZV(const QString& v) { return GravarRegistro("NetworkZV", v); }
    static QString DBName() { return LerRegistro("DBName"); }
    static bool SetDBName(const QString& v) { return GravarRegistro("DBName", v); }
    static QString DBUser() { return LerRegistro("DBUser"); }
    static bool SetDBUser(const QString& v) { return GravarRegistro("DBUser", v); }
    // The password is stored through a reversible transform.
    static QString DBPass();
    static bool SetDBPass(const QString& senha);
    // The stored form of a password.
    static QString SenhaGuardada(const QString& senha);
    static QString DBServer() { return LerRegistro("DBServer"); }
    static bool SetDBServer(const QString& v) { return GravarRegistro("DBServer", v); }
    static int IdiomaMenuSel();
    static bool SetIdiomaMenuSel(int idioma);
    static QString LibLang() { return LerRegistro("libLang"); }
    static bool SetLibLang(const QString& v) { return GravarRegistro("libLang", v); }
    static QString VersionIN() { return LerRegistro("VersionIN"); }
    static bool SetVersionIN(const QString& v) { return GravarRegistro("VersionIN", v); }
};
