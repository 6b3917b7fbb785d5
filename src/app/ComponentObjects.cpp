#include "app/ComponentObjects.h"

#include "app/ComponentRegistry.h"
#include "app/LibraryFileCheck.h"

#include <QFileInfo>
#include <QLibrary>
#include <QMetaMethod>
#include <QMetaProperty>

#include <array>
#include <vector>

namespace Brimvault {

namespace {

CreatedObject creationFailure(const QString& message)
{
    return {nullptr, message};
}

CallOutcome callFailure(const QString& message)
{
    return {false, QVariant(), message};
}

QString unsupportedMessage(const QString& name)
{
    return QStringLiteral("Object doesn't support this property or method: ") + name;
}

bool sameName(const char* metaName, const QString& name)
{
    return QString::fromLatin1(metaName).compare(name, Qt::CaseInsensitive) == 0;
}

// Arguments converted to the parameter types, kept alive for the duration of the call.
struct PreparedArguments {
    std::vector<QVariant> values;
    std::vector<QByteArray> typeNames;
    std::array<QGenericArgument, 10> generic {};
};

bool prepareArguments(const QMetaMethod& method, const QVariantList& args, PreparedArguments& prepared)
{
    if (method.parameterCount() != args.size() || args.size() > qsizetype(prepared.generic.size()))
        return false;
    prepared.values.reserve(args.size());
    for (int i = 0; i < method.parameterCount(); ++i) {
        const QMetaType type = method.parameterMetaType(i);
        QVariant value = args.at(i);
        const bool passedAsVariant = type == QMetaType::fromType<QVariant>();
        if (!passedAsVariant && value.metaType() != type && !value.convert(type))
            return false;
        prepared.values.push_back(value);
        prepared.typeNames.push_back(method.parameterTypeName(i));
    }
    for (int i = 0; i < method.parameterCount(); ++i) {
        // A QVariant parameter points at the QVariant itself, every other type at the value inside.
        const QVariant& value = prepared.values[size_t(i)];
        const void* data = method.parameterMetaType(i) == QMetaType::fromType<QVariant>() ? &value : value.constData();
        prepared.generic[size_t(i)] = QGenericArgument(prepared.typeNames[size_t(i)].constData(), data);
    }
    return true;
}

CallOutcome invokeMethod(QObject* object, const QMetaMethod& method, PreparedArguments& prepared)
{
    const QMetaType returnType = method.returnMetaType();
    QVariant variantResult;
    QVariant typedResult;
    QGenericReturnArgument returnArgument;
    if (returnType == QMetaType::fromType<QVariant>()) {
        returnArgument = QGenericReturnArgument(method.typeName(), &variantResult);
    } else if (returnType.isValid() && returnType.id() != QMetaType::Void) {
        typedResult = QVariant(returnType);
        returnArgument = QGenericReturnArgument(method.typeName(), typedResult.data());
    }
    auto& a = prepared.generic;
    if (!method.invoke(
            object, Qt::DirectConnection, returnArgument, a[0], a[1], a[2], a[3], a[4], a[5], a[6], a[7], a[8], a[9]))
        return callFailure(QStringLiteral("Calling %1 failed").arg(QString::fromLatin1(method.name())));
    return {true, returnType == QMetaType::fromType<QVariant>() ? variantResult : typedResult, QString()};
}

CallOutcome callMethod(QObject* object, const QString& name, const QVariantList& args)
{
    const QMetaObject* meta = object->metaObject();
    bool nameFound = false;
    // QObject's own slots (deleteLater) are not part of a component's interface.
    for (int i = QObject::staticMetaObject.methodCount(); i < meta->methodCount(); ++i) {
        const QMetaMethod method = meta->method(i);
        if (method.access() != QMetaMethod::Public || method.methodType() == QMetaMethod::Signal
            || method.methodType() == QMetaMethod::Constructor || !sameName(method.name().constData(), name))
            continue;
        nameFound = true;
        PreparedArguments prepared;
        if (prepareArguments(method, args, prepared))
            return invokeMethod(object, method, prepared);
    }
    if (nameFound)
        return callFailure(QStringLiteral("Wrong number of arguments or invalid argument for ") + name);
    return callFailure(unsupportedMessage(name));
}

CallOutcome callProperty(QObject* object, const QString& name, const QVariantList& args, CallType type)
{
    const QMetaObject* meta = object->metaObject();
    for (int i = QObject::staticMetaObject.propertyCount(); i < meta->propertyCount(); ++i) {
        const QMetaProperty property = meta->property(i);
        if (!sameName(property.name(), name))
            continue;
        if (type == CallType::Get) {
            if (!args.isEmpty() || !property.isReadable())
                return callFailure(QStringLiteral("Property cannot be read this way: ") + name);
            return {true, property.read(object), QString()};
        }
        if (args.size() != 1 || !property.isWritable())
            return callFailure(QStringLiteral("Property cannot be set this way: ") + name);
        if (!property.write(object, args.first()))
            return callFailure(QStringLiteral("Invalid property value for ") + name);
        return {true, QVariant(), QString()};
    }
    return callFailure(unsupportedMessage(name));
}

} // namespace

CreatedObject CreateObject(const QString& progId)
{
    const QString libraryPath = RegisteredLibrary(progId);
    if (libraryPath.isEmpty())
        return creationFailure(QStringLiteral("ActiveX component can't create object: ") + progId);
    if (!QFileInfo(libraryPath).isFile())
        return creationFailure(QStringLiteral("Component file not found: ") + libraryPath);
    if (const std::optional<QString> problem = LibraryFileProblem(libraryPath))
        return creationFailure(*problem);

    // Never unloaded: objects handed out keep running code from it.
    QLibrary library(libraryPath);
    if (!library.load())
        return creationFailure(library.errorString());
    auto factory = reinterpret_cast<CreateObjectFunction>(library.resolve(CreateObjectSymbol));
    if (!factory)
        return creationFailure(QStringLiteral("Component has no object factory: ") + libraryPath);
    std::unique_ptr<QObject> object(factory(progId.toUtf8().constData()));
    if (!object)
        return creationFailure(QStringLiteral("Component does not provide ") + progId);
    return {std::move(object), QString()};
}

CallOutcome CallByName(QObject* object, const QString& name, const QVariantList& args, CallType type)
{
    if (!object)
        return callFailure(QStringLiteral("Object variable not set"));
    if (type == CallType::Method)
        return callMethod(object, name, args);
    return callProperty(object, name, args, type);
}

} // namespace Brimvault
