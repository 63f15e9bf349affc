#ifndef FILEINDEX_TORTURE_RECORDS_H
#define FILEINDEX_TORTURE_RECORDS_H

namespace VANO::TORTURE {

// How many share records the library has obtained from the platform and not released.
long OpenRecords();

} // namespace VANO::TORTURE

#endif
