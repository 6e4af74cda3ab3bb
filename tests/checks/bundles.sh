#!/usr/bin/env bash
# A class has the bundle of the file that holds it, whatever name and current directory a program is
# called with, and though the linker may have copied the class's type into the program.
#
# usage: bundles.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

build=$1
source=$2
cached() { sed -n "s/^$1:[A-Z]*=//p" "$build/CMakeCache.txt"; }
compiler=$(cached CMAKE_CXX_COMPILER)
flags=(-std=c++20 -fvisibility=hidden -I"$source/include")
[[ $(cached QX_SANITIZE) != ON ]] || flags+=(-fsanitize=address,undefined)
library=(-L"$build/lib" -lQXXMLMarshalling "-Wl,-rpath,$build/lib")
if [[ ! -e $build/lib/libQXXMLMarshalling.so ]]; then
    echo "the library is not built" >&2
    exit 77
fi

root=$(mktemp -d)
trap 'rm -rf -- "$root"' EXIT
root=$(cd -- "$root" && pwd -P)
cd -- "$root"
mkdir -p usr/{bin,lib,plugins,share/{Client,thing}} here gone

cat >thing.h <<'END'
#include <QXXMLMarshalling/model/Object.h>
struct QX_API Thing : qx::Object { ~Thing() override; };
extern "C" QX_API qx::Object* makeThing();
END
cat >thing.cpp <<'END'
#include "thing.h"
Thing::~Thing() = default;
qx::Object* makeThing() { return qx::make<Thing>().detach(); }
END
cat >client.cpp <<'END'
#include "thing.h"
#include <QXXMLMarshalling/QXXMLVolatileDataRepository.h>
#include <QXXMLMarshalling/host/Bundle.h>
#include <dlfcn.h>
#include <filesystem>
#include <iostream>
struct Own : qx::Object {};
void show(const char* what, const std::type_info& type) {
    std::cout << what << ' ' << qx::Bundle::bundleForClass(type)->bundlePath().c_str() << '\n';
}
// usage: Client PLUGINS: or, to remove its own folder before anything is asked, Client FOLDER remove
int main(int count, char** arguments) {
    if (count > 2) {
        std::filesystem::remove_all(arguments[1]);
        const auto main = qx::Bundle::mainBundle();
        std::cout << "main " << (main->pathForResource("etc/passwd").isNull() ? "nothing" : "root") << '\n';
        return 0;
    }
    const auto here = std::filesystem::current_path();
    std::filesystem::current_path(arguments[1]);
    void* const plugin = dlopen("./plugin.so", RTLD_NOW | RTLD_LOCAL);
    std::filesystem::current_path(here);
    const auto make = reinterpret_cast<qx::Object* (*)()>(dlsym(plugin, "makeThing"));
    for (const auto& maker : {&makeThing, make}) {
        qx::Object* const object = maker();
        show(dynamic_cast<Thing*>(object) != nullptr ? "thing" : "plugin", typeid(*object));
        qx::Ref<qx::Object>::adopt(object);
    }
    const auto own = qx::make<Own>();
    show("own", typeid(*own));
    const qx::Ref<qx::Object> memory = QXXMLVolatileDataRepository::init();
    std::cout << (memory.as<QXXMLVolatileDataRepository>() ? "" : "no cast\n");
    show("library", typeid(*memory));
}
END
compile() { "$compiler" "${flags[@]}" "$@"; }
compile -fPIC -shared thing.cpp -o usr/lib/libthing.so "${library[@]}"
compile -fPIC -shared -DThing=Plugged thing.cpp -o usr/plugins/plugin.so "${library[@]}"
cp -- usr/plugins/plugin.so here/plugin.so

expected="thing $root/usr/share/thing
plugin $root/usr/plugins
own $root/usr/share/Client
library $(cd -- "$build/share/QXXMLMarshalling" && pwd -P)"
export ASAN_OPTIONS=detect_leaks=0
for kind in -no-pie -pie; do
    pic=${kind/#-no-pie/-fno-pic}
    compile "${pic/#-pie/-fPIE}" "$kind" client.cpp -o usr/bin/Client "${library[@]}" -Lusr/lib -lthing -ldl \
        "-Wl,-rpath,$root/usr/lib"
    cp -- usr/bin/Client here/Client
    actual=$(cd here && exec -a Client "$root/usr/bin/Client" "$root/usr/plugins" 2>&1)
    diff <(echo "$expected") <(echo "$actual") || { echo "linked with $kind" >&2; exit 1; }
done
cp -- usr/bin/Client gone/Client
[[ $(gone/Client gone remove) == 'main nothing' ]] || { echo "a removed folder holds something" >&2; exit 1; }
# In the folder of an architecture, too.
mkdir usr/lib/x86_64-linux-gnu
mv -- usr/lib/libthing.so usr/lib/x86_64-linux-gnu/
[[ $(LD_LIBRARY_PATH=$root/usr/lib/x86_64-linux-gnu usr/bin/Client usr/plugins) == "thing $root/usr/share/thing"* ]]
