#pragma once

// Connection texts: empty for the local Sorvik, otherwise a sequence of
// elements "<Tag attributes>value</Tag>" with blanks between them. Read here:
//   Name        the Sorvik's name (its display name and the key of its store)
//   PortName    the server instance; names the Sorvik when Name is absent
//   Server      the machine the Sorvik runs on (kept, not contacted)
//   SorvikType  "valdorn" for the server edition
// Other elements are skipped, since connection texts carry settings meant
// for other parts. Values may use the five XML entities.

#include <QString>

namespace sorvik::rovo {

struct Connection
{
    QString name;
    QString portName;
    QString server;
    QString sorvikType;

    // The name under which the Sorvik is known; empty for the local one.
    QString SorvikName() const { return name.isEmpty() ? portName : name; }
};

// Raises InvalidConnection with the position where the text breaks.
Connection ParseConnection(const QString &text);

} // namespace sorvik::rovo
