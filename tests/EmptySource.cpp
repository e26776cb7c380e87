// The source of the target that owns the precompiled headers.
