# The bus service tests drive a private dbus-daemon and python3-dbusmock
# mocks (see MockBus.h) through GDBus.
target_link_libraries(${target} PRIVATE PkgConfig::GIO)
