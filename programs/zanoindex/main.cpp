#include "program.h"
#include "tag_reader.h"

int main(int argc, char **argv) {
    return zano::index::runProgram(argc, argv, {zano::index::readTags, {}});
}
