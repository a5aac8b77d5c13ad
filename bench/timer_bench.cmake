# GLib's own timeout source is the reference.
target_link_libraries(${name} PRIVATE PkgConfig::GLIB)
