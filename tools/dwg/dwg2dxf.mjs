// Converts one DWG drawing to DXF for ZVListas. It runs as a program of its own: the
// converter it loads (GPL-3) is never linked into ZVListas.
//
//   node --liftoff-only dwg2dxf.mjs CONVERTER_DIR INPUT.dwg OUTPUT_DIR
//
// CONVERTER_DIR holds node_modules with the converter package (installed by `./zv deps`).
// Writes OUTPUT_DIR/drawing.dxf and OUTPUT_DIR/facts.json: what this converter build's DXF
// writer gets wrong or leaves out, taken from its object model of the same drawing, for
// the host to put right. Exit status: 0 written, 2 usage or file error, 3 the drawing
// could not be converted, 4 the converter package is missing.
import fs from 'node:fs';
import path from 'node:path';
import { pathToFileURL } from 'node:url';

function fail(status, text) {
    process.stderr.write(text + '\n');
    process.exit(status);
}

// A trap inside the converter (e.g. "table index out of bounds") must end in a status, not
// in a stack trace with status 1 that looks like any other failure.
process.on('uncaughtException', (e) => fail(3, 'the converter stopped: ' + (e && e.message)));
process.on('unhandledRejection', (e) => fail(3, 'the converter stopped: ' + (e && e.message)));

const [converterDir, input, outputDir] = process.argv.slice(2);
if (!converterDir || !input || !outputDir) fail(2, 'usage: dwg2dxf.mjs CONVERTER_DIR INPUT.dwg OUTPUT_DIR');

const packageDir = path.join(converterDir, 'node_modules', '@mlightcad', 'libredwg-web');
const entry = path.join(packageDir, 'dist', 'libredwg-web.js');
if (!fs.existsSync(entry)) fail(4, 'the DWG converter package is not installed in ' + converterDir);

let bytes;
try {
    bytes = fs.readFileSync(input);
} catch (e) {
    fail(2, 'cannot read ' + input + ': ' + e.message);
}
const buffer = bytes.buffer.slice(bytes.byteOffset, bytes.byteOffset + bytes.byteLength);

// The package's console lines stay as they are: silencing them changes what this build
// writes for long multi-line texts (it reads past their end), and the host reads only the
// last line of stderr, ours.

const { LibreDwg, Dwg_File_Type } = await import(pathToFileURL(entry).href);
const converter = await LibreDwg.create(path.join(packageDir, 'wasm') + '/');

const dxf = converter.dwg_write_dxf(buffer);
if (!dxf || dxf.length === 0) fail(3, 'the converter could not read the drawing');

const data = converter.dwg_read_data(buffer, Dwg_File_Type.DWG);
if (data === undefined || data === null) fail(3, 'the converter could not read the drawing');
const model = converter.convert(data);
converter.dwg_free(data);

const facts = { layers: [], polylineWidths: [], attributes: [], xrecordAngles: [], longTexts: [] };

for (const layer of model.tables?.LAYER?.entries ?? [])
    facts.layers.push({ handle: layer.handle, off: !!layer.off });

const point = (p) => [p?.x ?? 0, p?.y ?? 0, p?.z ?? 0];

function attribute(a) {
    const t = a.text ?? {};
    return {
        handle: a.handle,
        layer: a.layer ?? '0',
        color: a.colorIndex ?? 256,
        tag: a.tag ?? '',
        value: t.text ?? '',
        position: point(t.startPoint),
        alignment: point(a.alignmentPoint),
        height: t.textHeight ?? 1,
        rotation: t.rotation ?? 0,
        widthFactor: t.xScale ?? 1,
        oblique: t.obliqueAngle ?? 0,
        style: t.styleName ?? 'Standard',
        halign: t.halign ?? 0,
        valign: t.valign ?? 0,
        flags: a.flags ?? 0,
    };
}

// Entities of model space, paper space and every block, each once.
const seen = new Set();
function visit(entity) {
    if (!entity || seen.has(entity.handle)) return;
    seen.add(entity.handle);
    if (entity.type === 'LWPOLYLINE') {
        const vertices = entity.vertices ?? [];
        if (vertices.some((v) => (v.startWidth ?? 0) !== 0 || (v.endWidth ?? 0) !== 0))
            facts.polylineWidths.push({
                handle: entity.handle,
                widths: vertices.map((v) => [v.startWidth ?? 0, v.endWidth ?? 0]),
            });
    } else if (entity.type === 'MTEXT' && typeof entity.text === 'string' && entity.text.length >= 250) {
        // This build's DXF writer may end a long text with bytes from past its end.
        facts.longTexts.push({ handle: entity.handle, text: entity.text });
    } else if (entity.type === 'INSERT' && (entity.attribs ?? []).length > 1) {
        facts.attributes.push({ handle: entity.handle, attributes: entity.attribs.map(attribute) });
    }
}
for (const entity of model.entities ?? []) visit(entity);
for (const block of model.tables?.BLOCK_RECORD?.entries ?? [])
    for (const entity of block.entities ?? []) visit(entity);

for (const xrecord of model.objects?.XRECORD ?? []) {
    const angles = (xrecord.data ?? []).filter((d) => d.code >= 50 && d.code <= 58);
    if (angles.length)
        facts.xrecordAngles.push({ handle: xrecord.handle, angles: angles.map((d) => Number(d.value)) });
}

try {
    fs.writeFileSync(path.join(outputDir, 'drawing.dxf'), dxf);
    fs.writeFileSync(path.join(outputDir, 'facts.json'), JSON.stringify(facts));
} catch (e) {
    fail(2, 'cannot write the converted drawing: ' + e.message);
}
