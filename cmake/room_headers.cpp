// The headers of the target room_headers, precompiled, are all that is wanted of it.
