#include "MainWindowFixture.h"

#include "TestEnvironment.h"
#include "app/ComponentObjects.h"
#include "catalogue/IconCacheKey.h"
#include "store/InfoFiles.h"
#include "store/SettingsStore.h"
#include "store/clsFileBag.h"
#include "support/ProgramFolder.h"

#include <QApplication>
#include <QDialog>
#include <QDir>
#include <QFileDialog>
#include <QLibrary>
#include <QPainter>
#include <QPainterPath>
#include <QPointer>
#include <QTest>
#include <QTimer>

using namespace Brimvault;
using namespace Qt::StringLiterals;

bool RegisterQuillet()
{
    QLibrary library(QStringLiteral(BRIMVAULT_BIN_DIR "/Quillet"));
    const auto registerServer = reinterpret_cast<RegisterServerFunction>(library.resolve(RegisterServerSymbol));
    return registerServer && registerServer() == 0;
}

ProgramFolderFixture::ProgramFolderFixture(bool withLanguageFiles)
{
    qputenv("BRIMVAULT_PROGRAM_DIR", m_dir.path().toLocal8Bit());
    const QDir source(QStringLiteral(BRIMVAULT_SOURCE_DIR));
    const auto copyAll = [&](const QString& folder, const QString& pattern) {
        const QDir from(source.filePath(folder));
        for (const QString& name : from.entryList({pattern}, QDir::Files))
            QFile::copy(from.filePath(name), m_dir.filePath(name));
    };
    if (withLanguageFiles)
        copyAll(u"lang"_s, u"*.lng"_s);
    copyAll(u"help"_s, u"*.html"_s);
    QFile::copy(source.filePath(u"help/brimvault.html"_s), builtInHelpFile());
}

ProgramFolderFixture::~ProgramFolderFixture()
{
    qunsetenv("BRIMVAULT_PROGRAM_DIR");
}

QString ProgramFolderFixture::builtInHelpFile() const
{
    return m_dir.filePath(ProgramBaseName() + u".html"_s);
}

bool WriteGameInfo(const QString& gamePath, const QString& name, const QString& russianName)
{
    clsFileBag bag;
    bag.SetCurrentFileName(InfoFiles::GameInfoFileName(gamePath));
    bag.SetRecord(clsFileBag::MakeKey(u"Name"_s), name);
    bag.SetRecord(clsFileBag::MakeKey(u"Name_RUSSIAN"_s), russianName);
    return bag.SaveFile();
}

QPixmap GamePicture(const QColor& color)
{
    QImage image(32, 32, QImage::Format_ARGB32_Premultiplied);
    image.fill(Qt::transparent);
    QPainter painter(&image);
    painter.setRenderHint(QPainter::Antialiasing);
    QPainterPath path;
    path.addRoundedRect(QRectF(2.5, 2.5, 27, 27), 6, 6);
    painter.fillPath(path, color);
    painter.end();
    return QPixmap::fromImage(image);
}

QString SampleCaption(int i)
{
    return QStringList {u"Chess"_s, u"Solitaire Collection Deluxe"_s, u"Mah Jongg Quest of the Dragon"_s}.at(i % 3);
}

QString SamplePath(int i)
{
    return u"/games/g%1/run.exe"_s.arg(i);
}

QString BuildSampleLibrary(const TestEnvironment& environment)
{
    const QString gamesFolder = environment.path(u"commonappdata/Brimvault/"_s);
    const auto writeIconFile = [](const QString& path, const QColor& color) {
        QDir().mkpath(QFileInfo(path).absolutePath());
        GamePicture(color).toImage().convertToFormat(QImage::Format_ARGB32).save(path, "ICO");
    };
    // file, English name, Russian name, icon colour (beside the game, or "cache:" in the icon cache)
    const char* const games[][4] = {{"Lines/lines.exe", "Color Lines", "Цветные линии", "#dc3c3c"},
        {"Mahjong/mahjong.exe", "Mahjong Garden", "Сад маджонга", "#28965a"},
        {"Chess 3D/chess3d.exe", "Chess 3D", "Шахматы 3D", "#3c3c46"}, {"Snake/snake.exe", "", "", ""},
        {"Happy Farm/happyfarm.exe", "Happy Farm", "Весёлая ферма", "cache:#6eb428"},
        {"Bubbles/bubbles.swf", "Bubble Shooter", "Стрелок шариками", ""}};
    for (const auto& game : games) {
        const QString path = gamesFolder + QString::fromUtf8(game[0]);
        const QString colour = QString::fromLatin1(game[3]);
        WriteFile(path, path.endsWith(u".swf") ? "FWS" : "MZ");
        if (*game[1])
            WriteGameInfo(path, QString::fromUtf8(game[1]), QString::fromUtf8(game[2]));
        if (colour.startsWith(u"cache:"))
            writeIconFile(IconCacheFile(gamesFolder + u"Icons/"_s, path), QColor(colour.mid(6)));
        else if (!colour.isEmpty())
            writeIconFile(path.chopped(4) + u".ico"_s, QColor(colour));
    }
    const QString added = environment.path(u"personal/Puzzles/puzzle.exe"_s);
    WriteFile(added);
    writeIconFile(environment.path(u"personal/Puzzles/puzzle.ico"_s), QColor(230, 200, 40));
    SaveSetting(AppTitle(), u"Files"_s, u"Count"_s, u"1"_s);
    SaveSetting(AppTitle(), u"Files"_s, u"File1"_s, added);
    SaveSetting(AppTitle(), u"FilesNames"_s, u"FileName1"_s, u"My Puzzle"_s);
    return added;
}

void WhenModalShows(const std::function<void(QWidget*)>& act)
{
    auto* poll = new QTimer(qApp);
    poll->setInterval(10);
    QObject::connect(poll, &QTimer::timeout, qApp, [poll, act, tries = 0]() mutable {
        QWidget* modal = QApplication::activeModalWidget();
        if (!modal && ++tries < 500)
            return;
        poll->stop();
        poll->deleteLater();
        if (!modal)
            return;
        QPointer<QWidget> shown(modal);
        act(modal);
        // A dialog the test failed to close must not hang the run.
        QTimer::singleShot(3000, qApp, [shown] {
            if (auto* dialog = qobject_cast<QDialog*>(shown.data()); dialog && dialog->isVisible())
                dialog->reject();
        });
    });
    poll->start();
}

void ChooseInFileDialog(QWidget* fileDialog, const QString& path)
{
    auto* dialog = qobject_cast<QFileDialog*>(fileDialog);
    if (!dialog)
        return;
    const QFileInfo chosen(path);
    if (chosen.isDir()) {
        // In a folder, accepting with nothing typed answers that folder.
        dialog->setDirectory(chosen.absoluteFilePath());
    } else {
        dialog->setDirectory(chosen.absolutePath());
        // The dialog leaves the name field alone while the user types in it.
        if (QWidget* focused = dialog->focusWidget())
            focused->clearFocus();
        dialog->selectFile(chosen.fileName());
    }
    // The dialog reads folders in the background; accepting before it has the file would answer nothing.
    const QString expected = QDir::cleanPath(chosen.absoluteFilePath());
    for (int i = 0; i < 200 && QDir::cleanPath(dialog->selectedFiles().value(0)) != expected; ++i)
        QTest::qWait(10);
    static_cast<QDialog*>(dialog)->accept();
}
