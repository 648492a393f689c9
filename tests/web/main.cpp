// One example, by the name that is the first argument; the others are the example's.
#include <cstdio>
#include <cstring>

int showpiece_main(int argc, char** argv);
int textpage_main(int argc, char** argv);
int scripts_main(int argc, char** argv);
int motionblur_main(int argc, char** argv);
int smoothmotion_main(int argc, char** argv);
int shadows_main(int argc, char** argv);

int main(int argc, char** argv)
{
    const struct
    {
        const char* name;
        int (*run)(int, char**);
    } examples[] = {{"showpiece", showpiece_main},       {"textpage", textpage_main},
                    {"scripts", scripts_main},           {"motionblur", motionblur_main},
                    {"smoothmotion", smoothmotion_main}, {"shadows", shadows_main}};
    for (const auto& example : examples)
    {
        if (argc > 1 && !std::strcmp(argv[1], example.name))
            return example.run(argc - 1, argv + 1);
    }
    std::fprintf(stderr, "no example of that name\n");
    return 2;
}
