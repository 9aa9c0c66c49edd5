// The library that owns the precompiled headers needs a source.
