// The library that precompiled headers belong to needs a source.
