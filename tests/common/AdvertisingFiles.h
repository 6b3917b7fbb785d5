#pragma once

#include <QColor>
#include <QList>
#include <QSize>
#include <QString>

// One record of the advertising information file: `name` is the advertisement file's base name as keyed
// there, the dates in the day.month.year form with "X" parts.
struct AdvertisingRecord {
    QString name;
    QString url;
    QString showFrom;
    QString showTo;
};

// Writes "Reclama.ifb" in folder (made if missing) with the given records.
bool WriteReclamaInfo(const QString& folder, const QList<AdvertisingRecord>& records);
// A picture of one colour, in the format its extension names.
bool WritePicture(const QString& path, const QColor& colour, const QSize& size = QSize(480, 300));
// "Image_summer.png" of `colour`, due every day, with `clickAddress`.
bool WriteDueAdvertisement(const QString& reclamaFolder, const QString& clickAddress, const QColor& colour);
