// QX_API marks what the shared library exports: everything else is built with hidden visibility.
// It stands on classes whose methods, vtable or type information a host uses, and on free
// functions.
#pragma once

#define QX_API __attribute__((visibility("default")))
