/// \file
/// Symbol visibility for libqel. The library is built with hidden visibility;
/// only declarations marked QEL_API are part of the exported surface.
#ifndef QEL_EXPORT_H
#define QEL_EXPORT_H

#if defined(QEL_STATIC_BUILD)
#define QEL_API
#else
#define QEL_API __attribute__((visibility("default")))
#endif

#endif
