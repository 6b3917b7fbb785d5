#pragma once

#include <QObject>

namespace Brimvault {

// Window helpers of the dialog library.
class clsFormFuncs : public QObject {
    Q_OBJECT
public:
    explicit clsFormFuncs(QObject* parent = nullptr);

    // Moves a window so that its frame is centred on the available area of its screen (the primary screen
    // when it has none yet), never past the area's top-left corner. Anything but a widget is ignored.
    Q_INVOKABLE void CenterForm(QObject* frm);
};

} // namespace Brimvault
