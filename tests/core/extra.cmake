# The GLib back-end is also driven by an application's own GMainLoop.
target_link_libraries(${target} PRIVATE PkgConfig::GLIB)
