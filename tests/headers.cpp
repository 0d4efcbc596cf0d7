// Empty: what the precompiled headers of the test programs are compiled for.
