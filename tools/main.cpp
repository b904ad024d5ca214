// SPDX-License-Identifier: MIT
// jexjtag: the command-line program of libJexJtag.

#include <iostream>

#include "App.hpp"

int main(int argc, char** argv)
{
    return jexjtag::cli::App::run(argc, argv, std::cout, std::cerr);
}
