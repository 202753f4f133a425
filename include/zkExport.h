/// The export macro of libzkutil.
///
/// The library is compiled with hidden visibility: only the classes and
/// functions marked ZK_API are visible to programs that link against it.
#ifndef ZK_EXPORT_H
#define ZK_EXPORT_H

#if defined(__GNUC__)
#define ZK_API __attribute__((visibility("default")))
#else
#define ZK_API
#endif

#endif
