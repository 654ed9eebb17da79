// Freeing on a thread of its own: what is handed over goes there, in order, all of it by the
// time the owner waits or goes; the items and readings the lists hand over leave their
// containers empty and usable at once.
#include "ReaderFixture.h"
#include "module/CZVListasApp.h"
#include "readers/Descarte.h"
#include "readers/LeitorBase.h"
#include "readers/VetorItens.h"

#include <gtest/gtest.h>

#include <QHash>

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <thread>
#include <utility>
#include <vector>

namespace {

// Holds a destructor until opened.
class Porteira {
public:
    void Abre() {
        {
            const std::lock_guard<std::mutex> trava(mutex_);
            aberta_ = true;
        }
        cv_.notify_all();
    }
    void Espera() {
        std::unique_lock<std::mutex> trava(mutex_);
        cv_.wait(trava, [this] { return aberta_; });
    }

private:
    std::mutex mutex_;
    std::condition_variable cv_;
    bool aberta_ = false;
};

// Who was destroyed, in what order and on which thread.
struct Registro {
    std::mutex mutex;
    std::vector<std::pair<int, std::thread::id>> destruidos;
    std::vector<std::pair<int, std::thread::id>> Copia() {
        const std::lock_guard<std::mutex> trava(mutex);
        return destruidos;
    }
};

class Marcado {
public:
    Marcado(Registro& registro, int numero, Porteira* porteira = nullptr)
        : registro_(&registro), numero_(numero), porteira_(porteira) {}
    Marcado(Marcado&& outro) noexcept
        : registro_(std::exchange(outro.registro_, nullptr)),
          numero_(outro.numero_),
          porteira_(outro.porteira_) {}
    Marcado& operator=(Marcado&&) = delete;
    ~Marcado() {
        if (!registro_) return;  // moved from
        if (porteira_) porteira_->Espera();
        const std::lock_guard<std::mutex> trava(registro_->mutex);
        registro_->destruidos.emplace_back(numero_, std::this_thread::get_id());
    }

private:
    Registro* registro_;
    int numero_;
    Porteira* porteira_;
};

// Makes a Descarte the module's for a test.
class DoModulo {
public:
    explicit DoModulo(Descarte& descarte) { Descarte::DefinirDoModulo(&descarte); }
    ~DoModulo() { Descarte::DefinirDoModulo(nullptr); }
};

}  // namespace

TEST(DescarteTest, FreesOnAnotherThreadInOrderAndAllByTheWait) {
    Registro registro;
    Descarte descarte;
    for (int i = 0; i < 50; ++i)
        ASSERT_TRUE(descarte.Entregar(Marcado(registro, i)));
    std::vector<Marcado> varios;
    for (int i = 50; i < 60; ++i)
        varios.emplace_back(registro, i);
    ASSERT_TRUE(descarte.Entregar(std::move(varios)));
    descarte.Esperar();
    const auto destruidos = registro.Copia();
    ASSERT_EQ(destruidos.size(), 60u);
    const std::thread::id principal = std::this_thread::get_id();
    for (std::size_t i = 0; i < destruidos.size(); ++i) {
        EXPECT_EQ(destruidos[i].first, int(i));
        EXPECT_NE(destruidos[i].second, principal);
        EXPECT_EQ(destruidos[i].second, destruidos[0].second);
    }
}

TEST(DescarteTest, AHandOverWhileTheFirstIsStillFreedWaitsItsTurn) {
    Registro registro;
    Porteira porteira;
    Descarte descarte;
    ASSERT_TRUE(descarte.Entregar(Marcado(registro, 1, &porteira)));
    ASSERT_TRUE(descarte.Entregar(Marcado(registro, 2)));
    // The hand-over returned at once although the first is held.
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
    EXPECT_TRUE(registro.Copia().empty());
    porteira.Abre();
    ASSERT_TRUE(descarte.Entregar(Marcado(registro, 3)));
    descarte.Esperar();
    const auto destruidos = registro.Copia();
    ASSERT_EQ(destruidos.size(), 3u);
    EXPECT_EQ(destruidos[0].first, 1);
    EXPECT_EQ(destruidos[1].first, 2);
    EXPECT_EQ(destruidos[2].first, 3);
}

TEST(DescarteTest, TheOwnerGoesOnlyAfterFreeingWhatIsPending) {
    Registro registro;
    Porteira porteira;
    std::thread abre;
    {
        Descarte descarte;
        ASSERT_TRUE(descarte.Entregar(Marcado(registro, 1, &porteira)));
        for (int i = 2; i <= 5; ++i)
            ASSERT_TRUE(descarte.Entregar(Marcado(registro, i)));
        abre = std::thread([&porteira] {
            std::this_thread::sleep_for(std::chrono::milliseconds(50));
            porteira.Abre();
        });
    }
    EXPECT_EQ(registro.Copia().size(), 5u);
    abre.join();
}

TEST(DescarteTest, AnOwnerThatGotNothingGoesAtOnce) {
    Descarte descarte;
    descarte.Esperar();
    Descarte::DefinirDoModulo(&descarte);
    EXPECT_EQ(Descarte::DoModulo(), &descarte);
    {
        Descarte outro;
        Descarte::DefinirDoModulo(&outro);
    }
    // The module's went with its owner.
    EXPECT_EQ(Descarte::DoModulo(), nullptr);
}

TEST(DescarteTest, TheModulesAppHoldsTheOwnerAndFreesAllBeforeItGoes) {
    ASSERT_EQ(Descarte::DoModulo(), nullptr);
    CZVListasApp* app = CZVListasApp::CriarInstancia();
    Descarte* descarte = Descarte::DoModulo();
    ASSERT_NE(descarte, nullptr);
    Registro registro;
    Porteira porteira;
    ASSERT_TRUE(descarte->Entregar(Marcado(registro, 1, &porteira)));
    ASSERT_TRUE(descarte->Entregar(Marcado(registro, 2)));
    std::thread abre([&porteira] {
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
        porteira.Abre();
    });
    app->deleteModule();
    // Gone with the module, after what it held was freed.
    EXPECT_EQ(Descarte::DoModulo(), nullptr);
    EXPECT_EQ(CZVListasApp::Instancia(), nullptr);
    EXPECT_EQ(registro.Copia().size(), 2u);
    abre.join();
}

namespace {

// An item holding a text of its own, shared with the test until the item goes.
VetorItens ItensCom(const QString& texto, int n) {
    VetorItens itens;
    for (int i = 0; i < n; ++i) {
        itens.push_back(new CEItemLista);
        itens.back()->definirCampo("VALOR", texto);
    }
    return itens;
}

}  // namespace

TEST(DescarteTest, TheModulesItemsGoOnItsThreadAndTheVectorIsEmptyAtOnce) {
    Registro registro;
    Porteira porteira;
    Descarte descarte;
    const DoModulo modulo(descarte);
    ASSERT_TRUE(descarte.Entregar(Marcado(registro, 1, &porteira)));
    const QString texto = QString::number(4711) + "-itens";
    VetorItens itens = ItensCom(texto, 100);
    EXPECT_FALSE(texto.isDetached());
    itens.destruirItens();
    EXPECT_TRUE(itens.empty());
    // Still held behind the first hand-over: not freed here.
    EXPECT_FALSE(texto.isDetached());
    itens.push_back(new CEItemLista);
    itens.back()->definirCampo("VALOR", "outro");
    EXPECT_EQ(itens.size(), 1u);
    porteira.Abre();
    descarte.Esperar();
    EXPECT_TRUE(texto.isDetached());
    EXPECT_EQ(itens[0]->valorCampo("VALOR"), "outro");
    itens.destruirItens();
    descarte.Esperar();
    EXPECT_TRUE(itens.empty());
}

TEST(DescarteTest, WithoutTheModulesOwnerItemsGoInPlace) {
    ASSERT_EQ(Descarte::DoModulo(), nullptr);
    const QString texto = QString::number(815) + "-itens";
    VetorItens itens = ItensCom(texto, 10);
    EXPECT_FALSE(texto.isDetached());
    itens.destruirItens();
    EXPECT_TRUE(itens.empty());
    EXPECT_TRUE(texto.isDetached());
}

TEST(DescarteTest, WhatIsLetGoIsEmptiedAtOnceAndFreedOnTheThreadOrInPlace) {
    Registro registro;
    Porteira porteira;
    QHash<QString, QString> tabela;
    const QString texto = QString::number(2718) + "-tabela";
    tabela.insert("A", texto);
    {
        Descarte descarte;
        const DoModulo modulo(descarte);
        ASSERT_TRUE(descarte.Entregar(Marcado(registro, 1, &porteira)));
        Descarte::Largar(tabela);
        EXPECT_TRUE(tabela.isEmpty());
        tabela.insert("B", "usable");
        // Behind the first hand-over: the text's other owner is still held.
        EXPECT_FALSE(texto.isDetached());
        porteira.Abre();
        descarte.Esperar();
        EXPECT_TRUE(texto.isDetached());
    }
    EXPECT_EQ(tabela.value("B"), "usable");
    // Without the module's owner it goes here and now.
    tabela.insert("C", texto);
    EXPECT_FALSE(texto.isDetached());
    Descarte::Largar(tabela);
    EXPECT_TRUE(tabela.isEmpty());
    EXPECT_TRUE(texto.isDetached());
}

namespace {

class DescarteLeiturasTest : public ReaderFixture {};

}  // namespace

TEST_F(DescarteLeiturasTest, TheReadingsGoOnItsThreadAndTheReaderReadsAgainAtOnce) {
    const QString valor = "X" + QString::number(quintptr(this) % 1000);
    const OdDbObjectId k = Simbolo("NA-1", "A1", "ESQ$0001$A", {{"REGUA", valor}});
    Registro registro;
    Porteira porteira;
    Descarte descarte;
    const DoModulo modulo(descarte);
    LeitorBase leitor;
    CEItemLista antes;
    leitor.CopiaEntidade("", antes, k, nullptr);
    ASSERT_TRUE(leitor.LeituraGuardada(k));
    const QString lido = antes.valorCampo("REGUA");
    ASSERT_EQ(lido, valor);
    antes = CEItemLista();
    // The reader's kept readings hold the text.
    EXPECT_FALSE(lido.isDetached());
    ASSERT_TRUE(descarte.Entregar(Marcado(registro, 1, &porteira)));
    leitor.LiberaLeituras();
    EXPECT_FALSE(leitor.LeituraGuardada(k));
    // Given away, held behind the first hand-over: still alive.
    EXPECT_FALSE(lido.isDetached());
    // A new read while the old readings wait gives the same fields.
    CEItemLista depois;
    leitor.CopiaEntidade("", depois, k, nullptr);
    EXPECT_EQ(depois.valorCampo("REGUA"), valor);
    EXPECT_EQ(depois.valorCampo("DESCRICAO"), "Owner");
    porteira.Abre();
    descarte.Esperar();
    ASSERT_EQ(registro.Copia().size(), 1u);
    // The old readings are gone, and with them the last other holder of the text.
    EXPECT_TRUE(lido.isDetached());
}
