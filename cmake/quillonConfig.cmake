# Gives hearth::hearth and quillon::quillon.  libpng is a matter of the shared
# library alone, so nothing else is looked for.
include("${CMAKE_CURRENT_LIST_DIR}/hearthTargets.cmake")
include("${CMAKE_CURRENT_LIST_DIR}/quillonTargets.cmake")
