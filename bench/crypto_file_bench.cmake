# The reference encrypts with OpenSSL directly.
target_link_libraries(${name} PRIVATE OpenSSL::Crypto)
