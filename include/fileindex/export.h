#ifndef FILEINDEX_EXPORT_H
#define FILEINDEX_EXPORT_H

/* Marks what libfileindex.so exports; everything else in the library is hidden. Valid in C. */
#define FILEINDEX_API __attribute__((visibility("default")))

#endif
