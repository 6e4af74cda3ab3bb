#pragma once

// Where the library's messages go. A host may supply either function, both or none:
//
//     #include <QXXMLMarshalling/host/Log.h>
//     #include <QXXMLMarshalling/model/Format.h>
//
//     void QXLogWarning(std::string_view format, std::span<const qx::Value> arguments) {
//         std::cerr << qx::format(format, arguments).view() << '\n';
//     }
//
// Include this header where they are defined: it gives them the visibility by which the library
// finds them. A program that links the library needs no more; one that only loads it at run time
// has to export its symbols (-rdynamic), or to define the functions in a shared object that is
// loaded for everybody (RTLD_GLOBAL). They are looked for anew whenever shared objects come or go.
//
// An empty QXLogWarning silences the library: nothing goes to standard error then. What it would
// have said of unknown child elements goes to QXLogDebug, which need not be there.
//
// They may be called on any thread, while the library is at work: they must not use the objects
// that it is working on. Without QXLogWarning, warnings go to standard error, one line each;
// without QXLogDebug, debugging messages go nowhere.

#include <QXXMLMarshalling/model/Value.h>

#include <span>
#include <string_view>

extern "C" {
QX_API __attribute__((weak)) void QXLogDebug(std::string_view format,
                                             std::span<const qx::Value> arguments);
QX_API __attribute__((weak)) void QXLogWarning(std::string_view format,
                                               std::span<const qx::Value> arguments);
}
