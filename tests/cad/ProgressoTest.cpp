// The progress window shows every step it is given, but lets the host run its event loop
// only now and then: a reader that steps once per entity must not pay for the loop each time.
#include "app/Application.h"
#include "module/CIProgress.h"
#include "sdk/UserInterface.h"

#include <gtest/gtest.h>

#include <QElapsedTimer>
#include <QStringList>
#include <QTextStream>
#include <QThread>

namespace {

class Gravadora : public zvsdk::UserInterface {
public:
    QStringList passos;
    int eventos = 0;
    bool mostra = true;
    void messageBox(const QString&, const QString&) override {}
    bool askYesNo(const QString&, const QString&, bool cancel) override { return cancel; }
    QString fileDialog(const QString&, bool, const QString&, const QString&,
                       const QString&) override {
        return {};
    }
    std::optional<QString> answer(const QString&, const QString&) override { return {}; }
    void showProgress(const QString& titulo) override { passos << "abre " + titulo; }
    void setProgress(int percentual, const QString& linha) override {
        passos << QString::number(percentual) + " " + linha;
    }
    void closeProgress() override { passos << "fecha"; }
    void processEvents(int) override { ++eventos; }
    bool showsProgress() const override { return mostra; }
    void enableMainWindow(bool) override {}
};

class ProgressoTest : public ::testing::Test {
protected:
    void SetUp() override {
        auto ui = std::make_unique<Gravadora>();
        ui_ = ui.get();
        app_ = std::make_unique<zvhost::Application>(std::move(ui), out_);
    }
    QString texto_;
    QTextStream out_{&texto_};
    Gravadora* ui_ = nullptr;
    std::unique_ptr<zvhost::Application> app_;
};

TEST_F(ProgressoTest, EveryStepShowsButTheEventLoopRunsAtMostEveryFewMilliseconds) {
    CIProgress progresso("Lista");
    progresso.Mostrar();
    QElapsedTimer tempo;
    tempo.start();
    constexpr int kPassos = 5000;
    for (int i = 0; i < kPassos; ++i)
        progresso.Definir(i * 100 / kPassos, i == 0 ? QString("leitura") : QString());
    const qint64 gasto = tempo.elapsed();
    ASSERT_EQ(ui_->passos.size(), kPassos + 1);
    EXPECT_EQ(ui_->passos[0], "abre Lista");
    EXPECT_EQ(ui_->passos[1], "0 Lista ( leitura )");
    EXPECT_EQ(ui_->passos.last(), "99 Lista");
    // The first step runs the loop at once; then once per 20 ms at most.
    EXPECT_GE(ui_->eventos, 1);
    EXPECT_LE(ui_->eventos, 1 + gasto / 20 + 1);
    // A step after a pause runs it again, and closing always does.
    const int antes = ui_->eventos;
    QThread::msleep(25);
    progresso.Definir(100);
    EXPECT_EQ(ui_->eventos, antes + 1);
    progresso.Fechar();
    EXPECT_EQ(ui_->eventos, antes + 2);
    EXPECT_EQ(ui_->passos.last(), "fecha");
}

// A window closed soon after it opened stays a moment so that it does not just flicker; a
// host that draws no window closes at once.
TEST_F(ProgressoTest, OnlyAShownWindowWaitsBeforeClosingSoonAfterOpening) {
    for (const bool mostra : {true, false}) {
        ui_->mostra = mostra;
        CIProgress progresso("Lista");
        progresso.Mostrar();
        QElapsedTimer tempo;
        tempo.start();
        progresso.Fechar();
        if (mostra)
            EXPECT_GE(tempo.elapsed(), 50);
        else
            EXPECT_LT(tempo.elapsed(), 50);
        EXPECT_EQ(ui_->passos.last(), "fecha");
    }
}

TEST(ProgressoContagem, StepsReadAsTheirNumbersOverTheCount) {
    EXPECT_EQ(CIProgress::Contagem(1, 20314), "1/20314");
    EXPECT_EQ(CIProgress::Contagem(0, 0), "0/0");
    EXPECT_EQ(CIProgress::Contagem(-5, 2147483647), "-5/2147483647");
    EXPECT_EQ(CIProgress::Contagem(-2147483647 - 1, -2147483647 - 1), "-2147483648/-2147483648");
}

}  // namespace
