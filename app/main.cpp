#include "app/Startup.h"

int main(int argc, char* argv[])
{
    return orvanta::Startup::run(argc, argv);
}
