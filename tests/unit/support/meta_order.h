#pragma once

#include <QMetaMethod>
#include <QStringList>

/// The signatures of a class's own signals and slots, in the order of its meta-object.
inline QStringList methodsInOrder(const QMetaObject& meta)
{
    QStringList signatures;
    for (int i = meta.methodOffset(); i < meta.methodCount(); ++i) {
        signatures.append(QString::fromLatin1(meta.method(i).methodSignature()));
    }
    return signatures;
}
