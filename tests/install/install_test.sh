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
  [ -s "$root/share/man/man1/quillane.1" ] || fail "quillane.1 is missing"
  desktop-file-validate "$root/share/applications/$id.desktop" || fail "desktop entry"
  appstreamcli validate --no-net "$root/share/metainfo/$id.metainfo.xml" || fail "metainfo"
  for size in 16 32 48 64 128 256; do
    [ -s "$root/share/icons/hicolor/${size}x${size}/apps/$id.png" ] || fail "icon ${size}"
  done
  [ -s "$root/share/icons/hicolor/scalable/apps/$id.svg" ] || fail "scalable icon"
  QT_QPA_PLATFORM=offscreen "$root/bin/quillane" --version | grep -q '^Quillane [0-9]' ||
    fail "the installed quillane does not start"
fi

# The installed command line, started from the staging folder, reading a Windows metafile with
# one rectangle in it: vector content, which only the renderer installed beside it can draw.
cd "$stage"
"$root/bin/quillane-cli" --version | grep -q '^quillane-cli [0-9]' || fail "--version"
printf '\xd7\xcd\xc6\x9a\0\0\0\0\0\0\x64\0\x64\0\xa0\x05\0\0\0\0\xb1\x52' >rect.wmf
printf '\1\0\x09\0\0\x03\x13\0\0\0\0\0\x07\0\0\0\0\0' >>rect.wmf
printf '\x07\0\0\0\x1b\x04\x5a\0\x5a\0\x0a\0\x0a\0\x03\0\0\0\0\0' >>rect.wmf
"$root/bin/quillane-cli" apply emboss rect.wmf -o rect.png || fail "reading the metafile"
[ -s rect.png ] || fail "no picture written"
# Without the renderer beside it the installed program cannot read it: it does not fall back on
# the build tree's copy.
rm "$root/bin/quillane-wmf-render"
if "$root/bin/quillane-cli" apply emboss rect.wmf -o again.png 2>err; then
  fail "a metafile was read without the installed renderer"
fi
grep -q "not installed" err || { cat err; fail "no clear message"; }
echo "installed and validated in $stage"
