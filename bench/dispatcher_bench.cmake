# GLib's own cross-thread invoke is the reference.
target_link_libraries(${name} PRIVATE PkgConfig::GLIB)
