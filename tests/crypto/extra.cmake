# The crypto tests check the file format against OpenSSL directly.
target_link_libraries(${target} PRIVATE OpenSSL::Crypto)
