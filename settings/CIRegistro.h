#pragma once
// The product's settings file, shared by all modules: one XML file of key/value records
// in the folder for all users' application data.
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
    // Sets a key's value, adding its record when there is none, and saves the file.
    static void GravarRegistro(const QString& chave, const QString& valor);

    static QString Database() { return LerRegistro("Database"); }
    static void SetDatabase(const QString& v) { GravarRegistro("Database", v); }
    static QString NetworkZV() { return LerRegistro("NetworkZV"); }
    static void SetNetworkZV(const QString& v) { GravarRegistro("NetworkZV", v); }
    static QString DBName() { return LerRegistro("DBName"); }
    static void SetDBName(const QString& v) { GravarRegistro("DBName", v); }
    static QString DBUser() { return LerRegistro("DBUser"); }
    static void SetDBUser(const QString& v) { GravarRegistro("DBUser", v); }
    // The password is stored through a reversible transform.
    static QString DBPass();
    static void SetDBPass(const QString& senha);
    static QString DBServer() { return LerRegistro("DBServer"); }
    static void SetDBServer(const QString& v) { GravarRegistro("DBServer", v); }
    static int IdiomaMenuSel();
    static void SetIdiomaMenuSel(int idioma);
    static QString LibLang() { return LerRegistro("libLang"); }
    static void SetLibLang(const QString& v) { GravarRegistro("libLang", v); }
    static QString VersionIN() { return LerRegistro("VersionIN"); }
    static void SetVersionIN(const QString& v) { GravarRegistro("VersionIN", v); }
};
