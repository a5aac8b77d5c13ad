# The GLib back-end is also driven by an application's own GMainLoop.
target_link_libraries(${target} PRIVATE PkgConfig::GLIB)
# FailingLocks.cpp looks up the C library's pthread_mutex_lock.
target_link_libraries(${target} PRIVATE ${CMAKE_DL_LIBS})
