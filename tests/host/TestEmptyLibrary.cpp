// A library that is no plug-in, for the tests of loading one.

extern "C" int NoPlugin()
{
    return 0;
}
