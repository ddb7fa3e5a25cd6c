#!/bin/bash
# install_test.sh BUILD_DIR GUI(0|1)
set -u
build=$1
gui=$2
fail() { echo "FAIL: $*" >&2; exit 1; }

for tool in desktop-file-validate appstreamcli; do
  command -v $tool >/dev/null || { echo "$tool is not installed: skipped"; exit 77; }
done

stage=$(mktemp -d)
trap 'rm -rf "$stage"' EXIT
DESTDIR=$stage/root cmake --install "$build" --prefix /usr >"$stage/install.log" 2>&1 ||
  { cat "$stage/install.log"; fail "cmake --install"; }
root=$stage/root/usr
id=io.github.quillane.Quillane

for f in bin/quillane-cli bin/quillane-wmf-render bin/quillane-emf-render; do
  [ -x "$root/$f" ] || fail "$f is not installed as a program"
done
for f in share/doc/quillane/README.md share/man/man1/quillane-cli.1 \
         share/bash-completion/completions/quillane-cli; do
  [ -s "$root/$f" ] || fail "$f is missing or empty"
done
# Nothing may land outside DESTDIR.
[ -z "$(find "$stage/root" -mindepth 1 -maxdepth 1 ! -name usr)" ] || fail "files outside the prefix"

# The installed manual page lists every effect the installed program has.
for effect in $("$root/bin/quillane-cli" list | sed -n 's/^  \([a-z-]*\)  (.*/\1/p'); do
  grep -q -- "${effect//-/\\\\-}" "$root/share/man/man1/quillane-cli.1" ||
    fail "the manual page does not name $effect"
done
bash -n "$root/share/bash-completion/completions/quillane-cli" || fail "completion script syntax"

if [ "$gui" = 1 ]; then
  [ -x "$root/bin/quillane" ] || fail "bin/quillane is not installed"
  desktop-file-validate "$root/share/applications/$id.desktop" || fail "desktop entry"
  appstreamcli validate --no-net "$root/share/metainfo/$id.metainfo.xml" || fail "metainfo"
  for size in 16 32 48 64 128 256; do
    [ -s "$root/share/icons/hicolor/${size}x${size}/apps/$id.png" ] || fail "icon ${size}"
  done
  [ -s "$root/share/icons/hicolor/scalable/apps/$id.svg" ] || fail "scalable icon"
fi

# The installed command line, started from the staging folder: a metafile written and read
# back, which needs the installed renderer beside it.
cd "$stage"
"$root/bin/quillane-cli" --version | grep -q '^quillane-cli [0-9]' || fail "--version"
"$root/bin/quillane-cli" apply emboss -o "$stage/emboss.wmf" || fail "writing a metafile"
"$root/bin/quillane-cli" apply emboss "$stage/emboss.wmf" -o "$stage/back.png" ||
  fail "reading the metafile back"
[ -s "$stage/back.png" ] || fail "no picture written"
echo "installed and validated in $stage"
