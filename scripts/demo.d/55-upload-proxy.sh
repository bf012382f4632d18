# shellcheck shell=bash
# Use: upload pages shown in the browser, their result handed back to the
# calling suite program. The browser is the stand-in, started as a local
# server the way Internet Explorer is.
section "Upload proxy: the page's result goes back to the calling program"
page="$prefix/page.txt"
ie_class='HKLM\Software\Classes\CLSID\{0002DF01-0000-0000-C000-000000000046}\LocalServer32'
server="\"$(winepath -w "$build/bin/fakes/iexplore.exe")\" \"$(winepath -w "$page")\""
for view in 32 64; do
  wine reg add "$ie_class" /ve /d "$server" /reg:$view /f >/dev/null
done
show_page() {
  echo "  the browser:"
  tr -d '\r' < "$c/demo-browser.log" | sed 's/^/    /'
  rm -f "$c/demo-browser.log"
}

echo "  page: the island <r><Status> success </Status><CD>12345</CD></r> appears after 1.5 s"
printf '%s\n' 'log C:\demo-browser.log' 'tree HTML(HEAD,BODY(DIV,xml))' \
  'island 1500 <r><Status> success </Status><CD>12345</CD></r>' > "$page"
run '<CmdLine><Action>PPU</Action><URL>https://meet.mirovan.example/ppu</URL><hWnd>{caller}</hWnd></CmdLine>'
show_page

echo "  page: the island sits inside a FORM, where it is never looked for; the user closes the window after 1.5 s"
printf '%s\n' 'log C:\demo-browser.log' 'tree HTML(BODY(FORM(xml)))' \
  'island 0 <r><Status>SUCCESS</Status><FilePath>/docs/a.txt</FilePath></r>' 'close 1500' > "$page"
run '<CmdLine><Action>UPLOAD_FILE</Action><URL>https://meet.mirovan.example/upload</URL><hWnd>{caller}</hWnd></CmdLine>'
show_page
