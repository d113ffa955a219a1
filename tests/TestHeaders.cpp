// Nothing but the precompiled header that all tests share.
