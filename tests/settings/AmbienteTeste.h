#pragma once
// A private world for the settings and message tests: the data folder ($ZV_DATA_DIR), the
// temporary folder ($TMPDIR, where the log goes) and the host's executable folder all lie
// in one temporary folder, so no test reads or writes a real user's files.
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "settings/CIMensagens.h"

#include <gtest/gtest.h>

#include <QByteArray>
#include <QDir>
#include <QFile>
#include <QString>
#include <QTemporaryDir>
#include <QTextStream>

#include <memory>

class AmbienteTeste : public ::testing::Test {
public:
    static QByteArray Le(const QString& caminho) {
        QFile arquivo(caminho);
        return arquivo.open(QIODevice::ReadOnly) ? arquivo.readAll() : QByteArray();
    }

    static bool Escreve(const QString& caminho, const QByteArray& conteudo) {
        QDir().mkpath(QFileInfo(caminho).absolutePath());
        QFile arquivo(caminho);
        return arquivo.open(QIODevice::WriteOnly | QIODevice::Truncate) &&
               arquivo.write(conteudo) == conteudo.size();
    }

protected:
    void SetUp() override {
        ASSERT_TRUE(raiz_.isValid());
        ASSERT_TRUE(QDir().mkpath(PastaDados()));
        ASSERT_TRUE(QDir().mkpath(PastaTemp()));
        ASSERT_TRUE(QDir().mkpath(PastaPrograma()));
        dadosAntes_ = qgetenv("ZV_DATA_DIR");
        tempAntes_ = qgetenv("TMPDIR");
        qputenv("ZV_DATA_DIR", PastaDados().toUtf8());
        qputenv("TMPDIR", PastaTemp().toUtf8());
        aplicacao_ = std::make_unique<zvhost::Application>(
            std::make_unique<zvhost::ConsoleUserInterface>(saida_, erros_, false), saida_);
        aplicacao_->setExecutableFolder(raiz_.filePath("bin"));
        CIMensagens::Descarregar();
    }

    void TearDown() override {
        CIMensagens::Descarregar();
        aplicacao_.reset();
        Restaura("ZV_DATA_DIR", dadosAntes_);
        Restaura("TMPDIR", tempAntes_);
    }

    QString PastaDados() const { return raiz_.filePath("dados"); }
    QString PastaTemp() const { return raiz_.filePath("tmp"); }
    QString PastaPrograma() const { return raiz_.filePath("bin/program"); }

private:
    static void Restaura(const char* nome, const QByteArray& valor) {
        if (valor.isNull())
            qunsetenv(nome);
        else
            qputenv(nome, valor);
    }

    QTemporaryDir raiz_;
    QByteArray dadosAntes_;
    QByteArray tempAntes_;
    QString textoSaida_;
    QString textoErros_;
    QTextStream saida_{&textoSaida_};
    QTextStream erros_{&textoErros_};
    std::unique_ptr<zvhost::Application> aplicacao_;
};
