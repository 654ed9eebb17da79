// Each question a command asks is a window a user answers: message boxes, yes/no questions,
// file dialogs, input prompts, the page and strip pickers and the progress window, in the
// user's language.
#include "DeskFixture.h"

#include "desk/LispConsole.h"
#include "desk/PageBrowser.h"
#include "desk/PickerDialog.h"
#include "desk/ProgressWindow.h"

#include "app/HostDocument.h"

#include <QAction>
#include <QDialogButtonBox>
#include <QFileDialog>
#include <QInputDialog>
#include <QLabel>
#include <QListWidget>
#include <QMessageBox>
#include <QPushButton>
#include <QTest>

namespace {

using zvtest::chooseFile;
using zvtest::DeskTest;
using zvtest::ModalAnswer;

// The button of a message box by its text.
QAbstractButton* buttonNamed(QWidget* box, const QString& text) {
    for (QAbstractButton* button : box->findChildren<QAbstractButton*>())
        if (button->text() == text) return button;
    return nullptr;
}

class UserInterfaceTest : public DeskTest {
protected:
    void SetUp() override {
        DeskTest::SetUp();
        window_->newDrawing();
    }
};

TEST_F(UserInterfaceTest, AMessageBoxShowsTheTextAndTitleUntilOk) {
    QString text, title;
    ModalAnswer answer([&](QWidget* modal) {
        ASSERT_NE(modal, nullptr);
        auto* box = qobject_cast<QMessageBox*>(modal);
        ASSERT_NE(box, nullptr);
        text = box->text();
        title = box->windowTitle();
        ASSERT_NE(buttonNamed(box, "OK"), nullptr);
        buttonNamed(box, "OK")->click();
    });
    ui_->messageBox("Template not found: bornes.grt", "ZVListas 942");
    EXPECT_TRUE(answer.seen());
    EXPECT_EQ(text, "Template not found: bornes.grt");
    EXPECT_EQ(title, "ZVListas 942");
}

TEST_F(UserInterfaceTest, AYesNoQuestionAnswersWhatWasClickedAndEscapeCancels) {
    for (const bool yes : {true, false}) {
        ModalAnswer answer([&](QWidget* modal) {
            ASSERT_NE(modal, nullptr);
            EXPECT_EQ(modal->objectName(), "question:89");
            buttonNamed(modal, yes ? "Yes" : "No")->click();
        });
        EXPECT_EQ(ui_->askYesNo("question:89", "Delete the old lists?", !yes), yes);
    }
    // Escape: what a cancelling user gives, and the command is marked cancelled.
    auto* document = window_->document();
    zvsdk::CommandResult result = zvsdk::CommandResult::Succeeded;
    document->addCommand("ASK", [&] {
        ModalAnswer escape([](QWidget* modal) {
            ASSERT_NE(modal, nullptr);
            QTest::keyClick(modal, Qt::Key_Escape);
        });
        EXPECT_TRUE(ui_->askYesNo("question:90", "Go on?", true));
        return 1;
    });
    ASSERT_TRUE(window_->runCommand("ASK", &result));
    EXPECT_EQ(result, zvsdk::CommandResult::Cancelled);
}

TEST_F(UserInterfaceTest, QuestionsSpeakTheUsersLanguage) {
    const std::pair<int, const char*> languages[] = {{1, "Sim"}, {2, "Yes"}, {3, "Sí"}};
    for (const auto& [language, yes] : languages) {
        zvdesk::DeskTexts::setLanguage(language);
        QStringList buttons;
        ModalAnswer answer([&](QWidget* modal) {
            ASSERT_NE(modal, nullptr);
            for (QAbstractButton* button : modal->findChildren<QAbstractButton*>())
                buttons << button->text();
            QTest::keyClick(modal, Qt::Key_Escape);
        });
        ui_->askYesNo("question:1", "?", false);
        EXPECT_TRUE(buttons.contains(QString::fromUtf8(yes))) << buttons.join(',').toStdString();
    }
    // The settings file's IdiomaMenuSel chooses; none is English.
    const QString settings = path("dados/FV/FVREG2022SP0.xml");
    QFile::remove(settings + ".keep");
    QFile::copy(settings, settings + ".keep");
    QDir().mkpath(path("dados/FV"));
    for (const auto& [value, language] :
         std::vector<std::pair<QString, int>>{{"3", 3}, {"1", 1}, {"", 0}, {"x", 0}}) {
        QFile file(settings);
        ASSERT_TRUE(file.open(QIODevice::WriteOnly));
        file.write("<?xml version=\"1.0\"?><registros><registro key=\"IdiomaMenuSel\" value=\"" +
                   value.toUtf8() + "\"/></registros>");
        file.close();
        EXPECT_EQ(zvdesk::DeskTexts::settingsLanguage(), language) << value.toStdString();
    }
    QFile::remove(settings);
    QFile::rename(settings + ".keep", settings);
    zvdesk::DeskTexts::setLanguage(0);
    EXPECT_EQ(zvdesk::DeskTexts::language(), 2);
    EXPECT_EQ(zvdesk::words(zvdesk::Text::Cancel), "Cancel");
}

TEST_F(UserInterfaceTest, EveryTextHasWordsInEveryLanguage) {
    for (int language = 1; language <= 3; ++language) {
        zvdesk::DeskTexts::setLanguage(language);
        for (int t = 0; t < int(zvdesk::Text::Count); ++t)
            EXPECT_FALSE(zvdesk::words(zvdesk::Text(t)).isEmpty()) << language << " " << t;
        // The placeholders the window fills are there in every language.
        EXPECT_TRUE(zvdesk::words(zvdesk::Text::UnsavedText).contains("%1"));
        EXPECT_TRUE(zvdesk::words(zvdesk::Text::CommandFailed).contains("%1"));
    }
    zvdesk::DeskTexts::setLanguage(1);
    EXPECT_EQ(zvdesk::words(zvdesk::Text::Cover), "capa");
    zvdesk::DeskTexts::setLanguage(3);
    EXPECT_EQ(zvdesk::words(zvdesk::Text::Cover), "portada");
}

TEST_F(UserInterfaceTest, TheFileDialogGivesTheChosenFileOrNothing) {
    const QString folder = path("templates-here");
    QDir().mkpath(folder);
    QFile(folder + "/bornes.grt").open(QIODevice::WriteOnly);
    QStringList filters;
    ModalAnswer choose([&](QWidget* modal) {
        auto* dialog = qobject_cast<QFileDialog*>(modal);
        ASSERT_NE(dialog, nullptr);
        EXPECT_EQ(dialog->objectName(), "template");
        EXPECT_EQ(dialog->windowTitle(), "Terminal list template");
        EXPECT_EQ(QDir(dialog->directory()).absolutePath(), QDir(folder).absolutePath());
        filters = dialog->nameFilters();
        chooseFile(dialog, folder + "/bornes.grt");
    });
    const QString chosen =
        ui_->fileDialog("template", true, "Template ( *.grt );;", folder, "Terminal list template");
    EXPECT_EQ(QFileInfo(chosen).absoluteFilePath(),
              QFileInfo(folder + "/bornes.grt").absoluteFilePath());
    ASSERT_GE(filters.size(), 2);
    EXPECT_EQ(filters.first(), "Template (*.grt)");
    ModalAnswer cancel([](QWidget* modal) {
        ASSERT_NE(modal, nullptr);
        static_cast<QDialog*>(modal)->reject();
    });
    EXPECT_TRUE(ui_->fileDialog("template", true, "Template ( *.grt );;", folder, "t").isEmpty());
}

TEST_F(UserInterfaceTest, FiltersInTheModulesFormBecomeDialogFilters) {
    using zvdesk::DeskUserInterface;
    EXPECT_EQ(DeskUserInterface::dialogFilters("CSV ( *.csv );;Text ( *.txt *.prn );;"),
              QStringList({"CSV (*.csv)", "Text (*.txt *.prn)"}));
    EXPECT_EQ(DeskUserInterface::dialogFilters("Excel (*.xlsx)"), QStringList({"Excel (*.xlsx)"}));
    EXPECT_EQ(DeskUserInterface::dialogFilters("*.dxf"), QStringList({"*.dxf"}));
    EXPECT_TRUE(DeskUserInterface::dialogFilters(";;").isEmpty());
}

TEST_F(UserInterfaceTest, AnInputPromptGivesTheTextTypedOrNothing) {
    QString label;
    ModalAnswer type([&](QWidget* modal) {
        auto* dialog = qobject_cast<QInputDialog*>(modal);
        ASSERT_NE(dialog, nullptr);
        label = dialog->labelText();
        dialog->setTextValue("ACME Panels");
        dialog->accept();
    });
    EXPECT_EQ(ui_->answer("prompt:Client", "Client"), std::optional<QString>("ACME Panels"));
    EXPECT_EQ(label, "Client");
    ModalAnswer cancel([](QWidget* modal) {
        ASSERT_NE(modal, nullptr);
        static_cast<QDialog*>(modal)->reject();
    });
    EXPECT_EQ(ui_->answer("prompt:Client", "Client"), std::nullopt);
    // The product's prompt function goes through the same window.
    ModalAnswer typed([](QWidget* modal) {
        auto* dialog = qobject_cast<QInputDialog*>(modal);
        ASSERT_NE(dialog, nullptr);
        dialog->setTextValue("42");
        dialog->accept();
    });
    window_->evaluate("(ENTRA_VIA_DD '(\"Number\")) (princ (car *LST_ATRIBS_ENTRADA*))");
    EXPECT_TRUE(window_->console()->text().contains("42"));
}

TEST_F(UserInterfaceTest, ThePagePickerListsTheProjectsPagesAndGivesTheChosen) {
    ASSERT_TRUE(window_->openDrawing(copyOfProject("pick.dxf")));
    QStringList listed;
    ModalAnswer pick([&](QWidget* modal) {
        auto* picker = dynamic_cast<zvdesk::PickerDialog*>(modal);
        ASSERT_NE(picker, nullptr);
        for (int i = 0; i < picker->list()->count(); ++i)
            listed << picker->list()->item(i)->text();
        picker->list()->item(3)->setCheckState(Qt::Checked);
        picker->list()->item(2)->setCheckState(Qt::Checked);
        picker->accept();
    });
    const auto answer = ui_->answer("pages", "Pages");
    EXPECT_EQ(listed, window_->pageBrowser()->pages());
    ASSERT_TRUE(answer.has_value());
    // List order, whatever the order of the clicks.
    EXPECT_EQ(*answer, listed[2] + ";" + listed[3]);
    // All, through the button, and the LISP picker gets them as a list.
    ModalAnswer all([](QWidget* modal) {
        ASSERT_NE(modal, nullptr);
        buttonNamed(modal, "Select all")->click();
        static_cast<QDialog*>(modal)->accept();
    });
    window_->evaluate("(length (zv_seleciona_paginas nil))");
    EXPECT_TRUE(window_->console()->text().endsWith(QString::number(listed.size()) + "\n"))
        << window_->console()->text().toStdString();
    ModalAnswer cancel([](QWidget* modal) {
        ASSERT_NE(modal, nullptr);
        static_cast<QDialog*>(modal)->reject();
    });
    EXPECT_EQ(ui_->answer("pages", "Pages"), std::nullopt);
}

TEST_F(UserInterfaceTest, TheStripPickerListsTheStripsOfTheDrawing) {
    ASSERT_TRUE(window_->openDrawing(copyOfProject("strips.dxf")));
    QStringList listed;
    ModalAnswer pick([&](QWidget* modal) {
        auto* picker = dynamic_cast<zvdesk::PickerDialog*>(modal);
        ASSERT_NE(picker, nullptr);
        for (int i = 0; i < picker->list()->count(); ++i)
            listed << picker->list()->item(i)->text();
        picker->setChecked({"X1", "X2"});
        picker->accept();
    });
    const auto answer = ui_->answer("strips", "Terminal strips (X1,X2...)");
    EXPECT_TRUE(listed.contains("X1")) << listed.join(",").toStdString();
    EXPECT_TRUE(listed.contains("X2"));
    EXPECT_EQ(answer, std::optional<QString>("X1,X2"));
}

TEST_F(UserInterfaceTest, TheProgressWindowShowsTheStepAndCancels) {
    zvdesk::ProgressWindow* progress = ui_->progressWindow();
    ui_->showProgress("Terminal list");
    EXPECT_TRUE(progress->isVisible());
    EXPECT_EQ(progress->windowTitle(), "Terminal list");
    ui_->setProgress(40, "Terminal list ( X3 )");
    EXPECT_EQ(progress->percent(), 40);
    EXPECT_EQ(progress->line(), "Terminal list ( X3 )");
    EXPECT_FALSE(ui_->progressCancelled());
    QPushButton* cancel = progress->findChild<QPushButton*>();
    ASSERT_NE(cancel, nullptr);
    EXPECT_EQ(cancel->text(), "Cancel");
    QTest::mouseClick(cancel, Qt::LeftButton);
    EXPECT_TRUE(ui_->progressCancelled());
    EXPECT_FALSE(cancel->isEnabled());
    ui_->closeProgress();
    EXPECT_FALSE(progress->isVisible());
    // A new run starts uncancelled.
    ui_->showProgress("Wire list");
    EXPECT_FALSE(ui_->progressCancelled());
    ui_->setProgress(250, "");
    EXPECT_EQ(progress->percent(), 100);
    ui_->closeProgress();
}

TEST_F(UserInterfaceTest, AWrittenFileIsShownAndTheModuleSeesAWindowedHost) {
    EXPECT_TRUE(ui_->showsDialogs());
    ui_->showFile(path("exports/terminals.csv"));
    EXPECT_EQ(shown_, QStringList({path("exports/terminals.csv")}));
    // The module's enable call reaches the window's commands.
    ui_->enableMainWindow(false);
    EXPECT_FALSE(window_->commandAction("gerarListaBornesGrf")->isEnabled());
    ui_->enableMainWindow(true);
    EXPECT_TRUE(window_->commandAction("gerarListaBornesGrf")->isEnabled());
}

}  // namespace
