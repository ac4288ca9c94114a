#!/usr/bin/env python3
"""Runs the reference community service until SIGTERM.

    serve.py --certs DIR [--ready FILE] [--store DIR]

DIR holds server.key and good.pem, expired.pem, wrong-name.pem; FILE is
created once every listener and the control interface are up; uploaded
files are kept under the store folder (a temporary one by default) until
the next reset.
"""
import argparse
import logging
import shutil
import signal
import sys
import tempfile

import hosts
from control_server import ControlServer
from service import Service


def parse_arguments():
    parser = argparse.ArgumentParser(description='reference community service')
    parser.add_argument('--certs', required=True, help='folder of the server certificates')
    parser.add_argument('--ready', help='file to create once the service listens')
    parser.add_argument('--store', help='folder for uploaded files')
    parser.add_argument('--verbose', action='store_true')
    return parser.parse_args()


def main():
    args = parse_arguments()
    logging.basicConfig(level=logging.DEBUG if args.verbose else logging.INFO,
                        format='%(asctime)s %(threadName)s %(message)s')
    store = args.store or tempfile.mkdtemp(prefix='refservice-')
    signal.signal(signal.SIGTERM, lambda *_: sys.exit(0))
    service = Service(args.certs, store)
    control = None
    try:
        service.start()
        control = ControlServer((hosts.CONTROL_ADDRESS, hosts.CONTROL_PORT), service)
        if args.ready:
            open(args.ready, 'w').close()
        logging.getLogger('refservice').info('ready')
        control.serve_forever()
    finally:
        if control:
            control.server_close()
        service.stop()
        if not args.store:
            shutil.rmtree(store, ignore_errors=True)


if __name__ == '__main__':
    main()
