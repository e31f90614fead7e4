// The files of a zip archive, as PKWARE's APPNOTE describes it: stored or deflated, without encryption and ZIP64.

const kEnd = 0x06054b50, kEntry = 0x02014b50, kLocal = 0x04034b50, kLongestComment = 65535;

async function inflate(bytes) {
    const stream = new Blob([bytes]).stream().pipeThrough(new DecompressionStream('deflate-raw'));
    return new Uint8Array(await new Response(stream).arrayBuffer());
}

// [{name, bytes}], of files only. Rejects what is no archive or is damaged.
export async function unzip(bytes) {
    const view = new DataView(bytes.buffer, bytes.byteOffset, bytes.byteLength), files = [];
    const is = (at, signature) => at >= 0 && at + 4 <= bytes.length && view.getUint32(at, true) === signature;
    let end = bytes.length - 22;
    while (end >= 0 && end > bytes.length - 22 - kLongestComment && !is(end, kEnd)) --end;
    if (!is(end, kEnd)) throw new Error('is no zip archive');
    try {
        let at = view.getUint32(end + 16, true);
        for (let left = view.getUint16(end + 10, true); left > 0; --left) {
            if (!is(at, kEntry)) throw new Error();
            const flags = view.getUint16(at + 8, true), method = view.getUint16(at + 10, true);
            const size = view.getUint32(at + 20, true), lengths = [28, 30, 32].map(i => view.getUint16(at + i, true));
            const local = view.getUint32(at + 42, true), name = new TextDecoder().decode(bytes.subarray(at + 46, at + 46 + lengths[0]));
            at += 46 + lengths[0] + lengths[1] + lengths[2];
            if (name.endsWith('/')) continue;
            if (flags & 1 || (method !== 0 && method !== 8) || !is(local, kLocal)) throw new Error();
            const from = local + 30 + view.getUint16(local + 26, true) + view.getUint16(local + 28, true);
            if (from + size > bytes.length) throw new Error();
            const packed = bytes.subarray(from, from + size);
            files.push({name, bytes: method === 8 ? await inflate(packed) : packed});
        }
    } catch {
        throw new Error('is a zip archive that is damaged, encrypted or packed in another way');
    }
    return files;
}
