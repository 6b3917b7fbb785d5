#pragma once

#include <QObject>
#include <QString>
#include <QVariant>
#include <QVariantList>

#include <cstdint>
#include <memory>

namespace Brimvault {

// What every component library exports (see components/common/ComponentPlugin.h).
inline constexpr char RegisterServerSymbol[] = "DllRegisterServer";
inline constexpr char CreateObjectSymbol[] = "BrimvaultCreateObject";
using RegisterServerFunction = std::int32_t (*)();
using CreateObjectFunction = QObject* (*)(const char* progId);

struct CreatedObject {
    std::unique_ptr<QObject> object; // empty when creation failed
    QString error; // why it failed
    explicit operator bool() const { return object != nullptr; }
};

// Creates an object of a registered component by its ProgID ("Quillet.clsVersion"): looks the library up
// in the component registry, loads it and asks its factory. The library stays loaded for the rest of the
// process, since the object's code lives in it.
CreatedObject CreateObject(const QString& progId);

enum class CallType { Method, Get, Let };

struct CallOutcome {
    bool ok = false;
    QVariant value; // the method's result or the property's value; invalid for void methods
    QString error;
};

// Calls a public Q_INVOKABLE method or slot, or reads or writes a Q_PROPERTY, by name (without regard to
// letter case, as late-bound calls always were). Arguments are converted to the parameter types; a name
// that does not exist, a wrong argument count or an argument that does not convert fails with an error.
CallOutcome CallByName(
    QObject* object, const QString& name, const QVariantList& args = {}, CallType type = CallType::Method);

} // namespace Brimvault
