#ifndef FILEINDEX_INDEX_MGR_UNIT_H
#define FILEINDEX_INDEX_MGR_UNIT_H

namespace VANO::FILEINDEX {

// The unit that messages of IndexMgr's operations name, whichever file they stand in.
constexpr char kIndexMgrUnit[] = "index_mgr";

} // namespace VANO::FILEINDEX

#endif
