#pragma once
// A catalogue test's world: its own settings folder and temporary folder, a host with a
// console user interface whose command line and message boxes the test reads, and the
// demo catalogue built into an SQLite file.
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"

#include <QCoreApplication>
#include <QString>
#include <QStringList>
#include <QTemporaryDir>
#include <QTextStream>

#include <gtest/gtest.h>

#include <memory>

class CatalogoTeste : public ::testing::Test {
protected:
    void SetUp() override;
    void TearDown() override;

    // Builds an SQLite file in the test folder from scripts (paths); false on failure.
    bool Construir(const QString& arquivo, const QStringList& scripts);
    // Builds the demo catalogue and points the settings at it, with the language given.
    void UsarDemo(const QString& idioma = "1");
    // Points the settings at an SQLite file of the test folder.
    void UsarSqlite(const QString& nome, const QString& idioma);
    // Runs the catalogue tool; its output lines and error lines.
    int Ferramenta(const QStringList& argumentos, QString* saida, QString* erros = nullptr);

    static QStringList ScriptsDemo();
    // Keys as drawings may hold them, on the demo catalogue of the settings: rows whose keys
    // hold "--", "%", "_", ";" or non-ASCII text are found; a key, standard or language that
    // holds a quote or a backslash answers empty without a statement sent, whatever it says.
    void ConfereChavesDeDesenhos();
    QString Pasta() const { return pasta_.path(); }
    // What the host showed: message boxes go to `erros`, the command line to `saida`.
    QString Caixas() const { return erros_; }
    QString LinhaComando() const { return saida_; }
    void LimparSaidas() {
        saida_.clear();
        erros_.clear();
    }

private:
    QTemporaryDir pasta_;
    QByteArray tmpAntigo_;
    QString saida_, erros_;
    QTextStream out_{&saida_}, err_{&erros_};
    std::unique_ptr<zvhost::Application> app_;
};

// Qt's SQL drivers are plugins, loaded only under an application object.
void GarantirAplicacao();
