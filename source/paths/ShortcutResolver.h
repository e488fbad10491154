// What paths need of the floor that knows shortcuts.
#ifndef TESSEL_SOURCE_PATHS_SHORTCUTRESOLVER_H
#define TESSEL_SOURCE_PATHS_SHORTCUTRESOLVER_H

namespace tessel {

// Replaces each shortcut along the name by its target. `text` is terminated, in a buffer of kMaxDOSPathName bytes. 1
// when anything changed, else 0. Defined in source/files/shortcut.cpp.
int ResolveShortcutsInName(char* text);

}  // namespace tessel

#endif
