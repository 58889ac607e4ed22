#!/bin/sh
# Makes a test certificate authority and a certificate for 127.0.0.1 / localhost signed by it, in
# DIR: ca.der (what a test puts in its own Wine prefix's trusted roots), server.pem, server.key.
set -eu
dir=$1
mkdir -p "$dir"
cd "$dir"
[ -s server.pem ] && [ -s ca.der ] && exit 0
openssl req -x509 -newkey rsa:2048 -nodes -days 3650 -subj "/CN=Vantorel test CA" \
    -keyout ca.key -out ca.pem -addext "basicConstraints=critical,CA:TRUE" \
    -addext "keyUsage=critical,keyCertSign,cRLSign" 2>/dev/null
openssl req -newkey rsa:2048 -nodes -subj "/CN=127.0.0.1" -keyout server.key -out server.csr 2>/dev/null
# Wine's name check reads only the DNS names of the certificate, so the address is one of them too.
printf 'subjectAltName=IP:127.0.0.1,DNS:127.0.0.1,DNS:localhost\nextendedKeyUsage=serverAuth\nbasicConstraints=CA:FALSE\n' >server.ext
openssl x509 -req -in server.csr -CA ca.pem -CAkey ca.key -CAcreateserial -days 3650 -extfile server.ext \
    -out server.pem 2>/dev/null
openssl x509 -in ca.pem -outform DER -out ca.der
# A second, self-signed certificate that nobody trusts.
openssl req -x509 -newkey rsa:2048 -nodes -days 3650 -subj "/CN=127.0.0.1" -keyout untrusted.key \
    -out untrusted.pem -addext "subjectAltName=IP:127.0.0.1,DNS:127.0.0.1" 2>/dev/null
